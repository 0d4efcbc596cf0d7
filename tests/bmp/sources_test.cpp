// The kinds of source: each gives the same pixels, with buffers of any size, and is read and moved as its kind asks.
#include "bmp/working.h"
#include "tests/bmp/expectations.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

const BmpVariant &rgb24 = variant_named("twenty_four_bits");

class BmpSources : public HostedTest {};

std::vector<int32_t> buffer_sizes(int32_t stride) {
    return {INT32_MIN,    -1,      0, 1, stride - 1, stride, stride + 1, 2 * stride, 3 * stride + stride / 2,
            100 * stride, 10 << 20};
}

TEST_F(BmpSources, streams_give_the_pixels_that_memory_gives) {
    for (const BmpVariant &variant : bmp_variants)
        for (const bool top_down : {false, true}) {
            if (quick() && top_down != (variant.bits <= 8)) continue;
            const BmpFile file = noise_bmp(variant, 11, 13, top_down);
            for (const uint32_t kind : stream_kinds)
                for (const int32_t buffer_size : buffer_sizes(static_cast<int32_t>(file.stride()))) {
                    BmpSubject subject(file, kind, buffer_size);
                    for (int turns = 0; turns < 4; turns += quick() ? 3 : 1)
                        for (const uint32_t placement : {0u, 0x100u})
                            ASSERT_TRUE(decodes_as_computed_at_both_edges(
                                subject, request_for(11, 13, 7, turns, placement, 2, 5)));
                    ASSERT_TRUE(decodes_as_computed(subject, {1, 0, 0, 7, 7}));
                    ASSERT_TRUE(decodes_as_computed(subject, {1, 2, 0x700, 7, 29}));
                }
        }
}

TEST_F(BmpSources, a_sequential_source_writes_a_top_down_picture_upwards) {
    // Three rows of one pixel in a box of 1 x 7: the cursor stands at row 2, and each row goes above the last one.
    BmpFile file;
    file.width = 1;
    file.height = -3;
    file.rows = {{1, 1, 1}, {2, 2, 2}, {3, 3, 3}};
    TestSource source(PELM_SOURCE_SEQUENTIAL, file_bytes(file));
    const BmpDecode decode = decode_bmp(source, {1, 0, 0, 1, 7}, 21);
    const uint8_t b = background;
    EXPECT_EQ(decode.output, (Bytes{3, 3, 3, 2, 2, 2, 1, 1, 1, b, b, b, b, b, b, b, b, b, b, b, b}));
}

TEST_F(BmpSources, the_upward_walk_is_cut_at_the_start_of_the_buffer) {
    for (const BmpVariant &variant : bmp_variants)
        for (int turns = 0; turns < 4; ++turns)
            for (const uint32_t placement : {0u, 0x100u, 0x700u})
                for (const uint32_t format : bmp_formats) {
                    BmpSubject subject(noise_bmp(variant, 9, 12, true), PELM_SOURCE_SEQUENTIAL, 100);
                    for (const int32_t more : {-4, 0, 1, 5})
                        ASSERT_TRUE(decodes_as_computed_at_both_edges(
                            subject, request_for(9, 12, format, turns, placement, more, more)));
                }
}

TEST_F(BmpSources, the_upward_walk_of_a_reduced_picture_starts_at_the_cursor) {
    BmpFile file;
    file.width = 2;
    file.height = -4;
    file.rows = {Bytes(6, 10), Bytes(6, 10), Bytes(6, 20), Bytes(6, 20)};
    TestSource source(PELM_SOURCE_SEQUENTIAL, file_bytes(file));
    // Reduced to 1 x 2 at row 0 of the box: the first row stays there, the second falls off.
    const BmpDecode decode = decode_bmp(source, {1, 0, 0, 1, 2}, 6);
    EXPECT_EQ(decode.output, (Bytes{10, 10, 10, background, background, background}));
}

TEST_F(BmpSources, the_buffer_size_is_rounded_to_whole_rows_and_written_back) {
    const BmpFile file = noise_bmp(rgb24, 11, 13, false);
    const int32_t stride = static_cast<int32_t>(file.stride());
    ASSERT_EQ(stride, 36);
    for (const uint32_t kind : {PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT})
        for (const int32_t proposed : buffer_sizes(stride)) {
            host.reset();
            TestSource source(kind, file_bytes(file), proposed);
            EXPECT_EQ(decode_bmp(source, {1, 0, 0, 11, 13}, 429).result, 1);
            const int32_t rounded = proposed < stride ? stride : proposed / stride * stride;
            EXPECT_EQ(source.source.bufferSize, rounded) << "proposed " << proposed;
            EXPECT_EQ(source.source.data, nullptr);
            EXPECT_EQ(host.allocations[1], static_cast<uint32_t>(rounded));
        }
}

TEST_F(BmpSources, other_kinds_keep_their_buffer_size) {
    const BmpFile file = noise_bmp(rgb24, 11, 13, false);
    for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_SEQUENTIAL})
        for (const int32_t proposed : buffer_sizes(36)) {
            TestSource source(kind, file_bytes(file), proposed);
            EXPECT_EQ(decode_bmp(source, {1, 0, 0, 11, 13}, 429).result, 1);
            EXPECT_EQ(source.source.bufferSize, proposed);
        }
}

TEST_F(BmpSources, the_staging_buffer_hangs_from_the_source_during_a_decode) {
    TestSource source(PELM_SOURCE_STREAM, file_bytes(noise_bmp(rgb24, 11, 13, false)), 100);
    ImageDecodeInfo info{};
    info.input = &source.source;
    info.outputFormat = 1;
    uint8_t output[429];
    BmpState *const state = PELMI_BMP_Initialize(&info, 11, 13, output);
    ASSERT_NE(state, nullptr);
    EXPECT_NE(source.source.data, nullptr);
    EXPECT_EQ(source.source.bufferSize, 72);
    PELMI_BMP_DeleteDecInfo(state);
    EXPECT_EQ(source.source.data, nullptr);
    EXPECT_EQ(host.live_bytes(), 0u);
}

TEST_F(BmpSources, a_buffer_that_the_host_cannot_give_fails_the_decode) {
    for (const uint32_t kind : {PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT}) {
        host.reset();
        TestSource source(kind, file_bytes(noise_bmp(rgb24, 11, 13, false)), INT32_MAX);
        const BmpDecode decode = decode_bmp(source, {1, 0, 0, 11, 13}, 429);
        EXPECT_EQ(decode.result, 0);
        EXPECT_EQ(decode.misbehaviour, "");
        EXPECT_TRUE(decode.live_blocks.empty());
        EXPECT_EQ(decode.info.decoderState, nullptr);
        EXPECT_EQ(host.allocations[1], static_cast<uint32_t>(INT32_MAX / 36 * 36));
    }
}

TEST_F(BmpSources, memory_is_moved_to_its_start_and_never_read_through_the_host) {
    for (const BmpVariant &variant : bmp_variants) {
        host.reset();
        TestSource source(PELM_SOURCE_MEMORY, file_bytes(noise_bmp(variant, 11, 13, false)));
        EXPECT_EQ(decode_bmp(source, {1, 0, 0, 11, 13}, 429).result, 1);
        EXPECT_TRUE(host.reads.empty()) << variant.name;
        EXPECT_EQ(host.seeks, (std::vector<SeekCall>{{0, 0}})) << variant.name;
    }
}

TEST_F(BmpSources, seekable_streams_are_moved_to_their_start_and_then_to_the_rows) {
    for (const BmpVariant &variant : bmp_variants)
        for (const bool top_down : {false, true}) {
            host.reset();
            BmpFile file = noise_bmp(variant, 11, 13, top_down);
            file.gap = Bytes(3, 0x77);
            TestSource source(PELM_SOURCE_STREAM, file_bytes(file), 200);
            source.source.hostPosition = 40; // whatever was done with it before
            EXPECT_EQ(decode_bmp(source, {1, 0, 0, 11, 13}, 429).result, 1);
            EXPECT_EQ(host.seeks, (std::vector<SeekCall>{{0, 0}, {static_cast<int32_t>(file.rows_at()), 0}}));
        }
}

TEST_F(BmpSources, a_reduced_decode_starts_at_the_first_row_that_holds_a_sample) {
    // 90 rows to 3: samples at a quarter and three quarters of 30 rows each.
    for (const bool top_down : {false, true}) {
        host.reset();
        const BmpFile file = noise_bmp(rgb24, 90, 90, top_down);
        TestSource source(PELM_SOURCE_STREAM, file_bytes(file), 0);
        EXPECT_EQ(decode_bmp(source, {1, 0, 0, 3, 3}, 27).result, 1);
        const int32_t first = top_down ? (90 / 4) / 3 : 0;
        EXPECT_EQ(host.seeks, (std::vector<SeekCall>{{0, 0}, {54 + first * static_cast<int32_t>(file.stride()), 0}}));
    }
}

TEST_F(BmpSources, sequential_sources_are_never_moved_while_rows_are_decoded) {
    for (const BmpVariant &variant : bmp_variants)
        for (const int32_t box : {20, 5}) {
            host.reset();
            TestSource source(PELM_SOURCE_SEQUENTIAL, file_bytes(noise_bmp(variant, 11, 13, false)), 70);
            EXPECT_EQ(decode_bmp(source, {1, 0, 0, box, box}, static_cast<size_t>(box * box * 3)).result, 1);
            EXPECT_EQ(host.seeks, (std::vector<SeekCall>{{0, 0}})) << variant.name;
        }
}

TEST_F(BmpSources, headers_palettes_and_masks_are_read_in_one_piece_each) {
    struct Case {
        const char *variant;
        std::vector<int32_t> reads;
    };
    for (const Case &c : {Case{"twenty_four_bits", {54}}, Case{"eight_bits", {54, 1024}}, Case{"one_bit", {54, 8}},
                          Case{"sixteen_bits_plain", {54}}, Case{"sixteen_bits_565", {54, 4, 4, 4}}})
        for (const uint32_t kind : stream_kinds) {
            host.reset();
            TestSource source(kind, file_bytes(noise_bmp(variant_named(c.variant), 11, 13, false)));
            ImageDecodeInfo info{};
            info.input = &source.source;
            BmpState *const state = PELMI_BMP_Initialize(&info, 11, 13, nullptr);
            ASSERT_NE(state, nullptr);
            std::vector<int32_t> asked;
            for (const ReadCall &read : host.reads)
                asked.push_back(read.asked);
            EXPECT_EQ(asked, c.reads) << c.variant;
            PELMI_BMP_DeleteDecInfo(state);
        }
}

TEST_F(BmpSources, row_reads_of_seekable_streams_ask_for_the_whole_buffer) {
    const BmpFile file = noise_bmp(rgb24, 11, 13, false);
    for (const int32_t proposed : {0, 36, 100, 200, 1000}) {
        host.reset();
        TestSource source(PELM_SOURCE_STREAM, file_bytes(file), proposed);
        EXPECT_EQ(decode_bmp(source, {1, 0, 0, 11, 13}, 429).result, 1);
        ASSERT_GE(host.reads.size(), 2u);
        for (size_t i = 1; i < host.reads.size(); ++i)
            EXPECT_EQ(host.reads[i].asked, source.source.bufferSize) << "read " << i;
        // No more reads than the rows need.
        const int32_t rows_per_read = source.source.bufferSize / 36;
        EXPECT_EQ(host.reads.size() - 1, static_cast<size_t>((13 + rows_per_read - 1) / rows_per_read));
    }
}

TEST_F(BmpSources, a_sequential_source_stands_behind_the_header_when_rows_begin) {
    // The rows are taken from where the header reads ended, whatever offset the header states.
    for (const uint32_t offset : {0u, 54u, 60u, 1000u}) {
        BmpFile file = noise_bmp(rgb24, 5, 4, false);
        file.pixel_data_offset = offset;
        BmpSubject subject(file, PELM_SOURCE_SEQUENTIAL);
        EXPECT_TRUE(decodes_as_computed(subject, {1, 0, 0, 5, 4})) << "offset " << offset;
        EXPECT_EQ(subject.expect({1, 0, 0, 5, 4}).pixels_landed, 20u);
    }
}

TEST_F(BmpSources, the_row_buffer_of_a_sequential_source_holds_at_least_one_row) {
    for (const int32_t proposed : {INT32_MIN, -5, 0, 1, 35, 36, 37, 100, 1000}) {
        host.reset();
        TestSource source(PELM_SOURCE_SEQUENTIAL, file_bytes(noise_bmp(rgb24, 11, 13, false)), proposed);
        EXPECT_EQ(decode_bmp(source, {1, 0, 0, 11, 13}, 429).result, 1);
        ASSERT_EQ(host.allocations.size(), 3u);
        EXPECT_EQ(host.allocations[2], static_cast<uint32_t>(std::max(proposed, 36)));
        ASSERT_GE(host.reads.size(), 2u);
        EXPECT_EQ(host.reads[1].asked, std::max(proposed, 36)) << "the first read of rows";
        EXPECT_TRUE(host.live_blocks().empty());
    }
}

TEST_F(BmpSources, sequential_reads_of_any_size_give_the_same_rows) {
    const BmpFile file = noise_bmp(rgb24, 11, 13, false);
    const Bytes expected = BmpSubject(file).expect({1, 0, 0, 11, 13}).output;
    for (const int32_t most : {36, 37, 50, 71, 72, 100, 468})
        for (const int32_t proposed : {0, 36, 100, 1000}) {
            host.reset();
            host.faults.short_reads_from = 2; // the header comes whole
            host.faults.most_per_read = most;
            TestSource source(PELM_SOURCE_SEQUENTIAL, file_bytes(file), proposed);
            EXPECT_EQ(decode_bmp(source, {1, 0, 0, 11, 13}, 429).output, expected)
                << "reads of " << most << ", bufferSize " << proposed;
        }
}

TEST_F(BmpSources, sequential_reads_of_less_than_a_row_are_collected_until_it_is_whole) {
    for (const BmpVariant &variant : bmp_variants) {
        const BmpFile file = noise_bmp(variant, 11, 13, false);
        for (const auto &[box_width, box_height] : {std::pair{11, 13}, {6, 6}}) {
            const BmpRequest request{1, 0, 0, box_width, box_height};
            const Bytes expected = BmpSubject(file).expect(request).output;
            for (const int32_t most : {1, 2, 3, 5})
                for (const int32_t proposed : {0, 100}) {
                    host.reset();
                    TestSource source(PELM_SOURCE_SEQUENTIAL, file_bytes(file), proposed);
                    host.faults.short_reads_from = variant.bits <= 8 ? 3 : variant.compression == 3 ? 5 : 2;
                    host.faults.most_per_read = most;
                    EXPECT_EQ(decode_bmp(source, request, expected.size()).output, expected)
                        << variant.name << ", reads of " << most << ", bufferSize " << proposed;
                }
        }
    }
}

TEST_F(BmpSources, seekable_reads_of_some_whole_rows_give_the_same_rows) {
    const BmpFile file = noise_bmp(rgb24, 11, 13, false);
    const Bytes expected = BmpSubject(file).expect({1, 0, 0, 11, 13}).output;
    for (const int32_t rows : {1, 2, 5})
        for (const int32_t proposed : {36, 72, 360, 1000}) {
            host.reset();
            host.faults.short_reads_from = 2;
            host.faults.most_per_read = rows * 36;
            TestSource source(PELM_SOURCE_STREAM, file_bytes(file), proposed);
            EXPECT_EQ(decode_bmp(source, {1, 0, 0, 11, 13}, 429).output, expected)
                << "reads of " << rows << " rows, bufferSize " << proposed;
        }
}

TEST_F(BmpSources, reads_cut_anywhere_do_no_harm) {
    for (const BmpVariant &variant : bmp_variants)
        for (const uint32_t kind : stream_kinds)
            for (const int32_t most : {1, 2, 3, 7, 35, 53})
                for (int from = 1; from < 8; ++from)
                    for (const int32_t box : {13, 6}) {
                        host.reset();
                        host.faults.short_reads_from = from;
                        host.faults.most_per_read = most;
                        TestSource source(kind, file_bytes(noise_bmp(variant, 11, 13, false)), 72);
                        const BmpDecode decode =
                            decode_bmp(source, {1, 0, 0, box, box}, static_cast<size_t>(box * box * 3));
                        ASSERT_EQ(decode.misbehaviour, "") << variant.name << ", from read " << from;
                        ASSERT_EQ(decode.info.decoderState, nullptr);
                        ASSERT_TRUE(decode.result == 0 || decode.live_blocks.empty());
                    }
}

TEST_F(BmpSources, a_read_that_claims_more_than_was_asked_is_taken_for_what_was_asked) {
    for (const BmpVariant &variant : bmp_variants)
        for (const uint32_t kind : stream_kinds)
            for (const int32_t buffer_size : {0, 100, 500})
                for (const auto &[box_width, box_height] : {std::pair{11, 13}, {6, 6}}) {
                    host.reset();
                    host.faults.overclaiming_reads_from = 1;
                    const BmpFile file = noise_bmp(variant, 11, 13, false);
                    const BmpRequest request{1, 0, 0, box_width, box_height};
                    const Bytes expected = BmpSubject(file).expect(request).output;
                    TestSource source(kind, file_bytes(file), buffer_size);
                    const BmpDecode decode = decode_bmp(source, request, expected.size());
                    EXPECT_EQ(decode.misbehaviour, "") << variant.name;
                    EXPECT_EQ(decode.result, 1) << variant.name;
                    EXPECT_EQ(decode.output, expected) << variant.name << ", kind " << kind;
                    EXPECT_TRUE(decode.live_blocks.empty());
                }
}

TEST_F(BmpSources, a_failing_read_of_rows_keeps_the_rows_before_it) {
    // One row a read: the header is read 1, row i is read i + 2; the lowest rows come first.
    const BmpFile file = noise_bmp(rgb24, 11, 13, false);
    const Bytes whole = BmpSubject(file).expect({1, 0, 0, 11, 13}).output;
    for (const int32_t failure : {0, -1, INT32_MIN})
        for (const uint32_t kind : stream_kinds)
            for (int row = 0; row < 13; ++row) {
                host.reset();
                host.faults.failing_reads_from = row + 2;
                host.faults.failing_read_result = failure;
                TestSource source(kind, file_bytes(file), 36);
                const BmpDecode decode = decode_bmp(source, {1, 0, 0, 11, 13}, 429);
                Bytes expected = whole;
                std::fill(expected.begin(), expected.end() - 33 * row, background);
                EXPECT_EQ(decode.result, 1);
                EXPECT_EQ(decode.output, expected) << "row " << row << ", kind " << kind;
                EXPECT_EQ(decode.misbehaviour, "");
                EXPECT_TRUE(decode.live_blocks.empty());
            }
}

TEST_F(BmpSources, failing_reads_of_the_header_leave_what_a_short_header_leaves) {
    for (const int32_t failure : {0, -1, INT32_MIN})
        for (const uint32_t kind : stream_kinds)
            for (const char *const name : {"eight_bits", "sixteen_bits_444"})
                for (int read = 1; read <= (name[0] == 'e' ? 2 : 4); ++read) {
                    host.reset();
                    host.faults.failing_read = read;
                    host.faults.failing_read_result = failure;
                    TestSource source(kind, file_bytes(noise_bmp(variant_named(name), 11, 13, false)));
                    const BmpDecode decode = decode_bmp(source, {1, 0, 0, 11, 13}, 429);
                    EXPECT_EQ(decode.result, 0);
                    EXPECT_EQ(decode.info.decoderState, nullptr);
                    EXPECT_EQ(decode.misbehaviour, "");
                    const bool palette = name[0] == 'e' && read == 2;
                    EXPECT_EQ(decode.live_blocks.size(), palette ? 2u : 1u) << name << ", read " << read;
                }
}

// What a row decoder answers when reads fail from the given one on, or when the bytes end.
int32_t row_decoder_result(TestSource &source, int failing_from) {
    TestHost &host = TestHost::get();
    host.reset();
    ImageDecodeInfo info{};
    info.input = &source.source;
    info.outputFormat = 1;
    uint8_t output[429];
    BmpState *const state = PELMI_BMP_Initialize(&info, 11, 13, output);
    if (state == nullptr) return -1;
    host.faults.failing_reads_from = failing_from;
    const int32_t result = PELMI_BMP_Decode24bitBMP(state, state->outputCursor, state->scaledHeight);
    PELMI_BMP_DeleteDecInfo(state);
    return result;
}

TEST_F(BmpSources, a_row_decoder_tells_the_end_of_the_data_from_a_failed_read) {
    const Bytes bytes = file_bytes(noise_bmp(rgb24, 11, 13, false));
    for (const uint32_t kind : {PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT}) {
        for (const size_t length : {54u, 60u, 90u, 100u, 126u}) {
            TestSource cut(kind, Bytes(bytes.begin(), bytes.begin() + static_cast<ptrdiff_t>(length)), 36);
            EXPECT_EQ(row_decoder_result(cut, 0), 1) << "the data ends at " << length;
        }
        for (const int read : {2, 3, 14}) {
            TestSource failing(kind, bytes, 36);
            EXPECT_EQ(row_decoder_result(failing, read), 5) << "read " << read << " fails";
        }
        TestSource whole(kind, bytes, 36);
        EXPECT_EQ(row_decoder_result(whole, 15), 1) << "no read is left to fail";
    }
}

} // namespace
} // namespace pelm::test

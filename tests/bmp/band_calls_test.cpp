// The calls of an iterative decode: what each leaves for the next one, what they allocate, and what an abort leaves.
#include <climits>
#include <utility>

#include "bmp/working.h"
#include "tests/bmp/bands.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

const BmpVariant &rgb24 = variant_named("twenty_four_bits");

class BmpBandCalls : public HostedTest {};

TEST_F(BmpBandCalls, no_rows_decode_nothing_and_keep_the_decode) {
    for (const int32_t none : {0, -1, INT_MIN})
        for (const bool at_first : {true, false}) {
            BmpSubject subject(noise_bmp(rgb24, 9, 7, false));
            const BmpRequest request{1, 0, 0, 9, 7};
            const auto calls = [&](ImageDecodeInfo &info, uint8_t *output) {
                if (!at_first) {
                    EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output, 9, 7, 4), 1);
                }
                const void *const before = info.decoderState;
                EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output, 9, 7, none), 1);
                EXPECT_NE(info.decoderState, nullptr);
                if (!at_first) {
                    EXPECT_EQ(info.decoderState, before);
                    EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output, 9, 7, 4), 1);
                }
                return 1;
            };
            if (at_first) {
                TestSource source(PELM_SOURCE_MEMORY, file_bytes(subject.file()));
                const BmpDecode decode = decode_by(calls, source, request, 189);
                EXPECT_EQ(decode.output, Bytes(189, background));
                EXPECT_EQ(decode.live_blocks.size(), 2u);
            } else {
                EXPECT_EQ(subject.difference(calls, request, subject.expect(request)), "");
            }
        }
}

TEST_F(BmpBandCalls, rows_farther_than_any_buffer_reaches_are_not_written) {
    // So many rows, each as long as steps can be, or as addresses go.
    const int32_t box_width = sizeof(void *) == 8 ? (1 << 29) - 1 : 1 << 20;
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(noise_bmp(rgb24, 3, 5, false)));
    ImageDecodeInfo info = marked_info(&source.source, {7, 0, 0, box_width, 60});
    uint8_t byte = background; // of a buffer that nothing may be written to
    EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, &byte, box_width, 60, 0), 1);
    EXPECT_NE(info.decoderState, nullptr);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, &byte, box_width, 60, INT_MAX), 1);
    EXPECT_EQ(info.decoderState, nullptr);
    EXPECT_EQ(byte, background);
    EXPECT_TRUE(host.live_blocks().empty());
}

// In a buffer of its unturned size a turned image's rows begin far above or below it, later ones beyond what 32 bits
// count, and still run through it. Of interest on 32-bit systems.
TEST_F(BmpBandCalls, rows_of_turned_images_that_begin_far_outside_are_those_of_one_call) {
    const struct {
        int32_t width, height;
        uint32_t format;
        int turns;
    } images[] = {{46409, 135, 0, 1}, {46273, 137, 0, 3}, {37694, 288, 1, 3}};
    for (const auto &[width, height, format, turns] : images)
        for (const bool top_down : {false, true}) {
            if (quick() && (top_down || turns == 1)) continue;
            const BmpRequest request{format, turns, PELM_PLACE_EXACT, height, width};
            const Bytes file = file_bytes(noise_bmp(variant_named("one_bit"), width, height, top_down));
            const size_t size = static_cast<size_t>(width) * static_cast<size_t>(height) * (format == 0 ? 2 : 3);
            const auto decoded_in = [&](const std::vector<int32_t> &rows) {
                TestSource source(PELM_SOURCE_MEMORY, file);
                return decode_by(calls_of(request, rows), source, request, size);
            };
            const BmpDecode at_once = decoded_in({height});
            ASSERT_EQ(at_once.result, 1);
            ASSERT_NE(at_once.output, Bytes(size, background));
            for (const int32_t rows : {100, 50}) {
                const BmpDecode in_bands =
                    decoded_in(std::vector<int32_t>(static_cast<size_t>((height - 1) / rows + 1), rows));
                EXPECT_EQ(in_bands.result, 1);
                EXPECT_EQ(in_bands.info.decoderState, nullptr);
                EXPECT_TRUE(in_bands.output == at_once.output) << described(request) << ", bands of " << rows;
            }
        }
}

TEST_F(BmpBandCalls, failed_reads_end_a_band_and_count_its_rows) {
    TestSource source(PELM_SOURCE_STREAM, file_bytes(noise_bmp(rgb24, 9, 7, true)), 28);
    host.faults.failing_read = 4; // header, two rows, and the third
    const BmpRequest request{1, 0, 0, 9, 7};
    const std::vector<int32_t> rows = {4, 4};
    const BmpDecode decode = decode_by(calls_of(request, rows), source, request, 189);
    EXPECT_EQ(decode.result, 1);
    EXPECT_EQ(decode.info.decoderState, nullptr);
    Bytes expected = BmpSubject(noise_bmp(rgb24, 9, 7, true)).expect(request).output;
    std::fill(expected.begin() + 2 * 27, expected.begin() + 4 * 27, background);
    EXPECT_EQ(decode.output, expected);
}

TEST_F(BmpBandCalls, every_call_moves_the_source_to_its_start_and_seekable_ones_then_to_the_band) {
    for (const bool top_down : {false, true}) {
        host.reset();
        TestSource source(PELM_SOURCE_STREAM, file_bytes(noise_bmp(rgb24, 9, 7, top_down)), 28);
        const BmpRequest request{1, 0, 0, 9, 7};
        const std::vector<int32_t> rows = {3, 3, 3};
        EXPECT_EQ(decode_by(calls_of(request, rows), source, request, 189).result, 1);
        const auto row = [](int32_t file_row) { return SeekCall{54 + 28 * file_row, 0}; };
        const SeekCall start{0, 0};
        EXPECT_EQ(host.seeks, top_down ? (std::vector<SeekCall>{start, row(0), start, row(3), start, row(6)})
                                       : (std::vector<SeekCall>{start, row(4), start, row(1), start, row(0)}));
    }
}

TEST_F(BmpBandCalls, later_bands_of_a_sequential_source_read_from_its_start) {
    // 18 bytes a row: the second band's rows are the file's bytes from 0 and from 20 on, the first one lowest.
    const Bytes bytes = file_bytes(noise_bmp(rgb24, 6, 4, false));
    TestSource source(PELM_SOURCE_SEQUENTIAL, bytes, 20);
    const BmpRequest request{8, 0, 0, 6, 4};
    const std::vector<int32_t> rows = {2, 2};
    const BmpDecode decode = decode_by(calls_of(request, rows), source, request, 96);
    const auto row = [&](size_t offset) {
        Bytes pixels;
        for (size_t x = 0; x < 6; ++x)
            pixels.insert(pixels.end(),
                          {bytes[offset + 3 * x], bytes[offset + 3 * x + 1], bytes[offset + 3 * x + 2], 255});
        return pixels;
    };
    Bytes expected;
    for (const size_t offset : {size_t{74}, size_t{54}, size_t{20}, size_t{0}}) {
        const Bytes pixels = row(offset);
        expected.insert(expected.end(), pixels.begin(), pixels.end());
    }
    EXPECT_EQ(decode.output, expected);
    EXPECT_EQ(decode.misbehaviour, "");
    EXPECT_TRUE(decode.live_blocks.empty());
}

TEST_F(BmpBandCalls, sequential_sources_in_bands_do_no_harm) {
    for (const BmpVariant &variant : bmp_variants)
        for (const bool top_down : {false, true})
            for (int turns = 0; turns < 4; ++turns)
                for (const int32_t more : {-4, 0, 3})
                    for (int32_t rows = 1; rows <= 5; ++rows) {
                        host.reset();
                        TestSource source(PELM_SOURCE_SEQUENTIAL, file_bytes(noise_bmp(variant, 9, 7, top_down)), 20);
                        const BmpRequest request = request_for(9, 7, 1, turns, 0, more, more);
                        const auto calls = [&](ImageDecodeInfo &info, uint8_t *output) {
                            int32_t result = 1;
                            do
                                result = ZOTARPELMI_DecodeBMPIterLine(&info, output, request.box_width,
                                                                      request.box_height, rows);
                            while (result == 1 && info.decoderState != nullptr);
                            return result;
                        };
                        const size_t size = static_cast<size_t>(request.box_width * request.box_height * 3);
                        const BmpDecode decode = decode_by(calls, source, request, size, Edge::start);
                        ASSERT_EQ(decode.result, 1);
                        ASSERT_EQ(decode.misbehaviour, "");
                        ASSERT_TRUE(decode.live_blocks.empty());
                    }
}

TEST_F(BmpBandCalls, other_depths_and_formats_count_their_rows_and_write_nothing) {
    BmpFile file = noise_bmp(rgb24, 9, 7, false);
    const std::vector<int32_t> rows = {3, 3, 3};
    for (const uint32_t format : {1u, 3u}) {
        file.bits = format == 1 ? 2 : 24;
        TestSource source(PELM_SOURCE_STREAM, file_bytes(file));
        const BmpRequest asked{format, 0, 0, 9, 7};
        const BmpDecode decode = decode_by(calls_of(asked, rows), source, asked, 252);
        EXPECT_EQ(decode.result, 1);
        EXPECT_EQ(decode.output, Bytes(252, background));
        EXPECT_EQ(decode.info.decoderState, nullptr);
        EXPECT_TRUE(decode.live_blocks.empty());
    }
}

TEST_F(BmpBandCalls, a_complete_decode_is_followed_by_a_new_one) {
    BmpSubject subject(noise_bmp(rgb24, 9, 7, false), PELM_SOURCE_STREAM, 50);
    const BmpRequest request{1, 0, 0, 9, 7};
    const BmpCalls calls = [&](ImageDecodeInfo &info, uint8_t *output) {
        for (int i = 0; i < 3; ++i)
            EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output, 9, 7, 4), 1);
        EXPECT_NE(info.decoderState, nullptr) << "the third call began anew";
        return ZOTARPELMI_DecodeBMPIterLine(&info, output, 9, 7, 4);
    };
    EXPECT_EQ(subject.difference(calls, request, subject.expect(request)), "");
}

TEST_F(BmpBandCalls, a_memory_source_that_has_lost_its_data_fails_and_keeps_the_decode) {
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(noise_bmp(rgb24, 9, 7, false)));
    ImageDecodeInfo info{};
    info.input = &source.source;
    info.outputFormat = 1;
    Bytes output(189, background);
    const InputSource before = source.source;
    ASSERT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output.data(), 9, 7, 3), 1);
    source.source.data = nullptr;
    EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output.data(), 9, 7, 3), 0);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, output.data(), 9, 7, 3), 0);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPIter(&info, output.data(), 9, 7), 0);
    source.source = before;
    source.source.size = 53;
    EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output.data(), 9, 7, 3), 0);
    source.source = before;
    EXPECT_NE(info.decoderState, nullptr);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output.data(), 9, 7, 3), 1);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output.data(), 9, 7, 3), 1);
    EXPECT_EQ(output, BmpSubject(noise_bmp(rgb24, 9, 7, false)).expect({1, 0, 0, 9, 7}).output);
    EXPECT_EQ(info.decoderState, nullptr);
}

// A call that is refused for want of memory takes the source's staging buffer with it: another decode of the request
// finds none, reads nothing more, and ends.
TEST_F(BmpBandCalls, another_decode_that_fails_in_between_leaves_nothing_to_read_into) {
    TestSource source(PELM_SOURCE_STREAM, file_bytes(noise_bmp(rgb24, 9, 7, false)), 30);
    ImageDecodeInfo info{};
    info.input = &source.source;
    info.outputFormat = 1;
    Bytes output(189, background);
    ASSERT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output.data(), 9, 7, 3), 1);
    const void *const state = info.decoderState;
    const Bytes before = output;
    host.faults.failing_allocation = static_cast<int>(host.allocations.size()) + 3; // record, staging, accumulators
    EXPECT_EQ(ZOTARPELMI_DecodeBMP(&info, output.data(), 9, 7), 0);
    ASSERT_EQ(info.decoderState, state);
    ASSERT_EQ(source.source.data, nullptr);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output.data(), 9, 7, 4), 1);
    EXPECT_EQ(info.decoderState, nullptr);
    EXPECT_EQ(output, before);
    EXPECT_EQ(host.live_blocks(), std::vector<uint32_t>{28}) << "the first staging buffer is lost";
    EXPECT_TRUE(host.violations.empty()) << host.violations.front();
}

TEST_F(BmpBandCalls, aborting_frees_nothing) {
    for (const uint32_t kind : seekable_kinds)
        for (const char *name : {"eight_bits", "twenty_four_bits"}) {
            host.reset();
            const BmpFile file = noise_bmp(variant_named(name), 9, 7, false);
            TestSource source(kind, file_bytes(file), 30);
            ImageDecodeInfo info{};
            info.input = &source.source;
            Bytes output(126);
            ASSERT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output.data(), 9, 7, 3), 1);
            std::vector<uint32_t> held{sizeof(BmpState)};
            if (file.bits == 8) held.push_back(1024);
            if (kind != PELM_SOURCE_MEMORY) held.push_back(file.bits == 8 ? 24 : 28);
            held.push_back(9 * 8);
            EXPECT_EQ(host.live_blocks(), held);
            EXPECT_EQ(ZOTARPELMI_AbortBMPIter(&info), 1);
            EXPECT_EQ(info.decoderState, nullptr);
            EXPECT_EQ(host.live_blocks(), held);
            EXPECT_EQ(ZOTARPELMI_AbortBMPIter(&info), 1) << "again";
        }
}

TEST_F(BmpBandCalls, destroying_before_aborting_frees_record_and_palette) {
    TestSource source(PELM_SOURCE_STREAM, file_bytes(noise_bmp(variant_named("eight_bits"), 9, 7, false)), 30);
    ImageDecodeInfo info{};
    info.input = &source.source;
    Bytes output(126);
    ASSERT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output.data(), 9, 7, 3), 1);
    EXPECT_EQ(PELMI_BMP_DestroyBMP(&info), 1);
    EXPECT_EQ(ZOTARPELMI_AbortBMPIter(&info), 1);
    EXPECT_EQ(host.live_blocks(), (std::vector<uint32_t>{24, 72}));
}

TEST_F(BmpBandCalls, null_requests_give_0) {
    uint8_t output[12];
    EXPECT_EQ(ZOTARPELMI_AbortBMPIter(nullptr), 0);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPIter(nullptr, output, 2, 2), 0);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(nullptr, output, 2, 2, 1), 0);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(nullptr, output, 2, 2, 1), 0);
    EXPECT_EQ(ZOTARPELMI_PreInitBMP(nullptr, 1), 0);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPSKIA(nullptr, output, 2, 2), 0);
    EXPECT_EQ(PELMI_BMP_InitializeSKIA(nullptr, 2, 2, output), nullptr);
    ImageDecodeInfo info{};
    EXPECT_EQ(ZOTARPELMI_DecodeBMPIter(&info, output, 2, 2), 0);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output, 2, 2, 1), 0);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, output, 2, 2, 1), 0);
    EXPECT_EQ(ZOTARPELMI_PreInitBMP(&info, 1), 0);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPSKIA(&info, output, 2, 2), 0);
    EXPECT_TRUE(host.allocations.empty());
    EXPECT_TRUE(host.seeks.empty());
}

TEST_F(BmpBandCalls, every_failing_allocation_of_the_first_call_releases_everything) {
    for (const BmpVariant &variant : bmp_variants)
        for (const uint32_t kind : seekable_kinds)
            for (const bool by_line : {false, true})
                for (int failing = 1; failing <= 4; ++failing) {
                    host.reset();
                    host.faults.failing_allocation = failing;
                    TestSource source(kind, file_bytes(noise_bmp(variant, 9, 7, false)), 30);
                    ImageDecodeInfo info{};
                    info.input = &source.source;
                    Bytes output(126, background);
                    const auto call = by_line ? ZOTARPELMI_DecodeBMPLine : ZOTARPELMI_DecodeBMPIterLine;
                    const int32_t result = call(&info, output.data(), 9, 7, 3);
                    if (host.allocations.size() < static_cast<size_t>(failing)) { // it needs fewer
                        EXPECT_EQ(result, 1);
                        continue;
                    }
                    EXPECT_EQ(result, 0);
                    EXPECT_EQ(output, Bytes(126, background));
                    EXPECT_TRUE(host.live_blocks().empty());
                    EXPECT_EQ(info.decoderState, nullptr);
                }
}

TEST_F(BmpBandCalls, a_band_without_memory_for_a_sequential_row_buffer_counts_its_rows) {
    TestSource source(PELM_SOURCE_SEQUENTIAL, file_bytes(noise_bmp(rgb24, 9, 7, false)), 30);
    ImageDecodeInfo info{};
    info.input = &source.source;
    Bytes output(126, background);
    host.faults.failing_allocation = 3; // record, sums, row buffer
    EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output.data(), 9, 7, 7), 1);
    EXPECT_EQ(info.decoderState, nullptr);
    EXPECT_EQ(output, Bytes(126, background));
    EXPECT_TRUE(host.live_blocks().empty());
}

TEST_F(BmpBandCalls, bands_allocate_nothing_of_their_own) {
    for (const uint32_t kind : seekable_kinds) {
        host.reset();
        TestSource source(kind, file_bytes(noise_bmp(rgb24, 9, 7, false)), 30);
        const BmpRequest request{1, 0, 0, 5, 5};
        const std::vector<int32_t> rows(3, 1);
        EXPECT_EQ(decode_by(calls_of(request, rows), source, request, 75).result, 1);
        EXPECT_EQ(host.allocations.size(), kind == PELM_SOURCE_MEMORY ? 2u : 3u);
    }
}

TEST_F(BmpBandCalls, a_later_proposal_for_the_row_buffer_does_not_change_it) {
    for (const int32_t later : {INT_MIN, -1, 0, 3, 27, 4096, INT_MAX}) {
        host.reset();
        TestSource source(PELM_SOURCE_STREAM, file_bytes(noise_bmp(rgb24, 9, 40, false)), 60);
        const BmpRequest request{1, 0, 0, 9, 40};
        const auto calls = [&](ImageDecodeInfo &info, uint8_t *output) {
            EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output, 9, 40, 20), 1);
            source.source.bufferSize = later;
            return ZOTARPELMI_DecodeBMPIterLine(&info, output, 9, 40, 20);
        };
        const BmpDecode decode = decode_by(calls, source, request, 1080);
        EXPECT_EQ(decode.result, 1);
        EXPECT_EQ(decode.output, BmpSubject(noise_bmp(rgb24, 9, 40, false)).expect(request).output) << later;
        for (const auto &read : host.reads)
            EXPECT_LE(read.asked, 56) << later; // two rows
    }
}

TEST_F(BmpBandCalls, a_source_that_is_gone_fails_a_later_band_and_keeps_the_decode) {
    const Bytes file = file_bytes(noise_bmp(rgb24, 9, 7, false));
    TestSource source(PELM_SOURCE_MEMORY, file);
    const BmpRequest request{1, 0, 0, 9, 7};
    const auto calls = [&](ImageDecodeInfo &info, uint8_t *output) {
        EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output, 9, 7, 4), 1);
        uint8_t *const data = std::exchange(source.source.data, nullptr);
        EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output, 9, 7, 4), 0);
        EXPECT_NE(info.decoderState, nullptr);
        source.source.data = data;
        return ZOTARPELMI_DecodeBMPIterLine(&info, output, 9, 7, 4);
    };
    const BmpDecode decode = decode_by(calls, source, request, 189);
    EXPECT_EQ(decode.output, BmpSubject(noise_bmp(rgb24, 9, 7, false)).expect(request).output);
    EXPECT_TRUE(decode.live_blocks.empty());
}

} // namespace
} // namespace pelm::test

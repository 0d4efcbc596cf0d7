// Iterative decodes: bands of every height give what one call gives, and what each call leaves for the next one.
#include <climits>

#include "bmp/working.h"
#include "tests/bmp/expectations.h"

namespace pelm::test {
namespace {

const BmpVariant &rgb24 = variant_named("twenty_four_bits");
constexpr uint32_t seekable_kinds[] = {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT};

class BmpBands : public HostedTest {
protected:
    // Calls with these row counts. The output is passed to the first one only.
    static BmpCalls calls_of(const BmpRequest &request, const std::vector<int32_t> &rows) {
        return [&request, &rows](ImageDecodeInfo &info, uint8_t *output) {
            int32_t result = 0;
            for (const int32_t count : rows) {
                result = ZOTARPELMI_DecodeBMPIterLine(&info, output, request.box_width, request.box_height, count);
                if (result != 1) return result;
                output = nullptr;
            }
            return result;
        };
    }

    static ::testing::AssertionResult decodes_in_bands(BmpSubject &subject, const BmpRequest &request,
                                                       const std::vector<int32_t> &rows, Edge edge = Edge::end) {
        const BmpExpectation expected = subject.model().expect_bands(request, rows, background);
        const std::string report = subject.difference(calls_of(request, rows), request, expected, edge);
        if (report.empty()) return ::testing::AssertionSuccess();
        return ::testing::AssertionFailure() << report << "\n  in bands of " << ::testing::PrintToString(rows);
    }

    // As many equal bands as the image needs; they must leave what one call leaves.
    static ::testing::AssertionResult equals_one_call(BmpSubject &subject, const BmpRequest &request, int32_t rows) {
        const BmpExpectation expected = subject.expect(request);
        const int64_t bands = std::max<int64_t>(1, (expected.size.height + rows - 1) / rows);
        const std::vector<int32_t> all(static_cast<size_t>(bands), rows);
        const std::string report = subject.difference(calls_of(request, all), request, expected);
        if (report.empty()) return ::testing::AssertionSuccess();
        return ::testing::AssertionFailure() << report << "\n  in bands of " << rows;
    }
};

TEST_F(BmpBands, bands_of_every_height_give_what_one_call_gives) {
    for (const BmpVariant &variant : bmp_variants)
        for (const bool top_down : {false, true})
            for (const uint32_t kind : seekable_kinds) {
                BmpSubject subject(noise_bmp(variant, 9, 7, top_down), kind, 50);
                for (int turns = 0; turns < 4; ++turns)
                    for (const BmpRequest &request :
                         {request_for(9, 7, 1, turns, 0, 3, 2), request_for(9, 7, 0, turns, 0, -3, -2),
                          request_for(9, 7, 6, turns, 0x700, -4, 5), request_for(9, 7, 7, turns, 0x700, 5, -4)})
                        for (int32_t rows = 1; rows <= 14; rows += quick() ? 4 : 1)
                            ASSERT_TRUE(equals_one_call(subject, request, rows));
            }
}

TEST_F(BmpBands, bands_of_every_height_of_small_pictures_give_what_one_call_gives) {
    const int32_t most = quick() ? 4 : 8;
    for (const bool top_down : {false, true})
        for (int32_t width = 1; width <= most; ++width)
            for (int32_t height = 1; height <= most; ++height) {
                BmpSubject subject(noise_bmp(rgb24, width, height, top_down));
                for (const int32_t box : {1, 3, 5, 8, 11})
                    for (const uint32_t placement : {0u, 0x700u})
                        for (int32_t rows = 1; rows <= std::max(height, box); ++rows)
                            ASSERT_TRUE(equals_one_call(subject, {1, (width + height) % 4, placement, box, box}, rows));
            }
}

TEST_F(BmpBands, exact_buffers_are_filled_in_bands) {
    for (const bool top_down : {false, true})
        for (int turns = 0; turns < 4; ++turns)
            for (const int32_t less : {0, 3}) {
                BmpSubject subject(noise_bmp(rgb24, 9, 12, top_down));
                const BmpRequest request = request_for(9, 12, 8, turns, 0x100, -less, -less);
                for (int32_t rows = 1; rows <= 13; ++rows) {
                    const std::vector<int32_t> all(static_cast<size_t>((12 + rows - 1) / rows), rows);
                    const int64_t height = subject.expect(request).size.height;
                    const std::vector<int32_t> needed(all.begin(),
                                                      all.begin() + static_cast<ptrdiff_t>((height + rows - 1) / rows));
                    ASSERT_TRUE(decodes_in_bands(subject, request, needed, Edge::end));
                    ASSERT_TRUE(decodes_in_bands(subject, request, needed, Edge::start));
                }
            }
}

TEST_F(BmpBands, a_later_band_is_placed_by_its_own_height) {
    // Six rows of one pixel, 1 to 6 from the top. A band of 2, then one of 3: its rows begin at row 3, and row 2 stays.
    for (const bool top_down : {false, true}) {
        BmpFile file;
        file.width = 1;
        file.height = top_down ? -6 : 6;
        for (uint8_t y = 1; y <= 6; ++y) {
            const auto value = static_cast<uint8_t>(top_down ? y : 7 - y);
            file.rows.push_back({value, value, value});
        }
        TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
        const BmpRequest request{1, 0, 0, 1, 6};
        const std::vector<int32_t> rows = {2, 3};
        const BmpDecode decode = decode_by(calls_of(request, rows), source, request, 18);
        const uint8_t b = background;
        EXPECT_EQ(decode.output, (Bytes{1, 1, 1, 2, 2, 2, b, b, b, 3, 3, 3, 4, 4, 4, 5, 5, 5})) << top_down;
        EXPECT_NE(decode.info.decoderState, nullptr) << "one row remains";
    }
}

TEST_F(BmpBands, bands_of_changing_height_land_where_their_heights_say) {
    Noise noise(5);
    for (int i = 0; i < (quick() ? 200 : 3000); ++i) {
        const BmpVariant &variant = bmp_variants[noise.below(std::size(bmp_variants))];
        BmpSubject subject(noise_bmp(variant, 9, 11, noise.below(2) == 0), seekable_kinds[noise.below(3)], 30);
        const BmpRequest request{bmp_formats[noise.below(6)], static_cast<int>(noise.below(4)),
                                 std::array{0u, 0x100u, 0x700u}[noise.below(3)],
                                 static_cast<int32_t>(1 + noise.below(14)), static_cast<int32_t>(1 + noise.below(14))};
        const int64_t height = subject.expect(request).size.height;
        std::vector<int32_t> rows;
        int64_t done = 0;
        do { // until the image is complete, with calls that ask for nothing in between
            rows.push_back(static_cast<int32_t>(noise.below(6)) - 1);
            if (noise.below(20) == 0) rows.back() = INT_MAX;
            done += std::max(0, rows.back());
        } while (done < height);
        if (height <= 0) rows.resize(1);
        ASSERT_TRUE(decodes_in_bands(subject, request, rows, i % 2 == 0 ? Edge::end : Edge::start));
    }
}

TEST_F(BmpBands, a_last_band_of_more_rows_than_there_are_is_placed_by_the_rows_asked_for) {
    for (const bool top_down : {false, true})
        for (int turns = 0; turns < 4; ++turns)
            for (const int32_t last : {6, 100, 1 << 20, INT_MAX}) {
                BmpSubject subject(noise_bmp(rgb24, 4, 7, top_down));
                const BmpRequest request = request_for(4, 7, 7, turns, 0, 2, 2);
                EXPECT_TRUE(decodes_in_bands(subject, request, {3, last}, Edge::end));
                EXPECT_TRUE(decodes_in_bands(subject, request, {3, last}, Edge::start));
            }
}

TEST_F(BmpBands, more_rows_than_the_image_has_decode_it_at_once) {
    BmpSubject subject(noise_bmp(rgb24, 9, 7, false));
    for (const int32_t rows : {7, 8, 100, INT_MAX})
        EXPECT_TRUE(equals_one_call(subject, {1, 0, 0, 9, 7}, rows)) << rows;
}

TEST_F(BmpBands, a_picture_of_250_rows_takes_three_iterations) {
    for (const uint32_t kind : seekable_kinds)
        for (const bool top_down : {false, true}) {
            BmpSubject subject(noise_bmp(rgb24, 3, 250, top_down), kind, 100);
            const BmpRequest request{1, 0, 0, 3, 250};
            std::vector<int32_t> results;
            const BmpCalls calls = [&](ImageDecodeInfo &info, uint8_t *output) {
                do
                    results.push_back(ZOTARPELMI_DecodeBMPIter(&info, output, 3, 250));
                while (results.back() == PELM_RESULT_MORE);
                return results.back();
            };
            EXPECT_EQ(subject.difference(calls, request, subject.expect(request)), "");
            EXPECT_EQ(results, (std::vector<int32_t>{4, 4, 1}));
        }
}

TEST_F(BmpBands, a_picture_of_up_to_100_rows_takes_one_iteration) {
    for (const int32_t height : {1, 99, 100}) {
        BmpSubject subject(noise_bmp(rgb24, 3, height, false));
        const BmpRequest request{1, 0, 0, 3, height};
        const BmpCalls calls = [&](ImageDecodeInfo &info, uint8_t *output) {
            return ZOTARPELMI_DecodeBMPIter(&info, output, 3, height);
        };
        EXPECT_EQ(subject.difference(calls, request, subject.expect(request)), "");
    }
}

TEST_F(BmpBands, no_rows_decode_nothing_and_keep_the_decode) {
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

TEST_F(BmpBands, pictures_of_which_nothing_is_left_are_complete_at_once) {
    for (const BmpRequest &request : {BmpRequest{1, 0, 0, 1, 1}, BmpRequest{1, 0, 0, 5, 0}, BmpRequest{1, 0, 0, 0, 5},
                                      BmpRequest{1, 0, 0x700, 5, -5}, BmpRequest{1, 1, 0x700, -3, 4}}) {
        BmpSubject subject(noise_bmp(rgb24, 90, 7, false));
        EXPECT_TRUE(decodes_in_bands(subject, request, {2})) << described(request);
    }
}

TEST_F(BmpBands, truncated_files_give_the_rows_that_one_call_gives) {
    for (const bool top_down : {false, true})
        for (const uint32_t kind : seekable_kinds)
            for (const int32_t box : {9, 5}) {
                const BmpFile file = noise_bmp(rgb24, 9, 9, top_down);
                const size_t whole = file_bytes(file).size();
                for (size_t length = 54; length <= whole; length += quick() ? 9 : 1) {
                    BmpSubject subject(file, length, kind, 60);
                    for (const int32_t rows : {1, 2, 4})
                        ASSERT_TRUE(equals_one_call(subject, {1, 0, 0, box, box}, rows));
                }
            }
}

TEST_F(BmpBands, failed_reads_end_a_band_and_count_its_rows) {
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

TEST_F(BmpBands, every_call_moves_the_source_to_its_start_and_seekable_ones_then_to_the_band) {
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

TEST_F(BmpBands, a_sequential_source_is_decoded_whole_in_one_band) {
    for (const BmpVariant &variant : bmp_variants)
        for (const bool top_down : {false, true})
            for (const int32_t box : {9, 5}) {
                BmpSubject subject(noise_bmp(variant, 9, 7, top_down), PELM_SOURCE_SEQUENTIAL, 50);
                EXPECT_TRUE(equals_one_call(subject, {1, 0, 0, box, box}, 9));
            }
}

TEST_F(BmpBands, later_bands_of_a_sequential_source_read_from_its_start) {
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
    for (const size_t offset : {54 + 20, 54, 20, 0}) {
        const Bytes pixels = row(offset);
        expected.insert(expected.end(), pixels.begin(), pixels.end());
    }
    EXPECT_EQ(decode.output, expected);
    EXPECT_EQ(decode.misbehaviour, "");
    EXPECT_TRUE(decode.live_blocks.empty());
}

TEST_F(BmpBands, sequential_sources_in_bands_do_no_harm) {
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

TEST_F(BmpBands, other_depths_and_formats_count_their_rows_and_write_nothing) {
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

TEST_F(BmpBands, a_complete_decode_is_followed_by_a_new_one) {
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

TEST_F(BmpBands, a_memory_source_that_has_lost_its_data_fails_and_keeps_the_decode) {
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

TEST_F(BmpBands, aborting_frees_nothing) {
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

TEST_F(BmpBands, destroying_before_aborting_frees_record_and_palette) {
    TestSource source(PELM_SOURCE_STREAM, file_bytes(noise_bmp(variant_named("eight_bits"), 9, 7, false)), 30);
    ImageDecodeInfo info{};
    info.input = &source.source;
    Bytes output(126);
    ASSERT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, output.data(), 9, 7, 3), 1);
    EXPECT_EQ(PELMI_BMP_DestroyBMP(&info), 1);
    EXPECT_EQ(ZOTARPELMI_AbortBMPIter(&info), 1);
    EXPECT_EQ(host.live_blocks(), (std::vector<uint32_t>{24, 72}));
}

TEST_F(BmpBands, null_requests_give_0) {
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

TEST_F(BmpBands, every_failing_allocation_of_the_first_call_releases_everything) {
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

TEST_F(BmpBands, a_band_without_memory_for_a_sequential_row_buffer_counts_its_rows) {
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

TEST_F(BmpBands, bands_allocate_nothing_of_their_own) {
    for (const uint32_t kind : seekable_kinds) {
        host.reset();
        TestSource source(kind, file_bytes(noise_bmp(rgb24, 9, 7, false)), 30);
        const BmpRequest request{1, 0, 0, 5, 5};
        const std::vector<int32_t> rows(3, 1);
        EXPECT_EQ(decode_by(calls_of(request, rows), source, request, 75).result, 1);
        EXPECT_EQ(host.allocations.size(), kind == PELM_SOURCE_MEMORY ? 2u : 3u);
    }
}

} // namespace
} // namespace pelm::test

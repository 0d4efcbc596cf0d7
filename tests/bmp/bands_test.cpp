// Iterative decodes: bands of every height give what one call gives.
#include <climits>

#include "tests/bmp/bands.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

const BmpVariant &rgb24 = variant_named("twenty_four_bits");

class BmpBands : public HostedTest {
protected:
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

TEST_F(BmpBands, an_iteration_is_100_rows) {
    struct Case {
        int32_t height;
        std::vector<int32_t> results;
    };
    for (const Case &c : {Case{1, {1}}, Case{99, {1}}, Case{100, {1}}, Case{101, {4, 1}}, Case{200, {4, 1}},
                          Case{201, {4, 4, 1}}, Case{250, {4, 4, 1}}})
        for (const uint32_t kind : seekable_kinds)
            for (const bool top_down : {false, true}) {
                BmpSubject subject(noise_bmp(rgb24, 3, c.height, top_down), kind, 100);
                const BmpRequest request{1, 0, 0, 3, c.height};
                std::vector<int32_t> results;
                const BmpCalls calls = [&](ImageDecodeInfo &info, uint8_t *output) {
                    do
                        results.push_back(ZOTARPELMI_DecodeBMPIter(&info, output, 3, c.height));
                    while (results.back() == PELM_RESULT_MORE);
                    return results.back();
                };
                EXPECT_EQ(subject.difference(calls, request, subject.expect(request)), "");
                EXPECT_EQ(results, c.results) << c.height << " rows";
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

TEST_F(BmpBands, a_sequential_source_is_decoded_whole_in_one_band) {
    for (const BmpVariant &variant : bmp_variants)
        for (const bool top_down : {false, true})
            for (const int32_t box : {9, 5}) {
                BmpSubject subject(noise_bmp(variant, 9, 7, top_down), PELM_SOURCE_SEQUENTIAL, 50);
                EXPECT_TRUE(equals_one_call(subject, {1, 0, 0, box, box}, 9));
            }
}

} // namespace
} // namespace pelm::test

// Grey of 8 bits in another size: sampled, never turned, and with rows left over.
#include "tests/png/decode/calls_model.h"
#include "tests/png/decode/decoding.h"

namespace pelm::test {
namespace {

class PngScaledGrey : public PngDecoding {
protected:
    // Line calls, each with a fresh buffer, against the model.
    static void expect_lines(const Picture &picture, const Request &request, int32_t rows) {
        const size_t size = buffer_size(picture, request);
        CallsModel model(picture, request);
        Decode decode(file_of(picture), PELM_SOURCE_MEMORY, request);
        int32_t result = 4;
        for (int call = 1; result == 4 && call < 200; ++call) {
            Output output(size);
            Bytes expected = background(size);
            const int32_t wanted = model.line(rows, expected);
            result = decode.line(output.data(), rows);
            ASSERT_EQ(result, wanted) << "call " << call << ", " << request.described() << ", rows " << rows;
            ASSERT_EQ(difference(expected, output.bytes(), picture, request), "") << "call " << call;
            ASSERT_TRUE(output.intact());
        }
        EXPECT_EQ(result, 1);
        EXPECT_FALSE(decode.started());
    }
};

// Rows of the buffer in which anything changed.
std::vector<size_t> rows_written(const Bytes &bytes, size_t row_size) {
    const Bytes before = background(bytes.size());
    std::vector<size_t> rows;
    for (size_t at = 0; at < bytes.size(); at += row_size)
        if (!std::equal(bytes.begin() + static_cast<ptrdiff_t>(at),
                        bytes.begin() + static_cast<ptrdiff_t>(at + row_size),
                        before.begin() + static_cast<ptrdiff_t>(at)))
            rows.push_back(at / row_size);
    return rows;
}

TEST_F(PngScaledGrey, a_hundred_rows_into_fifty_write_the_first_thirty_four) {
    const Picture picture = noise_picture(grey, 8, 100, 100);
    const Outcome outcome = run(file_of(picture), PELM_SOURCE_MEMORY, {7, 0, 50, 50}, 50 * 50 * 4);
    EXPECT_EQ(flaws(outcome), "");
    const std::vector<size_t> rows = rows_written(outcome.output, 50 * 4);
    ASSERT_EQ(rows.size(), 34u);
    EXPECT_EQ(rows.front(), 0u);
    EXPECT_EQ(rows.back(), 33u);
    // Row 0 is source row 0 from column 0 on; row n is source row 3 n, from column 1 on: every second one each time.
    for (const uint32_t n : {0u, 1u, 33u})
        for (const uint32_t column : {0u, 1u, 49u}) {
            const uint8_t sample = picture.rows[n * 3 * 100 + column * 2 + (n == 0 ? 0 : 1)];
            EXPECT_EQ(outcome.output[(n * 50 + column) * 4], sample) << "row " << n << ", column " << column;
        }
}

TEST_F(PngScaledGrey, every_size_is_sampled_as_stated) {
    for (const auto &[width, height] :
         {std::pair(100u, 100u), std::pair(37u, 23u), std::pair(23u, 61u), std::pair(1u, 1u), std::pair(3u, 200u)})
        for (const bool transparent : {false, true}) {
            Picture picture = noise_picture(grey, 8, width, height);
            if (transparent) picture = with_transparency(picture);
            const Bytes file = file_of(picture);
            for (const uint32_t placement : {0x000u, 0x100u, 0x700u})
                for (const auto &[box_width, box_height] :
                     {std::pair(50, 50), std::pair(99, 99), std::pair(7, 31), std::pair(31, 7), std::pair(1, 1),
                      std::pair(75, 13), std::pair(2, 120)})
                    for (const uint32_t format : written_formats)
                        EXPECT_EQ(one_shot_difference(picture, file, PELM_SOURCE_MEMORY,
                                                      {format, placement, box_width, box_height}),
                                  "");
        }
}

TEST_F(PngScaledGrey, stretching_up_repeats_columns_and_leaves_rows_out) {
    const Picture picture = noise_picture(grey, 8, 5, 4);
    const Bytes file = file_of(picture);
    for (int32_t width = 1; width < 30; width += 3)
        for (int32_t height = 1; height < 30; height += 3)
            EXPECT_EQ(one_shot_difference(picture, file, PELM_SOURCE_MEMORY, {1, 0x700, width, height}), "");
}

TEST_F(PngScaledGrey, rotation_places_for_the_turned_size_and_does_not_turn) {
    for (const auto &[width, height] : {std::pair(40u, 17u), std::pair(17u, 40u), std::pair(30u, 30u)}) {
        const Picture picture = with_transparency(noise_picture(grey, 8, width, height));
        const Bytes file = file_of(picture);
        for (const uint32_t turn : {4u, 8u, 12u})
            for (const uint32_t placement : {0x000u, 0x100u, 0x700u})
                for (const auto &[box_width, box_height] : {std::pair(20, 11), std::pair(11, 20), std::pair(16, 16)})
                    for (const uint32_t format : written_formats)
                        EXPECT_EQ(one_shot_difference(picture, file, PELM_SOURCE_MEMORY,
                                                      {format, turn | placement, box_width, box_height}),
                                  "");
    }
}

TEST_F(PngScaledGrey, the_transparent_colour_is_tested) {
    Picture picture{4, 4, grey, 8, Bytes(16, 9), {}, {}};
    picture.transparency = Bytes{0, 9};
    const Bytes file = file_of(picture);
    EXPECT_EQ(run(file, PELM_SOURCE_MEMORY, {1, 0, 2, 2}, 12).output, background(12));
    const Bytes clear = run(file, PELM_SOURCE_MEMORY, {7, 0, 2, 2}, 16).output;
    EXPECT_EQ(Bytes(clear.begin(), clear.begin() + 8), (Bytes{9, 9, 9, 0, 9, 9, 9, 0}));
}

TEST_F(PngScaledGrey, every_line_call_starts_at_the_top_of_the_area) {
    const Picture picture = with_transparency(noise_picture(grey, 8, 60, 60));
    for (const auto &[box_width, box_height] : {std::pair(30, 30), std::pair(45, 50), std::pair(20, 30)})
        for (const int32_t rows : {1, 2, 3, 7, 19, 20, 21, 40, 60, 61, 1000})
            for (const uint32_t format : {0u, 1u, 6u, 7u})
                expect_lines(picture, {format, 0, box_width, box_height}, rows);
    expect_lines(picture, {7, 0x700, 90, 100}, 4);
    expect_lines(picture, {7, 0x100, 20, 20}, 4);
}

TEST_F(PngScaledGrey, iterative_calls_start_at_the_top_of_the_area_too) {
    const Picture picture = noise_picture(grey, 8, 40, 40);
    const Request request{7, 0, 20, 20};
    const size_t size = buffer_size(picture, request);
    // Stored blocks of four rows each.
    Decode decode(file_of_blocks(picture, Blocks::stored, 41 * 4), PELM_SOURCE_MEMORY, request);
    CallsModel model(picture, request);
    for (uint32_t source_rows = 4; source_rows <= 40; source_rows += 4) {
        Output output(size);
        Bytes expected = background(size);
        model.iterate(source_rows, expected);
        EXPECT_EQ(decode.iterative(output.data()), source_rows == 40 ? 1 : 4);
        EXPECT_EQ(difference(expected, output.bytes(), picture, request), "") << "rows " << source_rows;
    }
}

} // namespace
} // namespace pelm::test

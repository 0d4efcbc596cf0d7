// One-shot decodes of images that stop early: the rows that were not reached are cleared, where that is done.
#include "tests/gif/support/gif_check.h"

namespace pelm::test {
namespace {

constexpr uint16_t side = 20;
const ColourTable table = distinct_table(256);

// An image of which the first `rows` rows are there, and an end code.
Bytes partial(const ImagePlace &place, uint16_t rows, uint16_t screen_height = side) {
    GifFile file;
    file.screen(side, screen_height, table).descriptor(place);
    return file.data(8, lzw_data(noise_pixels(size_t{place.width} * rows, 256, 2), 8)).trailer().bytes;
}

bool is_all(const Bytes &bytes, size_t from, size_t to, uint8_t value) {
    return std::all_of(bytes.begin() + static_cast<ptrdiff_t>(from), bytes.begin() + static_cast<ptrdiff_t>(to),
                       [value](uint8_t byte) { return byte == value; });
}

class GifClearing : public GifTest {};

TEST_F(GifClearing, the_rows_behind_the_last_one_are_zero_in_three_and_four_byte_formats) {
    const Bytes file = partial({0, 0, side, side}, 8);
    for (const uint32_t format : {1u, 5u, 7u, 8u, 11u, 12u}) {
        const GifOutcome outcome = checked_decode(file, own_size(side, side, format));
        const size_t row = side * static_cast<size_t>(gif_pixel_bytes(format));
        EXPECT_EQ(outcome.result, 1);
        EXPECT_FALSE(is_all(outcome.output, 0, 8 * row, 0));
        EXPECT_TRUE(is_all(outcome.output, 8 * row, side * row, 0)) << format;
    }
}

TEST_F(GifClearing, in_two_byte_formats_half_of_the_bytes_are_cleared_from_half_as_far) {
    const Bytes file = partial({0, 0, side, side}, 8);
    for (const uint32_t format : {0u, 10u}) {
        const GifOutcome outcome = checked_decode(file, own_size(side, side, format));
        const size_t row = side * 2, cleared_from = 8 * side, cleared_to = 8 * side + 12 * side;
        EXPECT_FALSE(is_all(outcome.output, 0, cleared_from, 0));
        EXPECT_TRUE(is_all(outcome.output, cleared_from, cleared_to, 0)) << format;
        EXPECT_TRUE(is_all(outcome.output, std::max(cleared_to, 8 * row), side * row, gif_background)) << format;
    }
}

TEST_F(GifClearing, it_begins_at_the_left_column_of_the_picture_and_ends_with_the_buffer) {
    const Bytes file = partial({0, 0, side, side}, 8);
    const GifOutcome outcome = checked_decode(file, {7, 0, 0, 30, 26});
    const size_t from = ((3 + 8) * 30 + 5) * 4;
    EXPECT_TRUE(is_all(outcome.output, from - 5 * 4, from, gif_background));
    EXPECT_TRUE(is_all(outcome.output, from, 26 * 30 * 4, 0));
}

TEST_F(GifClearing, turned_pictures_are_not_cleared) {
    const Bytes file = partial({0, 0, side, side}, 0);
    for (const uint32_t format : gif_formats)
        for (uint32_t turns = 1; turns < 4; ++turns) {
            const GifOutcome outcome = checked_decode(file, {format, turns, 0, side, side});
            EXPECT_TRUE(is_all(outcome.output, 0, outcome.output.size(), gif_background));
        }
}

TEST_F(GifClearing, happens_for_every_row_format_placement_and_interlace) {
    for (const bool interlaced : {false, true})
        for (const uint16_t top : std::initializer_list<uint16_t>{0, 3})
            for (uint16_t rows = 0; rows <= 17; ++rows)
                for (const uint32_t format : gif_formats)
                    for (const GifRequest &request :
                         {GifRequest{format, 0, 0, side, side}, GifRequest{format, 0, 0, 31, 23},
                          GifRequest{format, 0, 0x100, 31, 23}, GifRequest{format, 0, 0x700, 7, 13},
                          GifRequest{format, 0, 0x700, 25, 29}, GifRequest{format, 0, 0x100, 7, 13}})
                        EXPECT_EQ(gif_difference(partial({0, top, side, 17, interlaced}, rows), request), "");
}

TEST_F(GifClearing, happens_also_when_the_reduced_picture_has_no_columns) {
    GifFile file;
    file.screen(1, 24, table).descriptor({0, 0, 1, 24}).data(8, lzw_data({7}, 8)).trailer();
    const GifOutcome outcome = checked_decode(file.bytes, {7, 0, 0, 8, 4});
    EXPECT_EQ(outcome.words.output_width, 0);
    EXPECT_TRUE(is_all(outcome.output, 4 * 4, 8 * 4 * 4, 0)) << "from the middle, where the picture would begin";
}

TEST_F(GifClearing, an_image_that_reaches_below_the_screen_is_not_cleared) {
    const GifOutcome outcome = checked_decode(partial({0, 5, side, 16}, 4), own_size(side, side));
    EXPECT_TRUE(is_all(outcome.output, 9 * side * 4, side * side * 4, gif_background));
}

TEST_F(GifClearing, rows_below_a_whole_image_keep_what_they_had) {
    const GifOutcome outcome = checked_decode(partial({0, 0, side, 6}, 6), own_size(side, side));
    EXPECT_TRUE(is_all(outcome.output, 6 * side * 4, side * side * 4, gif_background));
}

TEST_F(GifClearing, only_one_shot_decodes_clear) {
    const Bytes file = partial({0, 0, side, side}, 8);
    const GifOutcome outcome = checked_decode(file, own_size(side, side), GifCall::iterative);
    EXPECT_EQ(outcome.result, 1);
    EXPECT_TRUE(is_all(outcome.output, 8 * side * 4, side * side * 4, gif_background));
}

} // namespace
} // namespace pelm::test

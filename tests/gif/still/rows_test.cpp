// Where rows go and what becomes of their pixels: formats, interlace, images that do not fill the screen, reduction.
#include "tests/gif/support/gif_check.h"

namespace pelm::test {
namespace {

const ColourTable table = distinct_table(256);
constexpr GifCall both_styles[] = {GifCall::one_shot, GifCall::iterative};

// One image of the place on a screen, its pixels noise.
GifFile image_on_screen(uint16_t width, uint16_t height, const ImagePlace &place, uint32_t seed = 1) {
    GifFile file;
    file.screen(width, height, table);
    return file.image(place, noise_pixels(size_t{place.width} * place.height, 256, seed), 8).trailer();
}

uint8_t pixel_of(const Bytes &rgb, size_t index) {
    for (int entry = 0; entry < 256; ++entry)
        if (std::equal(table.begin() + entry * 3, table.begin() + entry * 3 + 3,
                       rgb.begin() + static_cast<ptrdiff_t>(index) * 3))
            return static_cast<uint8_t>(entry);
    ADD_FAILURE() << "pixel " << index << " has no colour of the table";
    return 0;
}

TEST(GifFormats, every_format_has_its_bytes) {
    TestHost::get().reset();
    GifFile file;
    file.screen(3, 1, {255, 0, 0, 0x12, 0x9A, 0xFE, 0x07, 0x03, 0x04, 255, 255, 255});
    const Bytes bytes = file.image({0, 0, 3, 1}, {0, 1, 2}, 2).trailer().bytes;
    const auto decoded = [&](uint32_t format) { return checked_decode(bytes, own_size(3, 1, format)).output; };
    EXPECT_EQ(decoded(0), (Bytes{0x00, 0xF8, 0xDF, 0x14, 0x00, 0x00}));
    EXPECT_EQ(decoded(10), (Bytes{0x1F, 0x00, 0xC2, 0xFC, 0x00, 0x00}));
    EXPECT_EQ(decoded(1), (Bytes{255, 0, 0, 0x12, 0x9A, 0xFE, 7, 3, 4}));
    EXPECT_EQ(decoded(11), (Bytes{0, 0, 255, 0xFE, 0x9A, 0x12, 4, 3, 7}));
    EXPECT_EQ(decoded(5), (Bytes{255, 255, 0, 0, 255, 0x12, 0x9A, 0xFE, 255, 7, 3, 4}));
    EXPECT_EQ(decoded(7), (Bytes{255, 0, 0, 255, 0x12, 0x9A, 0xFE, 255, 7, 3, 4, 255}));
    EXPECT_EQ(decoded(8), (Bytes{0, 0, 255, 255, 0xFE, 0x9A, 0x12, 255, 4, 3, 7, 255}));
    EXPECT_EQ(decoded(12), (Bytes{0, 0, 255, 255, 0xFE, 0x9A, 0x12, 255, 4, 3, 7, 255}));
}

TEST(GifFormats, a_format_that_is_not_written_succeeds_and_writes_nothing) {
    TestHost::get().reset();
    for (const uint32_t format : {2u, 3u, 4u, 6u, 9u, 13u, 255u, 0xFFFFFFFFu})
        for (const GifCall call : {GifCall::one_shot, GifCall::iterative, GifCall::line}) {
            SideBySide both(still_file({8, 20}).bytes, own_size(8, 20, format));
            EXPECT_EQ(both.all_calls(call, 7), "");
            EXPECT_EQ(both.result(), 1);
            EXPECT_EQ(both.info().outputWidth, 8);
            EXPECT_EQ(both.expected(), Bytes(both.expected().size(), gif_background));
        }
}

class GifInterlace : public GifTest {};

TEST_F(GifInterlace, every_height_is_drawn_in_the_order_of_its_passes) {
    for (uint16_t height = 1; height <= 17; ++height) {
        const Bytes pixels = noise_pixels(size_t{5} * height, 256, height);
        GifFile file;
        file.screen(5, height, table).image({0, 0, 5, height, true}, pixels, 8).trailer();
        for (const GifCall call : both_styles)
            EXPECT_EQ(checked_decode(file.bytes, own_size(5, height, 1), call).output, rgb_of(pixels, table)) << height;
    }
}

TEST_F(GifInterlace, the_order_of_rows_is_the_published_one) {
    EXPECT_EQ(interlaced_order(10), (std::vector<uint32_t>{0, 8, 4, 2, 6, 1, 3, 5, 7, 9}));
    EXPECT_EQ(interlaced_order(4), (std::vector<uint32_t>{0, 2, 1, 3}));
    EXPECT_EQ(interlaced_order(3), (std::vector<uint32_t>{0, 2, 1}));
}

TEST_F(GifInterlace, rows_are_counted_from_the_top_of_the_image) {
    for (uint16_t height = 1; height <= 17; ++height)
        for (const uint16_t top : std::initializer_list<uint16_t>{1, 3, 8}) {
            const Bytes bytes = image_on_screen(5, 20, {0, top, 5, height, true}, height).bytes;
            for (const GifCall call : both_styles) {
                EXPECT_EQ(gif_difference(bytes, own_size(5, 20, 1), call), "") << height << " from " << top;
                EXPECT_EQ(gif_difference(bytes, {1, 0, 0, 4, 13}, call), "") << height << " from " << top;
            }
        }
}

TEST_F(GifInterlace, a_whole_image_of_few_rows_is_not_taken_for_an_unfinished_one) {
    for (uint16_t height = 1; height <= 4; ++height) {
        const GifOutcome outcome = checked_decode(image_on_screen(5, 9, {0, 2, 5, height, true}).bytes, own_size(5, 9));
        const size_t below = size_t{2u + height} * 5 * 4;
        EXPECT_EQ(Bytes(outcome.output.begin() + static_cast<ptrdiff_t>(below), outcome.output.end()),
                  Bytes(outcome.output.size() - below, gif_background));
    }
}

TEST_F(GifInterlace, line_calls_refuse_interlaced_images) {
    SideBySide both(still_file({8, 20, 4, true}).bytes, own_size(8, 20));
    EXPECT_EQ(both.call(GifCall::line, 3), "");
    EXPECT_EQ(both.result(), 0);
    EXPECT_EQ(both.info().decoderState, nullptr);
}

class GifImageOnScreen : public GifTest {
protected:
    static void expect_as_modelled(const Bytes &file, uint16_t width, uint16_t height) {
        for (const GifCall call : {GifCall::one_shot, GifCall::iterative, GifCall::line})
            for (const GifRequest &request :
                 {own_size(width, height, 1), GifRequest{7, 0, 0, width * 3, height * 2},
                  GifRequest{8, 1, 0, height, width}, GifRequest{0, 2, 0, width * 2 / 3 + 1, height * 2 / 3 + 1},
                  GifRequest{11, 3, 0x700, height * 2 / 3 + 1, width + 5}})
                EXPECT_EQ(gif_difference(file, request, call, {}, height), "");
    }
};

TEST_F(GifImageOnScreen, the_left_of_an_image_is_not_applied_to_stills) {
    const Bytes bytes = image_on_screen(12, 5, {7, 0, 5, 5}).bytes;
    const GifOutcome outcome = checked_decode(bytes, own_size(12, 5, 1));
    const Bytes pixels = noise_pixels(25, 256, 1);
    for (size_t x = 0; x < 5; ++x)
        EXPECT_EQ(pixel_of(outcome.output, x), pixels[x]);
    expect_as_modelled(bytes, 12, 5);
}

TEST_F(GifImageOnScreen, the_top_of_an_image_is_applied) {
    const GifOutcome outcome = checked_decode(image_on_screen(4, 9, {0, 3, 4, 2}).bytes, own_size(4, 9, 1));
    const Bytes pixels = noise_pixels(8, 256, 1);
    for (size_t i = 0; i < 36; ++i)
        if (i >= 12 && i < 20)
            EXPECT_EQ(pixel_of(outcome.output, i), pixels[i - 12]);
        else
            EXPECT_EQ(outcome.output[i * 3], gif_background);
}

TEST_F(GifImageOnScreen, one_to_one_rows_of_narrow_images_show_the_pixel_buffer_as_it_lies) {
    // Literals only: one pixel lies behind the row when it is written, and that is the first one of the next.
    GifFile file;
    const LzwOptions literals{.literals_only = true};
    file.screen(6, 3, table).image({0, 0, 2, 3}, {1, 2, 3, 4, 5, 6}, 8, {}, literals).trailer();
    const Bytes output = checked_decode(file.bytes, own_size(6, 3, 1)).output;
    for (int row = 0; row < 3; ++row) {
        EXPECT_EQ(pixel_of(output, static_cast<size_t>(row) * 6), 2 * row + 1);
        EXPECT_EQ(pixel_of(output, static_cast<size_t>(row) * 6 + 1), 2 * row + 2);
        EXPECT_EQ(pixel_of(output, static_cast<size_t>(row) * 6 + 2), 0) << "the buffer was zeroed";
    }
}

TEST_F(GifImageOnScreen, strings_of_every_length_leave_their_traces_behind_narrow_rows) {
    for (uint16_t width = 1; width < 12; ++width)
        for (uint32_t seed = 0; seed < 4; ++seed) {
            GifFile file;
            file.screen(13, 30, table).image({0, 0, width, 30}, noise_pixels(size_t{width} * 30, 2, seed), 2).trailer();
            expect_as_modelled(file.bytes, 13, 30);
        }
}

TEST_F(GifImageOnScreen, images_wider_and_higher_than_the_screen_are_cut) {
    for (const uint16_t width : std::initializer_list<uint16_t>{9, 11, 40, 5000})
        for (const uint16_t height : std::initializer_list<uint16_t>{3, 7, 12})
            for (const uint16_t top : std::initializer_list<uint16_t>{0, 2, 7, 200}) {
                const Bytes bytes = image_on_screen(9, 7, {0, top, width, height, top == 2}).bytes;
                expect_as_modelled(bytes, 9, 7);
            }
}

TEST_F(GifImageOnScreen, rows_beyond_the_image_that_the_last_string_completes_are_drawn_on_the_screen) {
    const Codes codes = {4, 3, 6, 7, 8, 9, 10, 11, 5}; // 1 + 2 + ... + 7 pixels
    for (uint16_t height = 1; height < 9; ++height)
        for (const bool interlaced : {false, true})
            for (const uint16_t width : std::initializer_list<uint16_t>{1, 2, 3, 4}) {
                GifFile file;
                file.screen(4, 11, table).descriptor({0, 1, width, height, interlaced});
                file.data(2, packed_codes(codes, 2)).trailer();
                for (const GifCall call : both_styles)
                    EXPECT_EQ(gif_difference(file.bytes, own_size(4, 11, 1), call), "") << height << " x " << width;
            }
}

TEST_F(GifImageOnScreen, an_image_without_columns_has_as_many_empty_rows_as_it_is_high) {
    for (const uint16_t height : std::initializer_list<uint16_t>{0, 1, 4, 9, 40}) {
        GifFile file;
        file.screen(5, 7, table).descriptor({0, 0, 0, height}).data(8, lzw_data({9, 8, 7}, 8)).trailer();
        for (const GifCall call : {GifCall::one_shot, GifCall::line})
            for (const GifRequest &request : {own_size(5, 7, 1), GifRequest{1, 0, 0, 3, 3}})
                EXPECT_EQ(gif_difference(file.bytes, request, call, {}, 50), "") << height;
    }
}

TEST_F(GifImageOnScreen, an_image_without_rows_writes_nothing_and_succeeds) {
    for (const uint16_t width : std::initializer_list<uint16_t>{0, 3}) {
        GifFile file;
        file.screen(5, 7, table).descriptor({0, 2, width, 0}).data(8, lzw_data({9, 8, 7}, 8)).trailer();
        EXPECT_EQ(checked_decode(file.bytes, own_size(5, 7)).output, Bytes(5 * 7 * 4, gif_background));
        expect_as_modelled(file.bytes, 5, 7);
    }
}

class GifReduction : public GifTest {};

TEST_F(GifReduction, columns_and_rows_are_sampled_at_their_centres) {
    const Bytes pixels = noise_pixels(100 * 50, 256, 6);
    GifFile file;
    file.screen(100, 50, table).image({0, 0, 100, 50}, pixels, 8).trailer();
    const GifOutcome outcome = checked_decode(file.bytes, {1, 0, 0, 40, 40});
    EXPECT_EQ(outcome.words.output_width, 40);
    EXPECT_EQ(outcome.words.output_height, 20);
    constexpr size_t first_columns[] = {1, 3, 6, 8};
    for (size_t column = 0; column < 4; ++column)
        EXPECT_EQ(pixel_of(outcome.output, 10 * 40 + column), pixels[100 + first_columns[column]]);
    for (size_t row = 0; row < 20; ++row)
        for (size_t column = 0; column < 40; ++column)
            EXPECT_EQ(pixel_of(outcome.output, (10 + row) * 40 + column),
                      pixels[(row * 50 + 25) / 20 * 100 + (100 * column + 50) / 40]);
    EXPECT_EQ(outcome.output[10 * 40 * 3 - 1], gif_background);
    EXPECT_EQ(outcome.output[30 * 40 * 3], gif_background);
}

TEST_F(GifReduction, an_image_is_never_enlarged_to_fit_but_stretched_where_asked) {
    const Bytes pixels = noise_pixels(10 * 5, 256, 6);
    GifFile file;
    file.screen(10, 5, table).image({0, 0, 10, 5}, pixels, 8).trailer();
    const GifOutcome fitted = checked_decode(file.bytes, {1, 0, 0, 20, 20});
    EXPECT_EQ(fitted.words.output_width, 10);
    EXPECT_EQ(pixel_of(fitted.output, 7 * 20 + 5), pixels[0]);
    const GifOutcome stretched = checked_decode(file.bytes, {1, 0, 0x700, 20, 20});
    EXPECT_EQ(stretched.words.output_height, 20);
    for (size_t row = 0; row < 20; ++row)
        for (size_t column = 0; column < 20; ++column)
            EXPECT_EQ(pixel_of(stretched.output, row * 20 + column),
                      pixels[(row * 5 + 2) / 20 * 10 + (column * 10 + 5) / 20]);
}

TEST_F(GifReduction, turning_a_reduced_picture_turns_its_pixels) {
    const Bytes bytes = still_file({23, 17, 8}).bytes;
    for (const uint32_t format : gif_formats) {
        const size_t size = static_cast<size_t>(gif_pixel_bytes(format));
        const Bytes upright = checked_decode(bytes, {format, 0, 0x100, 11, 30}).output;
        const size_t w = 11, h = 8;
        ASSERT_EQ(upright.size(), w * h * size);
        for (uint32_t turns = 1; turns < 4; ++turns) {
            const bool sideways = turns != 2;
            const GifRequest request{format, turns, 0, sideways ? 8 : 11, sideways ? 11 : 8};
            const Bytes turned = checked_decode(bytes, request).output;
            Bytes expected;
            for (size_t y = 0; y < (sideways ? w : h); ++y)
                for (size_t x = 0; x < (sideways ? h : w); ++x) {
                    const size_t from = turns == 1   ? (h - 1 - x) * w + y
                                        : turns == 2 ? (h - 1 - y) * w + w - 1 - x
                                                     : x * w + w - 1 - y;
                    const auto at = upright.begin() + static_cast<ptrdiff_t>(from * size);
                    expected.insert(expected.end(), at, at + static_cast<ptrdiff_t>(size));
                }
            EXPECT_EQ(turned, expected) << request.described();
        }
    }
}

TEST_F(GifReduction, turned_one_to_one_rows_of_formats_5_7_and_8_run_forward) {
    const Bytes bytes = still_file({5, 3, 8}).bytes;
    for (const uint32_t format : {5u, 7u, 8u})
        for (uint32_t turns = 1; turns < 4; ++turns) {
            const GifRequest request{format, turns, 0, turns == 2 ? 5 : 3, turns == 2 ? 3 : 5};
            const Bytes output = checked_decode(bytes, request).output;
            const Bytes upright = checked_decode(bytes, own_size(5, 3, format)).output;
            // The last row starts at its own place and runs on through the buffer.
            const ptrdiff_t start = turns == 1 ? 0 : turns == 2 ? 4 : 14;
            for (ptrdiff_t x = 0; x < 5 && start + x < 15; ++x)
                EXPECT_TRUE(std::equal(output.begin() + (start + x) * 4, output.begin() + (start + x + 1) * 4,
                                       upright.begin() + (10 + x) * 4))
                    << request.described() << ", column " << x;
        }
}

} // namespace
} // namespace pelm::test

// Every layout but plain 8-bit grey in another size: four samples to a pixel, turned as asked.
#include "tests/png/decode/calls_model.h"
#include "tests/png/decode/decoding.h"

namespace pelm::test {
namespace {

class PngReduced : public PngDecoding {
protected:
    static void expect_lines(const Picture &picture, const Bytes &file, uint32_t kind, const Request &request,
                             int32_t rows) {
        const size_t size = buffer_size(picture, request);
        CallsModel model(picture, request);
        Decode decode(file, kind, request);
        int32_t result = 4;
        for (int call = 1; result == 4 && call < 300; ++call) {
            Output output(size);
            Bytes expected = background(size);
            const int32_t wanted = model.line(rows, expected);
            result = decode.line(output.data(), rows);
            ASSERT_EQ(result, wanted) << "call " << call << ", " << picture.described() << ", " << request.described()
                                      << ", rows " << rows;
            ASSERT_EQ(difference(expected, output.bytes(), picture, request), "") << "call " << call;
            ASSERT_TRUE(output.intact());
        }
        EXPECT_EQ(result, 1);
        EXPECT_FALSE(decode.started());
    }
};

std::vector<Layout> reduced_layouts() {
    std::vector<Layout> layouts;
    for (const Layout layout : all_layouts)
        if (layout.colour_type != grey || layout.depth != 8) layouts.push_back(layout);
    return layouts;
}

Picture picture_of(Layout layout, bool transparent, uint32_t width, uint32_t height) {
    const Picture picture = noise_picture(layout.colour_type, layout.depth, width, height);
    return transparent ? with_transparency(picture) : picture;
}

TEST_F(PngReduced, every_layout_is_reduced_in_every_format) {
    for (const Layout layout : reduced_layouts())
        for (const bool transparent : {false, true}) {
            const Picture picture = picture_of(layout, transparent, 37, 23);
            const Bytes file = file_of(picture);
            for (const auto &[width, height] :
                 {std::pair(36, 36), std::pair(18, 40), std::pair(9, 9), std::pair(40, 5), std::pair(2, 3)})
                for (const uint32_t format : written_formats)
                    EXPECT_EQ(one_shot_difference(picture, file, PELM_SOURCE_MEMORY, {format, 0, width, height}), "");
        }
}

TEST_F(PngReduced, every_rotation_is_honoured_in_every_format) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{rgb_alpha, 8}, Layout{indexed, 4}, Layout{grey, 16}})
        for (const auto &[width, height] : {std::pair(30u, 14u), std::pair(14u, 30u), std::pair(20u, 20u)}) {
            const Picture picture = picture_of(layout, true, width, height);
            const Bytes file = file_of(picture);
            for (const uint32_t turn : {0u, 4u, 8u, 12u})
                for (const uint32_t placement : {0x000u, 0x100u, 0x700u})
                    for (const auto &[box_width, box_height] :
                         {std::pair(12, 9), std::pair(9, 12), std::pair(11, 11), std::pair(5, 40)})
                        for (const uint32_t format : written_formats)
                            EXPECT_EQ(one_shot_difference(picture, file, PELM_SOURCE_MEMORY,
                                                          {format, turn | placement, box_width, box_height}),
                                      "");
        }
}

TEST_F(PngReduced, rgb565_turned_by_270_starts_at_the_row_of_the_scaled_height) {
    // 16 x 8 into 8 x 8, turned: scaled 8 x 4, placed 4 x 8 at (2, 0). Columns go up from row 3, so that the columns 4
    // to 7 lie above the buffer.
    const Picture white{16, 8, rgb, 8, Bytes(16 * 8 * 3, 255), {}, {}};
    const Outcome outcome = run(file_of(white), PELM_SOURCE_MEMORY, {0, PELM_ROTATE_270, 8, 8}, 128);
    EXPECT_EQ(flaws(outcome), "");
    Bytes expected = background(128);
    for (size_t row = 0; row < 4; ++row)
        for (size_t column = 2; column < 6; ++column)
            expected[(row * 8 + column) * 2] = expected[(row * 8 + column) * 2 + 1] = 255;
    EXPECT_EQ(outcome.output, expected);
}

TEST_F(PngReduced, stretching_goes_up_and_down) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{grey_alpha, 8}, Layout{indexed, 1}, Layout{grey, 2}})
        for (const uint32_t turn : {0u, 4u, 8u, 12u}) {
            const Picture picture = picture_of(layout, true, 7, 5);
            const Bytes file = file_of(picture);
            for (int32_t width = 1; width < 30; width += 4)
                for (int32_t height = 1; height < 30; height += 4)
                    for (const uint32_t format : {0u, 1u, 7u})
                        EXPECT_EQ(one_shot_difference(picture, file, PELM_SOURCE_MEMORY,
                                                      {format, 0x700 | turn, width, height}),
                                  "");
        }
}

TEST_F(PngReduced, stretching_to_the_images_own_size_changes_nothing_in_opaque_images) {
    // Four samples at the quarter points of one pixel are that pixel itself.
    for (const Layout layout : {Layout{rgb, 8}, Layout{grey, 1}, Layout{indexed, 8}, Layout{rgb, 16}}) {
        const Picture picture = picture_of(layout, false, 13, 9);
        const Bytes same = run(file_of(picture), PELM_SOURCE_MEMORY, {7, 0, 13, 9}, 13 * 9 * 4).output;
        const Bytes stretched = run(file_of(picture), PELM_SOURCE_MEMORY, {7, 0x700, 13, 9}, 13 * 9 * 4).output;
        EXPECT_EQ(same, stretched) << picture.described();
    }
}

TEST_F(PngReduced, every_uniform_opaque_colour_stays_exact) {
    for (unsigned value = 0; value < 256; ++value) {
        const uint8_t r = static_cast<uint8_t>(value), g = static_cast<uint8_t>(255 - value), b = 128;
        Picture picture{9, 9, rgb, 8, {}, {}, {}};
        for (int i = 0; i < 81; ++i)
            picture.rows.insert(picture.rows.end(), {r, g, b});
        const Bytes file = file_of(picture);
        for (const int32_t side : {8, 3, 14}) {
            const size_t size = static_cast<size_t>(side * side) * 4;
            const Bytes got = run(file, PELM_SOURCE_MEMORY, {7, 0x700, side, side}, size).output;
            Bytes expected;
            for (size_t i = 0; i < size / 4; ++i)
                expected.insert(expected.end(), {r, g, b, 255});
            ASSERT_EQ(got, expected) << "value " << value << ", side " << side;
        }
    }
}

TEST_F(PngReduced, every_uniform_translucent_colour_stays_within_the_rounding) {
    for (const unsigned alpha : {0u, 1u, 2u, 3u, 64u, 127u, 128u, 200u, 254u, 255u})
        for (unsigned value = 0; value < 256; value += 5) {
            Picture picture{6, 6, grey_alpha, 8, {}, {}, {}};
            for (int i = 0; i < 36; ++i)
                picture.rows.insert(picture.rows.end(), {static_cast<uint8_t>(value), static_cast<uint8_t>(alpha)});
            EXPECT_EQ(one_shot_difference(picture, file_of(picture), PELM_SOURCE_MEMORY, {7, 0, 3, 3}), "");
            EXPECT_EQ(one_shot_difference(picture, file_of(picture), PELM_SOURCE_MEMORY, {1, 0, 3, 3}), "");
        }
}

TEST_F(PngReduced, samples_lie_at_the_quarter_points) {
    // 4 x 4 into 1 x 1: rows and columns 1 and 3, rounded one after another: (c + k) >> 2.
    Picture picture{4, 4, rgb, 8, Bytes(48), {}, {}};
    const auto set = [&](uint32_t x, uint32_t y, uint32_t value) { picture.set_sample(x, y, 0, value); };
    set(1, 1, 100), set(3, 1, 101), set(1, 3, 102), set(3, 3, 103);
    const Bytes got = run(file_of(picture), PELM_SOURCE_MEMORY, {7, 0, 1, 1}, 4).output;
    EXPECT_EQ(got, (Bytes{25 + 25 + 26 + 26, 0, 0, 255}));
}

TEST_F(PngReduced, a_transparent_colour_takes_part_without_its_colour) {
    // Two of four samples are the transparent colour: half of the alpha, the colour of the other two.
    Picture picture{4, 4, rgb, 8, Bytes(48), {}, {}};
    for (uint32_t y = 0; y < 4; ++y)
        for (uint32_t x = 0; x < 4; ++x)
            picture.set_sample(x, y, 0, y < 2 ? 250 : 80);
    picture.transparency = Bytes{0, 250, 0, 0, 0, 0};
    const Bytes got = run(file_of(picture), PELM_SOURCE_MEMORY, {7, 0, 1, 1}, 4).output;
    // Alpha: 0 + 0 + (257 >> 2) + (258 >> 2) = 128. Red: (82 >> 2) + (83 >> 2) = 40; 40 * 255 / 128 = 79.7.
    EXPECT_EQ(got, (Bytes{80, 0, 0, 128}));
}

TEST_F(PngReduced, a_transparent_colour_everywhere_leaves_the_buffer_where_there_is_no_alpha) {
    for (const uint8_t depth : {uint8_t{8}, uint8_t{16}}) {
        Picture picture{8, 8, rgb, depth, {}, {}, {}};
        picture.rows.resize(picture.row_bytes() * 8, 7);
        const uint8_t high = depth == 16 ? 7 : 0;
        picture.transparency = Bytes{high, 7, high, 7, high, 7};
        const Bytes file = file_of(picture);
        EXPECT_EQ(run(file, PELM_SOURCE_MEMORY, {0, 0, 4, 4}, 32).output, background(32));
        EXPECT_EQ(run(file, PELM_SOURCE_MEMORY, {1, 0, 4, 4}, 48).output, background(48));
        for (const uint32_t format : {5u, 7u, 8u})
            EXPECT_EQ(run(file, PELM_SOURCE_MEMORY, {format, 0, 4, 4}, 64).output, Bytes(64)) << format;
    }
}

TEST_F(PngReduced, every_line_call_gets_a_band) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{rgb_alpha, 8}, Layout{indexed, 2}, Layout{grey, 16}}) {
        const Picture picture = picture_of(layout, true, 33, 40);
        const Bytes file = file_of(picture);
        for (const auto &[width, height] : {std::pair(20, 20), std::pair(12, 39), std::pair(30, 7)})
            for (const int32_t rows : {1, 2, 3, 7, 10, 19, 20, 21, 39, 40, 41, 500})
                for (const uint32_t format : {0u, 1u, 6u, 7u})
                    expect_lines(picture, file, PELM_SOURCE_MEMORY, {format, 0, width, height}, rows);
        expect_lines(picture, file, PELM_SOURCE_STREAM, {7, 0x100, 20, 20}, 3);
    }
}

TEST_F(PngReduced, bands_of_stretched_images_end_with_the_source_row) {
    for (const uint32_t turn : {0u, 4u, 8u, 12u})
        for (const int32_t rows : {1, 2, 5, 6, 9, 20, 23, 46, 47})
            for (const uint32_t format : {0u, 7u}) {
                const Picture picture = picture_of({rgb_alpha, 8}, false, 7, 6);
                expect_lines(picture, file_of(picture), PELM_SOURCE_MEMORY, {format, 0x700 | turn, 19, 46}, rows);
            }
}

TEST_F(PngReduced, bands_of_turned_images_start_at_the_first_pixel) {
    const Picture picture = picture_of({grey_alpha, 16}, false, 25, 31);
    const Bytes file = file_of(picture);
    for (const uint32_t turn : {4u, 8u, 12u})
        for (const uint32_t placement : {0x000u, 0x100u, 0x700u})
            for (const int32_t rows : {1, 4, 13})
                for (const uint32_t format : {0u, 1u, 8u})
                    expect_lines(picture, file, PELM_SOURCE_MEMORY, {format, turn | placement, 14, 17}, rows);
}

TEST_F(PngReduced, bands_put_together_are_the_whole_image) {
    for (const Layout layout : reduced_layouts()) {
        const Picture picture = picture_of(layout, true, 30, 26);
        const Request request{7, 0x100, 15, 15};
        const size_t size = buffer_size(picture, request);
        const size_t row = static_cast<size_t>(geometry_of(picture, request).width) * 4;
        const Bytes whole = run(file_of(picture), PELM_SOURCE_MEMORY, request, size).output;
        Bytes joined;
        Decode decode(file_of(picture), PELM_SOURCE_STREAM, request);
        for (int32_t result = 4; result == 4 && joined.size() < size;) {
            Output output(size);
            result = decode.line(output.data(), 4);
            const Bytes band = output.bytes();
            joined.insert(joined.end(), band.begin(), band.begin() + static_cast<ptrdiff_t>(4 * row));
        }
        joined.resize(size);
        EXPECT_EQ(difference(whole, joined, picture, request), "");
    }
}

TEST_F(PngReduced, iterative_calls_fill_the_one_box) {
    for (const Layout layout : reduced_layouts())
        for (const Blocks blocks : {Blocks::stored, Blocks::mixed}) {
            const Picture picture = picture_of(layout, true, 30, 26);
            const Bytes file = file_of_blocks(picture, blocks, picture.row_bytes() * 5 / 2 + 1);
            for (const uint32_t turn : {0u, 4u, 8u, 12u})
                for (const uint32_t format : {0u, 1u, 7u})
                    for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM}) {
                        const Request request{format, turn, 14, 14};
                        const size_t size = buffer_size(picture, request);
                        Bytes expected = background(size);
                        draw(picture, request, expected);
                        const Outcome outcome = run(file, kind, request, size, Call::iterative);
                        EXPECT_EQ(flaws(outcome), "") << picture.described();
                        EXPECT_GT(outcome.results.size(), 4u);
                        EXPECT_EQ(difference(expected, outcome.output, picture, request), "");
                    }
        }
}

TEST_F(PngReduced, a_strong_reduction_is_no_different) {
    for (const uint32_t side : {28u, 32u, 64u, 200u}) {
        const Picture picture = picture_of({rgb, 8}, true, side, side / 2);
        for (const int32_t box : {8, 7, 1})
            EXPECT_EQ(one_shot_difference(picture, file_of(picture), PELM_SOURCE_STREAM, {7, 0, box, box}), "");
    }
}

} // namespace
} // namespace pelm::test

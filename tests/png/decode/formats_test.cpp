// Every stored layout in every output format, pixel for pixel.
#include "tests/png/decode/decoding.h"

namespace pelm::test {
namespace {

class PngFormats : public PngDecoding {
protected:
    // One row of pixels, at its own size, over a buffer of `below`.
    Bytes decoded(const Picture &picture, uint32_t format, const Bytes &below) {
        Output output(below.size());
        output.fill(below);
        Decode decode(file_of(picture), PELM_SOURCE_MEMORY,
                      {format, 0, static_cast<int32_t>(picture.width), static_cast<int32_t>(picture.height)});
        EXPECT_EQ(decode.one_shot(output.data()), 1);
        EXPECT_TRUE(output.intact());
        return output.bytes();
    }
    static Picture row_of(uint8_t colour_type, uint8_t depth, uint32_t width, const Bytes &row) {
        return {width, 1, colour_type, depth, row, {}, {}};
    }
};

constexpr uint32_t every_format[] = {0, 1, 5, 6, 7, 8, 2, 3, 4, 9, 10, 11, 12, 0x100, 0xFFFFFFFF};

TEST_F(PngFormats, every_layout_comes_out_in_every_format_as_the_tables_say) {
    for (const Layout layout : all_layouts)
        for (const bool transparent : {false, true})
            for (const uint32_t width : {1u, 7u, 8u, 19u}) {
                Picture picture = noise_picture(layout.colour_type, layout.depth, width, 9, width);
                if (transparent) picture = with_transparency(picture);
                const Bytes file = file_of(picture);
                for (const uint32_t format : every_format) {
                    const Request request{format, 0, static_cast<int32_t>(width) + 3, 11};
                    EXPECT_EQ(one_shot_difference(picture, file, PELM_SOURCE_MEMORY, request), "");
                }
            }
}

TEST_F(PngFormats, output_of_any_alignment_is_written) {
    for (const Layout layout : all_layouts) {
        const Picture picture = with_transparency(noise_picture(layout.colour_type, layout.depth, 11, 5));
        const Bytes file = file_of(picture);
        for (const uint32_t format : written_formats)
            for (const size_t behind : {1u, 2u, 3u}) {
                EXPECT_EQ(one_shot_difference(picture, file, PELM_SOURCE_MEMORY, {format, 0, 12, 7}, behind), "");
                EXPECT_EQ(one_shot_difference(picture, file, PELM_SOURCE_MEMORY, {format, 4, 3, 3}, behind), "");
            }
    }
}

TEST_F(PngFormats, all_samples_of_every_depth_are_converted) {
    for (const Layout layout : all_layouts) {
        // Counts through the values of a byte in every byte of a row.
        Picture picture = noise_picture(layout.colour_type, layout.depth, 256, 4);
        for (size_t i = 0; i < picture.rows.size(); ++i)
            picture.rows[i] = static_cast<uint8_t>(i / picture.channels() + 60 * (i % picture.channels()) + i / 256);
        const Bytes file = file_of(picture);
        for (const uint32_t format : written_formats)
            EXPECT_EQ(one_shot_difference(picture, file, PELM_SOURCE_MEMORY, {format, 0, 256, 4}), "");
    }
}

TEST_F(PngFormats, a_format_that_is_not_written_leaves_the_buffer_and_succeeds) {
    for (const uint32_t format : {2u, 3u, 4u, 9u, 10u, 11u, 12u, 1000u})
        for (const Layout layout : all_layouts)
            for (const int32_t side : {20, 5}) {
                const Picture picture = noise_picture(layout.colour_type, layout.depth, 20, 20);
                const size_t size = static_cast<size_t>(side * side) * 4;
                const Outcome outcome = run(file_of(picture), PELM_SOURCE_MEMORY, {format, 0, side, side}, size);
                EXPECT_EQ(flaws(outcome), "") << picture.described() << ", format " << format;
                EXPECT_EQ(outcome.output, background(size)) << picture.described() << ", format " << format;
            }
}

// The following state the bytes themselves, apart from the model.

TEST_F(PngFormats, rgb_bytes_in_every_format) {
    const Picture picture = row_of(rgb, 8, 2, {0x12, 0x9A, 0xF7, 255, 4, 8});
    // 0x12 -> 2, 0x9A -> 38, 0xF7 -> 30: 2 << 11 | 38 << 5 | 30 = 0x14DE. 31, 1, 1: 0xF821.
    EXPECT_EQ(decoded(picture, 0, Bytes(4)), (Bytes{0xDE, 0x14, 0x21, 0xF8}));
    EXPECT_EQ(decoded(picture, 1, Bytes(6)), (Bytes{0x12, 0x9A, 0xF7, 255, 4, 8}));
    EXPECT_EQ(decoded(picture, 5, Bytes(8)), (Bytes{255, 0x12, 0x9A, 0xF7, 255, 255, 4, 8}));
    EXPECT_EQ(decoded(picture, 6, Bytes(6)), (Bytes{0xDE, 0x14, 255, 0x21, 0xF8, 255}));
    EXPECT_EQ(decoded(picture, 7, Bytes(8)), (Bytes{0x12, 0x9A, 0xF7, 255, 255, 4, 8, 255}));
    EXPECT_EQ(decoded(picture, 8, Bytes(8)), (Bytes{0xF7, 0x9A, 0x12, 255, 8, 4, 255, 255}));
}

TEST_F(PngFormats, narrow_grey_is_widened_with_ones) {
    EXPECT_EQ(decoded(row_of(grey, 1, 2, {0x40}), 1, Bytes(6)), (Bytes{0, 0, 0, 255, 255, 255}));
    EXPECT_EQ(decoded(row_of(grey, 1, 2, {0x40}), 0, Bytes(4, 7)), (Bytes{0, 0, 255, 255}));
    EXPECT_EQ(decoded(row_of(grey, 2, 4, {0x1B}), 1, Bytes(12)),
              (Bytes{63, 63, 63, 127, 127, 127, 191, 191, 191, 255, 255, 255}));
    EXPECT_EQ(decoded(row_of(grey, 4, 3, {0x0F, 0x70}), 7, Bytes(12)),
              (Bytes{15, 15, 15, 255, 255, 255, 255, 255, 127, 127, 127, 255}));
}

TEST_F(PngFormats, sixteen_bits_are_cut_to_their_first_byte) {
    EXPECT_EQ(decoded(row_of(grey, 16, 2, {0x12, 0xFF, 0xFE, 0x80}), 1, Bytes(6)),
              (Bytes{0x12, 0x12, 0x12, 0xFE, 0xFE, 0xFE}));
    EXPECT_EQ(decoded(row_of(rgb, 16, 1, {1, 255, 2, 255, 3, 255}), 7, Bytes(4)), (Bytes{1, 2, 3, 255}));
    EXPECT_EQ(decoded(row_of(grey_alpha, 16, 1, {9, 255, 8, 255}), 5, Bytes(4)), (Bytes{8, 9, 9, 9}));
    EXPECT_EQ(decoded(row_of(rgb_alpha, 16, 1, {1, 9, 2, 9, 3, 9, 4, 9}), 8, Bytes(4)), (Bytes{3, 2, 1, 4}));
}

TEST_F(PngFormats, an_alpha_channel_blends_over_the_buffer_where_there_is_no_alpha) {
    const Picture half = row_of(rgb_alpha, 8, 1, {200, 100, 50, 128});
    // (200 * 129 >> 8) + (128 * 40 >> 8) = 100 + 20, (100 * 129 >> 8) + (128 * 80 >> 8) = 50 + 40,
    // (50 * 129 >> 8) + (128 * 255 >> 8) = 25 + 127.
    EXPECT_EQ(decoded(half, 1, {40, 80, 255}), (Bytes{120, 90, 152}));
    // Below: 0xFFFF, widened to 248, 252, 248: 100 + 124, 50 + 126, 25 + 124 -> 28, 44, 18.
    const unsigned packed = 28u << 11 | 44u << 5 | 18u;
    EXPECT_EQ(decoded(half, 0, {255, 255}), (Bytes{packed & 0xFF, packed >> 8}));
    EXPECT_EQ(decoded(half, 7, Bytes(4)), (Bytes{200, 100, 50, 128}));
    EXPECT_EQ(decoded(half, 6, Bytes(3)), (Bytes{0x26, 0xCB, 128}));

    const Picture clear = row_of(grey_alpha, 8, 2, {77, 0, 77, 255});
    EXPECT_EQ(decoded(clear, 0, {0xCD, 0xAB, 0xCD, 0xAB}), (Bytes{0xCD, 0xAB, 0x69, 0x4A}));
    EXPECT_EQ(decoded(clear, 1, {1, 2, 255, 4, 5, 6}), (Bytes{1, 2, 255, 77, 77, 77}));
    EXPECT_EQ(decoded(clear, 8, Bytes(8)), (Bytes{77, 77, 77, 0, 77, 77, 77, 255}));
}

TEST_F(PngFormats, the_transparent_grey_is_not_written_where_there_is_no_alpha) {
    Picture picture = row_of(grey, 8, 3, {0, 5, 0});
    picture.transparency = Bytes{0, 0};
    EXPECT_EQ(decoded(picture, 1, Bytes(9, 0x33)), (Bytes{0x33, 0x33, 0x33, 5, 5, 5, 0x33, 0x33, 0x33}));
    EXPECT_EQ(decoded(picture, 0, Bytes(6, 0x33)), (Bytes{0x33, 0x33, 0x20, 0x00, 0x33, 0x33}));
    EXPECT_EQ(decoded(picture, 7, Bytes(12, 0x33)), (Bytes{0, 0, 0, 0, 5, 5, 5, 255, 0, 0, 0, 0}));
    picture.rows = {7, 5, 7};
    picture.transparency = Bytes{0, 7};
    EXPECT_EQ(decoded(picture, 5, Bytes(12, 0x33)), (Bytes{0, 7, 7, 7, 255, 5, 5, 5, 0, 7, 7, 7}));
}

TEST_F(PngFormats, the_high_byte_of_a_transparent_grey_counts_at_16_bits_only) {
    Picture picture = row_of(grey, 8, 1, {7});
    picture.transparency = Bytes{1, 7};
    EXPECT_EQ(decoded(picture, 7, Bytes(4)), (Bytes{7, 7, 7, 0}));
    picture = row_of(grey, 16, 3, {1, 7, 2, 7, 1, 8});
    picture.transparency = Bytes{1, 7};
    EXPECT_EQ(decoded(picture, 7, Bytes(12)), (Bytes{1, 1, 1, 0, 2, 2, 2, 255, 1, 1, 1, 255}));
}

TEST_F(PngFormats, a_transparent_rgb_above_255_matches_no_8_bit_pixel) {
    Picture picture = row_of(rgb, 8, 2, {1, 2, 3, 1, 2, 4});
    picture.transparency = Bytes{0, 1, 0, 2, 0, 3};
    EXPECT_EQ(decoded(picture, 7, Bytes(8)), (Bytes{1, 2, 3, 0, 1, 2, 4, 255}));
    picture.transparency = Bytes{1, 1, 0, 2, 0, 3};
    EXPECT_EQ(decoded(picture, 7, Bytes(8)), (Bytes{1, 2, 3, 255, 1, 2, 4, 255}));
}

TEST_F(PngFormats, a_transparent_rgb_of_16_bits_matches_in_all_bits) {
    Picture picture = row_of(rgb, 16, 3, {1, 2, 3, 4, 5, 6, 1, 2, 3, 4, 5, 7, 1, 9, 3, 4, 5, 6});
    picture.transparency = Bytes{1, 2, 3, 4, 5, 6};
    EXPECT_EQ(decoded(picture, 7, Bytes(12)), (Bytes{1, 3, 5, 0, 1, 3, 5, 255, 1, 3, 5, 255}));
    EXPECT_EQ(decoded(picture, 1, Bytes(9, 0x44)), (Bytes{0x44, 0x44, 0x44, 1, 3, 5, 1, 3, 5}));
}

TEST_F(PngFormats, a_transparent_grey_below_8_bits_is_not_looked_at) {
    for (const uint8_t depth : {uint8_t{1}, uint8_t{2}, uint8_t{4}}) {
        Picture picture = row_of(grey, depth, 1, {0xFF});
        picture.transparency = Bytes{0, static_cast<uint8_t>((1 << depth) - 1)};
        EXPECT_EQ(decoded(picture, 7, Bytes(4)), (Bytes{255, 255, 255, 255})) << "depth " << int{depth};
        EXPECT_EQ(decoded(picture, 1, Bytes(3)), (Bytes{255, 255, 255})) << "depth " << int{depth};
    }
}

TEST_F(PngFormats, indices_without_a_colour_are_black_and_opaque) {
    Picture picture = row_of(indexed, 8, 4, {0, 1, 2, 255});
    picture.palette = {10, 20, 30, 40, 50, 60};
    EXPECT_EQ(decoded(picture, 7, Bytes(16)), (Bytes{10, 20, 30, 255, 40, 50, 60, 255, 0, 0, 0, 255, 0, 0, 0, 255}));
    picture.transparency = Bytes{9};
    EXPECT_EQ(decoded(picture, 7, Bytes(16)), (Bytes{10, 20, 30, 9, 40, 50, 60, 255, 0, 0, 0, 255, 0, 0, 0, 255}));
}

TEST_F(PngFormats, alphas_beyond_the_palette_are_kept_for_three_times_its_colours) {
    Picture picture = row_of(indexed, 8, 4, {1, 2, 5, 6});
    picture.palette = {10, 20, 30, 40, 50, 60};
    picture.transparency = Bytes{1, 2, 3, 4, 5, 6, 7, 8, 9};
    EXPECT_EQ(decoded(picture, 7, Bytes(16)), (Bytes{40, 50, 60, 2, 0, 0, 0, 3, 0, 0, 0, 6, 0, 0, 0, 255}));
}

TEST_F(PngFormats, a_palette_image_without_a_palette_is_black) {
    Picture picture = row_of(indexed, 8, 2, {0, 200});
    Png png = png_of(picture);
    png.plte.reset();
    Output output(8);
    Decode decode(build(png), PELM_SOURCE_MEMORY, {7, 0, 2, 1});
    EXPECT_EQ(decode.one_shot(output.data()), 1);
    EXPECT_EQ(output.bytes(), (Bytes{0, 0, 0, 255, 0, 0, 0, 255}));
}

TEST_F(PngFormats, a_filter_byte_above_4_zeroes_the_first_byte_of_the_row) {
    Picture picture{4, 3, grey, 8, {9, 8, 7, 6, 5, 4, 3, 2, 1, 2, 3, 4}, {}, {}};
    Png png = png_of(picture);
    png.scanlines = Bytes{0, 9, 8, 7, 6, 5, 5, 4, 3, 2, 2, 1, 2, 3, 4};
    Output output(12 * 3);
    Decode decode(build(png), PELM_SOURCE_MEMORY, {1, 0, 4, 3});
    EXPECT_EQ(decode.one_shot(output.data()), 1);
    const Bytes wanted{9, 8, 7, 6, 0, 4, 3, 2, 1, 6, 6, 6};
    for (size_t i = 0; i < 12; ++i)
        EXPECT_EQ(output.bytes()[i * 3], wanted[i]) << "sample " << i;
}

} // namespace
} // namespace pelm::test

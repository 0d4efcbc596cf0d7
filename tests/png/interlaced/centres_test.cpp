// Interlaced pictures in another size, without a frame: every output pixel shows the source pixel under its centre.
#include "tests/png/interlaced/passes.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

using PngInterlacedCentres = PngDecoding;

TEST_F(PngInterlacedCentres, every_layout_is_scaled_in_every_format) {
    EXPECT_EQ(reduced_noise_difference(0), "");
}

TEST_F(PngInterlacedCentres, pictures_of_a_few_pixels_are_scaled_like_larger_ones) {
    for (const Layout layout : all_layouts)
        for (const bool transparent : {false, true}) {
            const Picture picture = interlaced_noise(layout, transparent, 3, 2);
            const Bytes file = interlaced_file_of(picture);
            for (const auto &[width, height] : {std::pair(2, 1), std::pair(1, 2), std::pair(1, 1)})
                for (const uint32_t format : written_formats)
                    ASSERT_EQ(interlaced_difference(picture, file, PELM_SOURCE_MEMORY, {format, 0, width, height}), "");
        }
}

TEST_F(PngInterlacedCentres, every_rotation_and_placement_is_honoured) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{rgb_alpha, 8}, Layout{indexed, 4}, Layout{grey, 16}})
        for (const auto &[width, height] : {std::pair(30u, 14u), std::pair(14u, 30u), std::pair(20u, 20u)}) {
            const Picture picture = interlaced_noise(layout, true, width, height);
            const Bytes file = interlaced_file_of(picture);
            for (const uint32_t turn : {0u, 4u, 8u, 12u})
                for (const uint32_t placement : {0x000u, 0x100u, 0x700u})
                    for (const auto &[box_width, box_height] :
                         {std::pair(12, 9), std::pair(9, 12), std::pair(11, 11), std::pair(5, 40)})
                        for (const uint32_t format : written_formats) {
                            const Request request{format, turn | placement, box_width, box_height};
                            ASSERT_EQ(
                                interlaced_difference(picture, file, PELM_SOURCE_MEMORY, request, Call::one_shot, 48),
                                "");
                        }
        }
}

TEST_F(PngInterlacedCentres, stretching_goes_up_and_down) {
    for (const auto &[image_width, image_height] : {std::pair(7u, 5u), std::pair(1u, 1u), std::pair(3u, 9u)})
        for (const Layout layout : {Layout{rgb, 8}, Layout{grey_alpha, 8}, Layout{indexed, 1}, Layout{grey, 8}}) {
            const Picture picture = interlaced_noise(layout, true, image_width, image_height);
            const Bytes file = interlaced_file_of(picture);
            for (int32_t width = 1; width < 30; width += 3)
                for (int32_t height = 1; height < 30; height += quick() ? 7 : 4)
                    for (const uint32_t flags : {0x700u, 0x704u, 0x2708u, 0x370Cu})
                        for (const uint32_t format : {0u, 7u})
                            ASSERT_EQ(interlaced_difference(picture, file, PELM_SOURCE_MEMORY,
                                                            {format, flags, width, height}),
                                      "");
        }
}

TEST_F(PngInterlacedCentres, stretching_to_the_own_size_shows_every_pixel_once) {
    // Blended twice a pixel would come out otherwise.
    for (const Layout layout : all_layouts) {
        const Picture picture = interlaced_noise(layout, true, 13, 9);
        for (const uint32_t format : written_formats) {
            const size_t size = 13 * 9 * pixel_size(format);
            const Bytes file = interlaced_file_of(picture);
            EXPECT_EQ(run(file, PELM_SOURCE_MEMORY, {format, 0x700, 13, 9}, size).output,
                      run(file, PELM_SOURCE_MEMORY, {format, 0, 13, 9}, size).output)
                << picture.described();
        }
    }
}

// 4 x 4 into 2 x 2: the centres lie in columns and rows 1 and 3.
TEST_F(PngInterlacedCentres, half_the_size_shows_the_odd_pixels) {
    Picture picture{4, 4, grey, 8, {}, {}, {}};
    for (uint8_t i = 0; i < 16; ++i)
        picture.rows.push_back(i);
    const Outcome outcome = run(interlaced_file_of(picture), PELM_SOURCE_MEMORY, {1, 0, 2, 2}, 12);
    EXPECT_EQ(outcome.output, (Bytes{5, 5, 5, 7, 7, 7, 13, 13, 13, 15, 15, 15}));
}

TEST_F(PngInterlacedCentres, the_transparent_colour_is_not_written_where_there_is_no_alpha) {
    for (const uint8_t depth : {uint8_t{8}, uint8_t{16}}) {
        Picture picture{8, 8, rgb, depth, {}, {}, {}};
        picture.rows.resize(picture.row_bytes() * 8, 7);
        const uint8_t high = depth == 16 ? 7 : 0;
        picture.transparency = Bytes{high, 7, high, 7, high, 7};
        const Bytes file = interlaced_file_of(picture);
        EXPECT_EQ(run(file, PELM_SOURCE_MEMORY, {0, 0, 4, 4}, 32).output, background(32));
        EXPECT_EQ(run(file, PELM_SOURCE_MEMORY, {1, 0, 4, 4}, 48).output, background(48));
        Bytes expected;
        for (int i = 0; i < 16; ++i)
            expected.insert(expected.end(), {7, 7, 7, 0});
        EXPECT_EQ(run(file, PELM_SOURCE_MEMORY, {7, 0, 4, 4}, 64).output, expected);
    }
}

// 16 x 8 into 8 x 8, turned: scaled 8 x 4, placed 4 x 8 at (2, 0). Columns go up from row 3, so that the columns 4 to 7
// lie above the buffer.
TEST_F(PngInterlacedCentres, rgb565_turned_by_270_starts_at_the_row_of_the_scaled_height) {
    const Picture white{16, 8, rgb, 8, Bytes(16 * 8 * 3, 255), {}, {}};
    for (const uint32_t flags : {0u, PELM_INTERLACE_FRAME + 0u}) {
        const Request request{0, PELM_ROTATE_270 | flags, 8, 8};
        const Outcome outcome = run(interlaced_file_of(white), PELM_SOURCE_MEMORY, request, 128);
        EXPECT_EQ(flaws(outcome), "");
        Bytes expected = background(128);
        for (size_t row = 0; row < 4; ++row)
            for (size_t column = 2; column < 6; ++column)
                expected[(row * 8 + column) * 2] = expected[(row * 8 + column) * 2 + 1] = 255;
        EXPECT_EQ(outcome.output, expected) << flags;
    }
}

TEST_F(PngInterlacedCentres, only_one_value_of_the_flag_asks_for_a_frame) {
    const Picture picture = interlaced_noise({rgb, 8}, false, 40, 40);
    for (const uint32_t flags : {0u, 0x1000u, 0x2000u, 0x3000u}) {
        reset();
        const Request request{7, flags, 10, 10};
        EXPECT_EQ(interlaced_difference(picture, interlaced_file_of(picture), PELM_SOURCE_MEMORY, request), "");
        const auto frames = std::count(host.allocations.begin(), host.allocations.end(), 400u);
        EXPECT_EQ(frames, flags == 0x1000 ? 1 : 0);
    }
}

TEST_F(PngInterlacedCentres, a_strong_reduction_is_no_different) {
    for (const uint32_t side : {28u, 32u, 64u, 200u})
        for (const uint32_t flags : {0u, 0x1000u})
            for (const int32_t box : {8, 7, 1}) {
                const Picture picture = interlaced_noise({rgb, 8}, true, side, side / 2);
                const Request request{7, flags, box, box};
                EXPECT_EQ(interlaced_difference(picture, interlaced_file_of(picture), PELM_SOURCE_STREAM, request), "");
            }
}

} // namespace
} // namespace pelm::test

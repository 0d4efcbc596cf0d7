// Sizes of the seven passes and of their rows.
#include "png/adam7.h"
#include "tests/png/interlaced/passes.h"

namespace pelm::test {
namespace {

struct Counted {
    uint32_t width = 0, height = 0;
};

// Pixels of the pass in the rows and columns where it has any.
Counted counted_pass(uint32_t width, uint32_t height, uint32_t pass) {
    Counted counted;
    for (uint32_t y = 0; y < height; ++y) {
        uint32_t in_row = 0;
        for (uint32_t x = 0; x < width; ++x)
            in_row += pass_of(x, y) == pass ? 1 : 0;
        counted.width = std::max(counted.width, in_row);
        counted.height += in_row > 0 ? 1 : 0;
    }
    return counted;
}

// The pass itself, or the next one with pixels, or 8.
uint32_t found_pass(uint32_t width, uint32_t height, uint32_t pass) {
    while (pass <= 7 && counted_pass(width, height, pass).width == 0)
        ++pass;
    return pass;
}

constexpr uint8_t pixel_sizes[] = {1, 2, 4, 8, 16, 24, 32, 48, 64};

TEST(PngPassGeometry, every_pass_of_every_small_size_is_what_counting_pixels_finds) {
    for (uint32_t width = 1; width <= 17; ++width)
        for (uint32_t height = 1; height <= 17; ++height)
            for (uint32_t pass = 1; pass <= 7; ++pass)
                for (const uint8_t bits : pixel_sizes) {
                    PngDecodeState state{};
                    state.bitsPerPixel = bits;
                    state.interlaceMethod = 1;
                    uint32_t number = pass;
                    const uint32_t bytes = getPassRowBytes(&state, width, height, &number);
                    const uint32_t found = found_pass(width, height, pass);
                    const Counted size = found == 8 ? Counted{width, height} : counted_pass(width, height, found);
                    const std::string what = std::to_string(width) + "x" + std::to_string(height) + ", pass " +
                                             std::to_string(pass) + ", " + std::to_string(bits) + " bits";
                    ASSERT_EQ(number, found) << what;
                    ASSERT_EQ(state.interlaceMethod, found) << what;
                    ASSERT_EQ(state.imageWidth, size.width) << what;
                    ASSERT_EQ(state.imageHeight, size.height) << what;
                    ASSERT_EQ(bytes, (bits * size.width + 7) / 8) << what;
                }
}

TEST(PngPassGeometry, the_rule_of_every_pass_holds_for_large_sizes) {
    const auto rule = [](uint64_t w, uint64_t h, uint32_t pass) -> std::pair<uint64_t, uint64_t> {
        switch (pass) {
        case 1: return {(w + 7) / 8, (h + 7) / 8};
        case 2: return {(w + 3) / 8, (h + 7) / 8};
        case 3: return {(w + 3) / 4, (h + 3) / 8};
        case 4: return {(w + 1) / 4, (h + 3) / 4};
        case 5: return {(w + 1) / 2, (h + 1) / 4};
        case 6: return {w / 2, (h + 1) / 2};
        case 7: return {w, h / 2};
        default: return {w, h};
        }
    };
    for (const uint32_t width : {18u, 255u, 256u, 65535u, 1000003u, 0x7FFFFFFFu})
        for (const uint32_t height : {18u, 257u, 65536u, 1000001u, 0x7FFFFFFFu})
            for (uint32_t pass = 1; pass <= 9; ++pass) {
                PngDecodeState state{};
                state.bitsPerPixel = 8;
                uint32_t number = pass;
                const uint32_t bytes = getPassRowBytes(&state, width, height, &number);
                const auto [w, h] = rule(width, height, pass);
                EXPECT_EQ(number, pass);
                EXPECT_EQ(state.imageWidth, w) << pass;
                EXPECT_EQ(state.imageHeight, h) << pass;
                EXPECT_EQ(bytes, w) << pass;
            }
}

TEST(PngPassGeometry, a_single_pixel_goes_from_pass_2_to_pass_8) {
    PngDecodeState state{};
    state.bitsPerPixel = 64;
    uint32_t pass = 1;
    EXPECT_EQ(getPassRowBytes(&state, 1, 1, &pass), 8u);
    EXPECT_EQ(pass, 1u);
    pass = 2;
    EXPECT_EQ(getPassRowBytes(&state, 1, 1, &pass), 8u);
    EXPECT_EQ(pass, 8u);
    EXPECT_EQ(state.interlaceMethod, 8);
    EXPECT_EQ(state.imageWidth, 1u);
    EXPECT_EQ(state.imageHeight, 1u);
}

TEST(PngPassGeometry, three_pixels_in_a_row_take_the_passes_1_4_and_6) {
    PngDecodeState state{};
    state.bitsPerPixel = 8;
    std::vector<uint32_t> passes;
    for (uint32_t pass = 1; pass < 8; ++pass) {
        getPassRowBytes(&state, 3, 1, &pass);
        passes.push_back(pass);
    }
    EXPECT_EQ(passes, (std::vector<uint32_t>{1, 4, 6, 8}));
    EXPECT_EQ(state.imageWidth, 3u);
}

TEST(PngPassGeometry, numbers_behind_the_passes_stand_for_the_whole_image) {
    PngDecodeState state{};
    state.bitsPerPixel = 24;
    for (const uint32_t number : {8u, 9u, 100u}) {
        uint32_t pass = number;
        EXPECT_EQ(getPassRowBytes(&state, 5, 3, &pass), 15u);
        EXPECT_EQ(pass, number);
        EXPECT_EQ(state.imageWidth, 5u);
        EXPECT_EQ(state.imageHeight, 3u);
    }
}

// The builder of the files and the map of the passes come from different places.
TEST(PngPassGeometry, the_builder_of_test_files_and_the_map_of_the_passes_agree) {
    for (uint32_t width = 1; width <= 17; ++width)
        for (uint32_t height = 1; height <= 17; ++height)
            for (const Layout layout : {Layout{grey, 1}, Layout{rgb_alpha, 16}}) {
                const Picture picture = noise_picture(layout.colour_type, layout.depth, width, height);
                size_t bytes = 0;
                for (const PassRow &row : pass_rows_of(picture))
                    bytes += row.bytes;
                EXPECT_EQ(scanlines_of(interlaced_png_of(picture)).size(), bytes) << picture.described();
            }
}

} // namespace
} // namespace pelm::test

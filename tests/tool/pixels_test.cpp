// The nine pixel formats in the tool: names, codes, and colours there and back.
#include "tools/pixels.h"

#include <cstring>
#include <vector>

#include <gtest/gtest.h>

#include "PelmImageDecoder.h"

namespace pelm_tool {
namespace {

TEST(ToolPixels, have_the_codes_of_their_names) {
    const struct {
        const char *name;
        uint32_t code;
        size_t bytes;
    } cases[] = {{"rgb565", 0, 2}, {"rgb", 1, 3},     {"argb", 5, 4}, {"rgb565a", 6, 3}, {"rgba", 7, 4},
                 {"bgra", 8, 4},   {"bgr565", 10, 2}, {"bgr", 11, 3}, {"bgrx", 12, 4}};
    EXPECT_EQ(std::size(cases), pixel_formats().size());
    for (const auto &one : cases) {
        const PixelFormat *const format = find_pixel_format(one.name);
        ASSERT_NE(format, nullptr) << one.name;
        EXPECT_EQ(format->code, one.code) << one.name;
        EXPECT_EQ(format->bytes, one.bytes) << one.name;
    }
    EXPECT_EQ(find_pixel_format("cmyk"), nullptr);
}

TEST(ToolPixels, come_back_as_they_were_stored) {
    for (const PixelFormat &format : pixel_formats()) {
        for (const Rgba colour : {Rgba{255, 0, 0, 255}, Rgba{0, 255, 0, 255}, Rgba{0, 0, 255, 255},
                                  Rgba{255, 255, 255, 255}, Rgba{0, 0, 0, 255}, Rgba{255, 0, 255, 0}}) {
            uint8_t pixel[4] = {};
            format.store(pixel, colour);
            const Rgba back = format.load(pixel);
            EXPECT_EQ(back.r, colour.r) << format.name;
            EXPECT_EQ(back.g, colour.g) << format.name;
            EXPECT_EQ(back.b, colour.b) << format.name;
            EXPECT_EQ(back.a, format.has_alpha ? colour.a : 255) << format.name;
        }
    }
}

TEST(ToolPixels, lie_in_memory_in_the_order_of_their_names) {
    const Rgba colour = {1, 2, 3, 4};
    const struct {
        const char *name;
        std::vector<uint8_t> bytes;
    } cases[] = {{"rgb", {1, 2, 3}},     {"argb", {4, 1, 2, 3}}, {"rgba", {1, 2, 3, 4}},
                 {"bgra", {3, 2, 1, 4}}, {"bgr", {3, 2, 1}},     {"bgrx", {3, 2, 1, 255}}};
    for (const auto &one : cases) {
        std::vector<uint8_t> pixel(one.bytes.size());
        find_pixel_format(one.name)->store(pixel.data(), colour);
        EXPECT_EQ(pixel, one.bytes) << one.name;
    }
}

TEST(ToolPixels, of_16_bits_repeat_their_high_bits_below) {
    const uint16_t value = 0x8410; // 16, 32, 16
    uint8_t pixel[2];
    std::memcpy(pixel, &value, sizeof pixel);
    const Rgba colour = find_pixel_format("rgb565")->load(pixel);
    EXPECT_EQ(colour.r, 132);
    EXPECT_EQ(colour.g, 130);
    EXPECT_EQ(colour.b, 132);
}

} // namespace
} // namespace pelm_tool

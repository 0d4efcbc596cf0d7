// What a decoder knows of one pixel. A pixel type answers three questions, each by an overload of the functions here:
// its 8-bit channels, its alpha, and its RGB565 value. Source layouts whose answers deviate bring their own type.
#pragma once

#include <cstdint>

namespace pelm {

struct Rgb {
    uint8_t r, g, b;
};

constexpr Rgb channels_of(Rgb pixel) {
    return pixel;
}

constexpr uint16_t rgb565_of(Rgb pixel) {
    return static_cast<uint16_t>((pixel.r >> 3) << 11 | (pixel.g >> 2) << 5 | pixel.b >> 3);
}

template <class Pixel>
constexpr uint8_t alpha_of(Pixel) {
    return 255;
}

// The 16-bit half of a PELM_FORMAT_RGB565_A8 pixel.
template <class Pixel>
constexpr uint16_t rgb565_with_alpha_of(Pixel pixel) {
    return rgb565_of(pixel);
}

} // namespace pelm

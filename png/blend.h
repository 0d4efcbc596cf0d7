// Pixels with an alpha, and pixels that a colour key makes transparent: how they go over what is in the buffer where
// the format has no alpha of its own.
#pragma once

#include "frame/export.h"
#include "frame/stores.h"

// An RGB565 pixel blended over another one: weights alpha + 1 and 256 - alpha, channels widened with zeros.
PELM_EXPORT uint16_t APPLY_ALPHA_RGB_TO_SHORT(uint32_t red, uint32_t green, uint32_t blue, uint32_t alpha,
                                              uint32_t oldPixel);

// The same for one 8-bit channel.
PELM_EXPORT uint8_t APPLY_ALPHA_BYTE_TO_BYTE(uint32_t source, uint32_t alpha, uint32_t destination);

namespace pelm {

constexpr uint8_t blend_byte(uint32_t source, uint32_t alpha, uint32_t old) {
    return static_cast<uint8_t>(((source * alpha + source) >> 8) + ((old * (256 - alpha)) >> 8));
}

// The channels of an RGB565 value, their missing low bits zeros.
constexpr Rgb widened_rgb565(uint32_t value) {
    return {static_cast<uint8_t>((value >> 11) << 3), static_cast<uint8_t>((value >> 5 & 63) << 2),
            static_cast<uint8_t>((value & 31) << 3)};
}

constexpr uint16_t blend_rgb565(Rgb over, uint32_t alpha, uint32_t old) {
    const Rgb under = widened_rgb565(old);
    return rgb565_of(Rgb{blend_byte(over.r, alpha, under.r), blend_byte(over.g, alpha, under.g),
                         blend_byte(over.b, alpha, under.b)});
}

struct Rgba {
    uint8_t r, g, b, a;
};

constexpr Rgb channels_of(Rgba pixel) {
    return {pixel.r, pixel.g, pixel.b};
}

constexpr uint8_t alpha_of(Rgba pixel) {
    return pixel.a;
}

constexpr uint16_t rgb565_of(Rgba pixel) {
    return rgb565_of(channels_of(pixel));
}

inline void put_rgb565(uint8_t *at, Rgba pixel) {
    store_u16(at, blend_rgb565(channels_of(pixel), pixel.a, load_u16(at)));
}

inline void put_rgb888(uint8_t *at, Rgba pixel) {
    at[0] = blend_byte(pixel.r, pixel.a, at[0]);
    at[1] = blend_byte(pixel.g, pixel.a, at[1]);
    at[2] = blend_byte(pixel.b, pixel.a, at[2]);
}

// A pixel that matches the colour key keeps its colour where the format has alpha, with alpha 0, and is not written
// where it has none.
struct KeyedRgb {
    Rgb colour;
    bool matches;
};

constexpr Rgb channels_of(KeyedRgb pixel) {
    return pixel.colour;
}

constexpr uint8_t alpha_of(KeyedRgb pixel) {
    return pixel.matches ? 0 : 255;
}

constexpr uint16_t rgb565_of(KeyedRgb pixel) {
    return rgb565_of(pixel.colour);
}

inline void put_rgb565(uint8_t *at, KeyedRgb pixel) {
    if (!pixel.matches) put_rgb565(at, pixel.colour);
}

inline void put_rgb888(uint8_t *at, KeyedRgb pixel) {
    if (!pixel.matches) put_rgb888(at, pixel.colour);
}

} // namespace pelm

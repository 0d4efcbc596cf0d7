// Reduction by four samples that count by their alpha.
//
// A word holds R, G, B, A from the high byte down, colours multiplied by alpha / 255. Sample k of the four adds (c + k)
// >> 2 per channel, so that four equal samples sum to exactly themselves.
#pragma once

#include <algorithm>

#include "png/blend.h"

namespace pelm {

constexpr uint32_t times_alpha(uint32_t channel, uint32_t alpha) {
    return (channel * alpha + 127) / 255;
}

constexpr uint32_t packed(Rgba c) {
    return static_cast<uint32_t>(c.r) << 24 | static_cast<uint32_t>(c.g) << 16 | static_cast<uint32_t>(c.b) << 8 | c.a;
}

constexpr Rgba unpacked(uint32_t word) {
    return {static_cast<uint8_t>(word >> 24), static_cast<uint8_t>(word >> 16), static_cast<uint8_t>(word >> 8),
            static_cast<uint8_t>(word)};
}

template <class Pixel>
constexpr uint32_t weighted_word(Pixel pixel) {
    const Rgb c = channels_of(pixel);
    const uint8_t a = alpha_of(pixel);
    if (a == 255) return packed({c.r, c.g, c.b, a});
    return times_alpha(c.r, a) << 24 | times_alpha(c.g, a) << 16 | times_alpha(c.b, a) << 8 | a;
}

// (c + k) >> 2 in each of the four bytes.
constexpr uint32_t share(uint32_t word, uint32_t k) {
    constexpr uint32_t even_bytes = 0x00FF00FF;
    const uint32_t each = k * 0x00010001;
    return (((word & even_bytes) + each) >> 2 & even_bytes) | (((word >> 8 & even_bytes) + each) >> 2 & even_bytes)
                                                                  << 8;
}

// A row of complete words, as pixels with their colour at full strength again.
struct WeightedRow {
    const uint32_t *words;

    Rgba operator()(int32_t x) const { return at(static_cast<size_t>(x)); }

    static uint8_t full_strength(uint32_t channel, uint32_t alpha) {
        return static_cast<uint8_t>(std::min((channel * 255 + alpha / 2) / alpha, 255u));
    }
    Rgba at(size_t x) const {
        const Rgba c = unpacked(words[x]);
        const uint32_t alpha = c.a;
        if (alpha == 0 || alpha == 255) return c;
        return {full_strength(c.r, alpha), full_strength(c.g, alpha), full_strength(c.b, alpha), c.a};
    }
};

} // namespace pelm

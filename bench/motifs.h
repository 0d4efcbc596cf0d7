// What the pictures show: the kinds that compress differently, each computed pixel by pixel at any size.
#pragma once

#include <cstdint>

namespace bench {

enum class Motif {
    photo,        // gradients and shapes under sensor noise
    screenshot,   // flat areas, frames and lines of text
    illustration, // smooth shapes with soft edges; transparent around them where there is alpha
    text          // a printed page
};

struct Pixel {
    int r, g, b, a; // 0 to 255
};

Pixel pixel_of(Motif motif, uint32_t x, uint32_t y);

// Noise that is always the same.
uint32_t scrambled(uint32_t seed);

} // namespace bench

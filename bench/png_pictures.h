// Large PNGs made at start, so that the benchmark needs no files: pictures of the kinds that compress differently, in
// the ways that PNG stores them, written by libpng with its default settings.
#pragma once

#include <cstdint>
#include <vector>

namespace bench {

enum class Motif {
    photo,        // gradients and shapes under sensor noise
    screenshot,   // flat areas, frames and lines of text
    illustration, // smooth shapes with soft edges; transparent around them where there is alpha
    text          // a page of letters
};

enum class Stored { rgb, rgba, grey, palette, rgb16, grey1 };

// The pixels of row `y` as red, green and blue.
std::vector<uint8_t> rgb_row(Motif motif, uint32_t y, uint32_t first_x, uint32_t width);

// Empty when libpng cannot write it.
std::vector<uint8_t> png_picture(Motif motif, Stored stored, uint32_t width, uint32_t height);

} // namespace bench

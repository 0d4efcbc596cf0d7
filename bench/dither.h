// True colours as indices of the palette that all pictures share: 3, 3 and 2 bits of red, green and blue.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "bench/motifs.h"

namespace bench {

struct Colour {
    uint8_t r, g, b;
};

Colour colour_of(uint8_t index);

uint8_t nearest_index(Pixel pixel);

// Floyd and Steinberg's error diffusion, row after row from the top: the indices of photographs as tools write them.
class Dither {
public:
    explicit Dither(uint32_t width) : errors_(3 * (size_t{width} + 2)) {}

    // The pixels of the next row, from left to right.
    uint8_t index_of(uint32_t x, Pixel pixel);

private:
    std::vector<int> errors_; // in sixteenths: up to here of the next row, from here on of this one
    int left_[3] = {};        // of the pixel before
};

} // namespace bench

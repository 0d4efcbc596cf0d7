// Writes PNGs into memory through libpng, with its default compression and filters.
#pragma once

#include <cstdint>
#include <functional>
#include <vector>

namespace bench {

struct PngLayout {
    int colour_type; // as PNG counts them
    int depth;
    bool interlaced = false;
    bool small_blocks = false; // codes of their own for every hundred symbols or so

    bool has_colour() const { return (colour_type & 2) != 0; }
    bool has_alpha() const { return (colour_type & 4) != 0; }
};

// `fill_row` appends the bytes of row y to an empty row. Palettes hold the colours of bench/dither.h. Empty when libpng
// fails.
std::vector<uint8_t> write_png(uint32_t width, uint32_t height, PngLayout layout,
                               const std::function<void(uint32_t y, std::vector<uint8_t> &row)> &fill_row);

} // namespace bench

// Writes PNGs into memory through libpng, with its default compression and filters.
#pragma once

#include <cstdint>
#include <functional>
#include <vector>

namespace bench {

struct PngLayout {
    int colour_type;
    int depth;
};

// `fill_row` appends the bytes of row y to an empty row. Palettes are of 3, 3 and 2 bits of red, green and blue. Empty
// when libpng fails.
std::vector<uint8_t> write_png(uint32_t width, uint32_t height, PngLayout layout,
                               const std::function<void(uint32_t y, std::vector<uint8_t> &row)> &fill_row);

} // namespace bench

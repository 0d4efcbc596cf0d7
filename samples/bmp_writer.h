// Writes BMP files with 40-byte headers.
#pragma once

#include <string>

#include "samples/picture.h"

namespace pelm_samples {

struct BmpContents {
    int width;
    int height;
    int bits;
    bool top_down = false;
    std::vector<Colour> palette = {};
    std::vector<uint32_t> masks = {};  // red, green, blue; empty: none
    std::vector<uint32_t> values = {}; // stored pixels from the top left
};

bool write_bmp(const std::string &path, const BmpContents &contents); // false: failed

} // namespace pelm_samples

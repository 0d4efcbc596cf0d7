// Writes PNG files of 8 bits per sample.
#pragma once

#include <string>

#include "samples/picture.h"

namespace pelm_samples {

enum class PngColour : uint8_t { grey = 0, rgb = 2, palette = 3, rgb_alpha = 6 };

struct PngContents {
    int width;
    int height;
    PngColour colour;
    std::vector<uint8_t> samples;     // from the top left
    std::vector<Colour> palette = {}; // of a palette image
    std::vector<uint8_t> alphas = {}; // of the palette's first colours
    size_t longest_chunk = 1u << 30;  // bytes of image data per chunk
};

bool write_png(const std::string &path, const PngContents &contents); // false: failed

} // namespace pelm_samples

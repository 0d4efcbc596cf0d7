// Large BMPs made at start, so that the benchmark needs no files.
#pragma once

#include <cstdint>
#include <vector>

namespace bench {

// A photo-like picture (gradients, shapes and noise) of the given depth: 1, 4, 8, 16 (5-6-5 bit fields), 24 or 32.
std::vector<uint8_t> photo_bmp(int32_t width, int32_t height, int32_t bits_per_pixel);

} // namespace bench

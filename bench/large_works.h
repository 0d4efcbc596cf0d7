// The large pictures that several benchmarks decode, each made once.
#pragma once

#include "bench/output.h"
#include "bench/work.h"

namespace bench {

inline constexpr Box large_box = {4000, 3000};
inline constexpr Box hd_box = {1920, 1080};

SharedWork png_photo_rgb();     // of the large box
SharedWork png_photo_palette(); // dithered
SharedWork png_photo_adam7();
SharedWork bmp_of_depth(int32_t bits_per_pixel); // 1, 4, 8, 16, 24 or 32
SharedWork gif_photo_hd();
SharedWork gif_screenshot_hd();

} // namespace bench

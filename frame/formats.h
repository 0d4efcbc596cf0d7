// Which output formats the full-colour decoders write, and how wide their pixels are.
#pragma once

#include <cstdint>

#include "PelmImageDecoder.h"

namespace pelm {

// 0 for a code that is not written.
constexpr int32_t bytes_per_pixel(uint32_t format) {
    switch (format) {
    case PELM_FORMAT_RGB565: return 2;
    case PELM_FORMAT_RGB888: return 3;
    case PELM_FORMAT_RGB565_A8: return 3;
    case PELM_FORMAT_ARGB8888: return 4;
    case PELM_FORMAT_RGBA8888: return 4;
    case PELM_FORMAT_BGRA8888: return 4;
    default: return 0;
    }
}

// Pixel steps of RGB565 count 16-bit units, those of all other formats bytes.
constexpr int32_t pixel_step_unit(uint32_t format) {
    return format == PELM_FORMAT_RGB565 ? 2 : 1;
}

constexpr int64_t pixel_step_bytes(int32_t pixel_step, uint32_t format) {
    return int64_t{pixel_step} * pixel_step_unit(format);
}

} // namespace pelm

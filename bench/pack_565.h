// Rows of 8 bits per channel to RGB565, as hosts of the peers have to do it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace bench {

inline uint16_t packed_565(uint32_t r, uint32_t g, uint32_t b) {
    return static_cast<uint16_t>((r >> 3) << 11 | (g >> 2) << 5 | b >> 3);
}

inline void pack_rgb_row(const uint8_t *rgb, size_t width, uint8_t *output) {
    for (size_t x = 0; x < width; ++x, rgb += 3, output += 2) {
        const uint16_t value = packed_565(rgb[0], rgb[1], rgb[2]);
        std::memcpy(output, &value, sizeof value);
    }
}

// Over what the output holds.
inline void blend_rgba_row(const uint8_t *rgba, size_t width, uint8_t *output) {
    for (size_t x = 0; x < width; ++x, rgba += 4, output += 2) {
        const uint32_t alpha = rgba[3];
        if (alpha == 0) continue;
        uint16_t value = 0;
        std::memcpy(&value, output, sizeof value);
        const uint32_t old = value;
        const auto mix = [&](uint32_t over, uint32_t under) {
            return (over * (alpha + 1) + under * (255 - alpha)) >> 8;
        };
        if (alpha == 255) {
            value = packed_565(rgba[0], rgba[1], rgba[2]);
        } else {
            value = packed_565(mix(rgba[0], old >> 11 << 3), mix(rgba[1], old >> 5 << 2 & 255),
                               mix(rgba[2], old << 3 & 255));
        }
        std::memcpy(output, &value, sizeof value);
    }
}

} // namespace bench

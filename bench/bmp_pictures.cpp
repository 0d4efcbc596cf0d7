#include "bench/bmp_pictures.h"

#include <cmath>

namespace bench {
namespace {

void append(std::vector<uint8_t> &bytes, uint32_t value, int32_t count) {
    for (int32_t i = 0; i < count; ++i)
        bytes.push_back(static_cast<uint8_t>(value >> (8 * i)));
}

// One channel of the picture: a slow gradient with a ripple and sensor-like noise.
uint8_t shade(int32_t x, int32_t y, double phase, uint32_t &noise) {
    noise = noise * 1664525 + 1013904223;
    const double ripple = 80 * std::sin(x * 0.004 + phase) + 40 * std::sin(y * 0.011 + phase);
    const int32_t value = 128 + static_cast<int32_t>(ripple) + static_cast<int32_t>(noise >> 28) - 8;
    return static_cast<uint8_t>(value < 0 ? 0 : value > 255 ? 255 : value);
}

uint32_t headers_behind(int32_t bits_per_pixel) {
    if (bits_per_pixel <= 8) return 4u << bits_per_pixel;
    return bits_per_pixel == 16 ? 12 : 0;
}

void append_headers(std::vector<uint8_t> &bytes, int32_t width, int32_t height, int32_t bits_per_pixel) {
    const uint32_t offset = 54 + headers_behind(bits_per_pixel);
    bytes.push_back('B');
    bytes.push_back('M');
    append(bytes, 0, 8);
    append(bytes, offset, 4);
    append(bytes, 40, 4);
    append(bytes, static_cast<uint32_t>(width), 4);
    append(bytes, static_cast<uint32_t>(height), 4);
    append(bytes, 1, 2);
    append(bytes, static_cast<uint32_t>(bits_per_pixel), 2);
    append(bytes, bits_per_pixel == 16 ? 3 : 0, 4);
    append(bytes, 0, 20);
    if (bits_per_pixel <= 8)
        for (uint32_t i = 0; i < 1u << bits_per_pixel; ++i)
            append(bytes, i * 0x01050301u, 4);
    if (bits_per_pixel == 16)
        for (const uint32_t mask : {0xF800u, 0x07E0u, 0x001Fu})
            append(bytes, mask, 4);
}

} // namespace

std::vector<uint8_t> photo_bmp(int32_t width, int32_t height, int32_t bits_per_pixel) {
    std::vector<uint8_t> bytes;
    append_headers(bytes, width, height, bits_per_pixel);
    const size_t stride = (static_cast<size_t>(width) * static_cast<size_t>(bits_per_pixel) + 31) / 32 * 4;
    const size_t start = bytes.size();
    bytes.resize(start + stride * static_cast<size_t>(height));
    uint32_t noise = 1;
    for (int32_t y = 0; y < height; ++y) {
        uint8_t *const row = bytes.data() + start + stride * static_cast<size_t>(y);
        for (size_t i = 0; i < stride; ++i)
            row[i] = shade(static_cast<int32_t>(i), y, static_cast<double>(i % 3), noise);
    }
    return bytes;
}

} // namespace bench

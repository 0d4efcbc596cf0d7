#include "tests/tool/stored_pixels.h"

#include <cstdlib>

namespace pelm::test {
namespace {

uint32_t little_endian(const Bytes &bytes, size_t at, size_t count) {
    uint32_t value = 0;
    for (size_t i = 0; i < count; ++i)
        value |= uint32_t{bytes[at + i]} << 8 * i;
    return value;
}

// The bits of `mask` in `value`, moved to the top of 8 bits.
uint32_t channel(uint32_t value, uint32_t mask) {
    uint32_t bits = value & mask;
    while ((mask & 0x80000000u) == 0) {
        mask <<= 1;
        bits <<= 1;
    }
    return bits >> 24;
}

uint32_t opaque(uint32_t rgb) {
    return rgb << 8 | 255;
}

struct Reader {
    const Bytes &bmp;
    size_t bits;
    uint32_t masks[3];

    uint32_t colour(size_t row, size_t x) const {
        if (bits >= 24) return opaque(little_endian(bmp, row + x * bits / 8, 3));
        if (bits == 16) {
            const uint32_t value = little_endian(bmp, row + 2 * x, 2);
            return opaque(channel(value, masks[0]) << 16 | channel(value, masks[1]) << 8 | channel(value, masks[2]));
        }
        const size_t first_bit = x * bits;
        const size_t index = bmp[row + first_bit / 8] >> (8 - bits - first_bit % 8) & ((1u << bits) - 1);
        return opaque(little_endian(bmp, 54 + 4 * index, 3));
    }
};

} // namespace

Image stored_image(const Bytes &bmp) {
    Reader reader{bmp, little_endian(bmp, 28, 2), {0x7C00, 0x03E0, 0x001F}};
    if (little_endian(bmp, 30, 4) == 3) {
        for (size_t i = 0; i < 3; ++i)
            reader.masks[i] = little_endian(bmp, 54 + 4 * i, 4);
    }
    const int32_t stored_height = static_cast<int32_t>(little_endian(bmp, 22, 4));
    Image image{little_endian(bmp, 18, 4), static_cast<size_t>(std::abs(stored_height)), {}, false};
    const size_t stride = (image.width * reader.bits + 31) / 32 * 4;
    for (size_t y = 0; y < image.height; ++y) {
        const size_t row = stored_height < 0 ? y : image.height - 1 - y;
        for (size_t x = 0; x < image.width; ++x)
            image.pixels.push_back(reader.colour(little_endian(bmp, 10, 4) + row * stride, x));
    }
    return image;
}

Image stored_wbmp_image(const Bytes &wbmp) {
    size_t at = 2;
    const auto integer = [&] {
        size_t value = 0;
        do
            value = value * 128 + wbmp[at] % 128;
        while (wbmp[at++] >= 128);
        return value;
    };
    const size_t width = integer();
    Image image{width, integer(), {}, false};
    const size_t stride = (image.width + 7) / 8;
    for (size_t y = 0; y < image.height; ++y) {
        for (size_t x = 0; x < image.width; ++x)
            image.pixels.push_back((wbmp[at + y * stride + x / 8] >> (7 - x % 8) & 1) != 0 ? 0xFFFFFFFF : 0x000000FF);
    }
    return image;
}

} // namespace pelm::test

#include "bench/dither.h"

#include <algorithm>

namespace bench {
namespace {

uint8_t level(int value, int most) {
    return static_cast<uint8_t>((std::clamp(value, 0, 255) * most + 127) / 255);
}

} // namespace

Colour colour_of(uint8_t index) {
    const auto part = [index](int shift, int most) {
        return static_cast<uint8_t>((index >> shift & most) * 255 / most);
    };
    return {part(5, 7), part(2, 7), part(0, 3)};
}

uint8_t nearest_index(Pixel pixel) {
    return static_cast<uint8_t>(level(pixel.r, 7) << 5 | level(pixel.g, 7) << 2 | level(pixel.b, 3));
}

uint8_t Dither::index_of(uint32_t x, Pixel pixel) {
    int *const before = &errors_[3 * size_t{x}]; // of the pixel x - 1; those of x and x + 1 follow
    int *const at = before + 3;
    if (x == 0) std::fill(left_, left_ + 3, 0);
    const auto wanted = [&](int channel, int value) { return value + (at[channel] + 7 * left_[channel]) / 16; };
    const Pixel sought = {wanted(0, pixel.r), wanted(1, pixel.g), wanted(2, pixel.b), 255};
    const uint8_t index = nearest_index(sought);
    const Colour got = colour_of(index);
    const int errors[3] = {sought.r - got.r, sought.g - got.g, sought.b - got.b};
    for (int i = 0; i < 3; ++i) {
        before[i] += 3 * errors[i];
        at[i] = 5 * errors[i] + left_[i];
        left_[i] = errors[i];
    }
    return index;
}

} // namespace bench

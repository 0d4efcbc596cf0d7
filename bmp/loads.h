// One pixel out of a stored row, for each of the layouts that a BMP has, and what scaled output makes of it.
//
// Each load also names its `bits` per pixel and its `Sum`: the accumulator word that four samples of the layout are
// added into, which is itself a pixel once it is complete.
#pragma once

#include <cstddef>

#include "bmp/masked_lanes.h"
#include "frame/bytes.h"
#include "frame/packed.h"
#include "frame/pixel.h"
#include "frame/swizzle.h"

namespace pelm {

// Sums of four samples in 10 bits a channel: blue, green, red from the low end.
struct TenBitSums {
    uint32_t word;
    static constexpr uint32_t of(Rgb sample) {
        return static_cast<uint32_t>(sample.b) | static_cast<uint32_t>(sample.g) << 10 |
               static_cast<uint32_t>(sample.r) << 20;
    }
};

constexpr Rgb channels_of(TenBitSums sums) {
    return {static_cast<uint8_t>(sums.word >> 22), static_cast<uint8_t>(sums.word >> 12),
            static_cast<uint8_t>(sums.word >> 2)};
}

constexpr uint16_t rgb565_of(TenBitSums sums) {
    return static_cast<uint16_t>((sums.word >> 25) << 11 | ((sums.word >> 14) & 63) << 5 | ((sums.word >> 5) & 31));
}

// Required: scaled output exchanges red and blue in this format, except from 32 bits per pixel (docs/oddities.md,
// "Scaled RGB565 with alpha").
constexpr uint16_t rgb565_with_alpha_of(TenBitSums sums) {
    return static_cast<uint16_t>(((sums.word >> 5) & 31) << 11 | ((sums.word >> 14) & 63) << 5 | sums.word >> 25);
}

// Sums of four quarters in a byte a channel: blue, green, red, and the unused fourth byte.
// Required: each sample is divided before it is added, so that white becomes 252 (docs/oddities.md, "Scaled 32-bit
// images").
struct QuarterSums {
    uint32_t word;
};

constexpr Rgb channels_of(QuarterSums sums) {
    return {static_cast<uint8_t>(sums.word >> 16), static_cast<uint8_t>(sums.word >> 8),
            static_cast<uint8_t>(sums.word)};
}

constexpr uint16_t rgb565_of(QuarterSums sums) {
    return static_cast<uint16_t>((sums.word & 0xF80000) >> 8 | (sums.word & 0xFC00) >> 5 | ((sums.word >> 3) & 31));
}

// A row of finished accumulator words.
template <class Sums>
struct SumsRow {
    const uint32_t *row;
    Sums operator()(int32_t x) const { return {row[x]}; }
};

template <int32_t depth>
struct IndexedRow {
    using Sum = TenBitSums;
    static constexpr uint32_t bits = depth;
    const uint8_t *row;
    const uint8_t *palette; // blue, green, red, reserved; 256 entries

    Rgb operator()(int32_t x) const {
        const uint8_t *const entry = palette + 4 * packed_sample<depth>(row, x);
        return {entry[2], entry[1], entry[0]};
    }
    uint32_t sample(int32_t x) const { return Sum::of((*this)(x)); }
};

// A 16-bit pixel, its colours shifted to their places in an RGB565 value.
struct Fields565 {
    uint32_t r, g, b;
};

constexpr uint16_t rgb565_of(Fields565 pixel) {
    return static_cast<uint16_t>(pixel.r | pixel.g | pixel.b);
}

// Narrow channels are widened with zeros: 31 becomes 248.
constexpr Rgb channels_of(Fields565 pixel) {
    return {static_cast<uint8_t>(pixel.r >> 8), static_cast<uint8_t>(pixel.g >> 3), static_cast<uint8_t>(pixel.b << 3)};
}

struct MaskedRow {
    using Sum = TenBitSums;
    static constexpr uint32_t bits = 16;
    const uint8_t *row;
    uint32_t red_mask, green_mask, blue_mask;
    uint32_t red_shift, green_shift, blue_shift; // below 32

    Fields565 operator()(int32_t x) const {
        const uint32_t pixel = read_u16le(row + 2 * ptrdiff_t{x});
        return {(pixel & red_mask) << red_shift, (pixel & green_mask) << green_shift,
                (pixel & blue_mask) << blue_shift};
    }
    uint32_t sample(int32_t x) const { return Sum::of(channels_of((*this)(x))); }

    template <class Store>
    requires(Store::size != 3) int32_t write_some(int32_t from, int32_t count, uint8_t *out)
    const { return write_masked_lanes<Store>(*this, row + 2 * ptrdiff_t{from}, count, out); }
};

struct Bgr24Row {
    using Sum = TenBitSums;
    static constexpr uint32_t bits = 24;
    static constexpr ChannelBytes channels = {3, 2, 1, 0, ChannelBytes::none};
    const uint8_t *row;

    Rgb operator()(int32_t x) const {
        const uint8_t *const at = row + 3 * ptrdiff_t{x};
        return {at[2], at[1], at[0]};
    }
    uint32_t sample(int32_t x) const { return Sum::of((*this)(x)); }
};

struct Bgrx32Row {
    using Sum = QuarterSums;
    static constexpr uint32_t bits = 32;
    static constexpr ChannelBytes channels = {4, 2, 1, 0, ChannelBytes::none}; // the fourth byte is no alpha
    const uint8_t *row;

    Rgb operator()(int32_t x) const {
        const uint8_t *const at = row + 4 * ptrdiff_t{x};
        return {at[2], at[1], at[0]};
    }
    uint32_t sample(int32_t x) const { return (read_u32le(row + 4 * ptrdiff_t{x}) >> 2) & 0x3F3F3F3F; }
};

} // namespace pelm

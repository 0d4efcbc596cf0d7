// Pixels of 16 bits, eight at a time: the vector form of MaskedRow (bmp/loads.h), which is the definition.
#pragma once

#include <cstddef>

#include "frame/lanes.h"
#include "frame/processor.h"
#include "frame/swizzle.h"

namespace pelm {

#ifdef PELM_HAS_LANES

using Words8 = uint16_t __attribute__((vector_size(16)));

struct Places565 {
    Words8 r, g, b; // at their places in RGB565 values
};

// What a shift moves out of 16 bits is part of no channel.
inline Words8 moved(Words8 pixels, uint32_t mask, uint32_t shift) {
    return shift < 16 ? (pixels & static_cast<uint16_t>(mask)) << static_cast<uint16_t>(shift) : Words8{};
}

inline Words8 last_half(Words8 words) {
    return std::bit_cast<Words8>(move_down<8>(std::bit_cast<Bytes16>(words)));
}

// Eight pixels of four bytes, their channels where `to` says.
template <ChannelBytes to>
inline void store_words(uint8_t *out, const Places565 &pixels) {
    Words8 pairs[2] = {}; // the first two bytes of each pixel, and the last two
    const auto put = [&](uint8_t place, Words8 bytes) {
        pairs[place / 2] |= bytes << static_cast<uint16_t>(place % 2 * 8);
    };
    put(to.red, pixels.r >> 8);
    put(to.green, pixels.g >> 3 & 0xFF);
    put(to.blue, pixels.b << 3 & 0xFF);
    put(to.alpha, Words8{} + 0xFF);
    const auto first = join_words<2>(pairs[0], pairs[1]);
    const auto last = join_words<2>(last_half(pairs[0]), last_half(pairs[1]));
    std::memcpy(out, &first, 16);
    std::memcpy(out + 16, &last, 16);
}

// Writes as many of `count` pixels from `bytes` on as it can, and returns how many.
template <class Store, class Row>
int32_t write_masked_lanes(const Row &masks, const uint8_t *bytes, int32_t count, uint8_t *out) {
    if (count < 8 || kernels() < Kernels::lanes) return 0;
    const int32_t groups = count / 8;
    for (int32_t i = 0; i < groups; ++i, bytes += 16, out += 8 * Store::size) {
        Words8 row;
        std::memcpy(&row, bytes, sizeof row);
        const Places565 pixels = {moved(row, masks.red_mask, masks.red_shift),
                                  moved(row, masks.green_mask, masks.green_shift),
                                  moved(row, masks.blue_mask, masks.blue_shift)};
        if constexpr (Store::swizzle_to == SwizzleTo::rgb565) {
            const Words8 values = pixels.r | pixels.g | pixels.b;
            std::memcpy(out, &values, sizeof values);
        } else {
            store_words<Store::channels>(out, pixels);
        }
    }
    return 8 * groups;
}

#else

template <class Store, class Row>
int32_t write_masked_lanes(const Row &, const uint8_t *, int32_t, uint8_t *) {
    return 0;
}

#endif

} // namespace pelm

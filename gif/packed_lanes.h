// Packed colours to RGB565, eight at a time: the vector form of rgb565_of(PackedColour), which is the definition.
#pragma once

#include <cstddef>

#include "frame/lanes.h"
#include "frame/processor.h"

namespace pelm {

#ifdef PELM_HAS_LANES

// Four values, each in the low half of a word.
inline Lanes rgb565_of_four(const uint32_t *colours) {
    Words4 c;
    std::memcpy(&c, colours, sizeof c);
    return std::bit_cast<Lanes>((c >> 12 & 0xF800) | (c >> 7 & 0x07E0) | (c >> 3 & 0x001F));
}

// Writes as many of `count` colours as it can, and returns how many.
inline int32_t write_rgb565_lanes(const uint32_t *colours, int32_t count, uint8_t *out) {
    if (kernels() < Kernels::lanes) return 0;
    const int32_t groups = count / 8;
    for (ptrdiff_t i = 0; i < groups; ++i) {
        const Lanes first = rgb565_of_four(colours + 8 * i), last = rgb565_of_four(colours + 8 * i + 4);
        const Lanes values = __builtin_shufflevector(first, last, 0, 2, 4, 6, 8, 10, 12, 14);
        std::memcpy(out + 16 * i, &values, sizeof values);
    }
    return 8 * groups;
}

#else

inline int32_t write_rgb565_lanes(const uint32_t *, int32_t, uint8_t *) {
    return 0;
}

#endif

} // namespace pelm

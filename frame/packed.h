// Samples of 1, 2, 4 or 8 bits out of a row that packs them from the high bits of each byte down.
#pragma once

#include <cstdint>

namespace pelm {

template <int32_t depth>
inline uint32_t packed_sample(const uint8_t *row, int32_t x) {
    constexpr uint32_t samples_per_byte = 8 / depth;
    const auto at = static_cast<uint32_t>(x); // not negative: bits instead of signed divisions
    if constexpr (depth == 8) return row[at];
    const uint32_t shift = 8 - depth * (at % samples_per_byte + 1);
    return static_cast<uint32_t>(row[at / samples_per_byte] >> shift) & ((1u << depth) - 1);
}

} // namespace pelm

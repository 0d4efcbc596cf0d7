// Samples of 1, 2, 4 or 8 bits out of a row that packs them from the high bits of each byte down.
#pragma once

#include <cstdint>

namespace pelm {

template <int32_t depth>
inline uint32_t packed_sample(const uint8_t *row, int32_t x) {
    constexpr int32_t samples_per_byte = 8 / depth;
    if constexpr (depth == 8) return row[x];
    const int32_t shift = 8 - depth * (x % samples_per_byte + 1);
    return static_cast<uint32_t>(row[x / samples_per_byte] >> shift) & ((1u << depth) - 1);
}

} // namespace pelm

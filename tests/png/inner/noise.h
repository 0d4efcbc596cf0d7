// Bytes and numbers without a pattern, the same in every build.
#pragma once

#include <cstdint>
#include <random>

#include "tests/png/support/deflate_builder.h"

namespace pelm::test {

using Random = std::independent_bits_engine<std::mt19937, 32, uint32_t>;

inline Bytes noise_bytes(size_t size, uint32_t seed) {
    Random random(seed);
    Bytes bytes(size);
    for (uint8_t &byte : bytes)
        byte = static_cast<uint8_t>(random() >> 24);
    return bytes;
}

} // namespace pelm::test

// Sizes that come from files and callers: computed in 64 bits, and narrowed only after a check.
#pragma once

#include <cstddef>
#include <cstdint>
#include <limits>

namespace pelm {

constexpr bool fits_int32(int64_t value) {
    return value >= std::numeric_limits<int32_t>::min() && value <= std::numeric_limits<int32_t>::max();
}

// Bytes of a buffer of width x height pixels: 0 when a side is 0 or below. False when no address space holds it.
constexpr bool buffer_bytes(int32_t width, int32_t height, int32_t pixel_bytes, size_t &bytes) {
    if (width <= 0 || height <= 0) {
        bytes = 0;
        return true;
    }
    const uint64_t wanted =
        static_cast<uint64_t>(width) * static_cast<uint64_t>(height) * static_cast<uint64_t>(pixel_bytes);
    bytes = static_cast<size_t>(wanted);
    return wanted <= static_cast<uint64_t>(std::numeric_limits<ptrdiff_t>::max());
}

} // namespace pelm

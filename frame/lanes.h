// A few bytes as 16-bit lanes, computed on all at once: the compilers' portable vector types, for code whose plain form
// stands beside it.
#pragma once

#include <bit>
#include <cstdint>
#include <cstring>
#include <type_traits>

namespace pelm {

// Where the processor lacks vectors the compilers take the lanes apart, and the plain form is the faster one.
#if defined(__SSE2__) || defined(__ARM_NEON)
constexpr bool lanes_are_fast = true;
#else
constexpr bool lanes_are_fast = false;
#endif

// All of it is inlined: no call passes lanes, whatever the platform's convention for them.
#pragma GCC diagnostic ignored "-Wpsabi"

using Lanes = int16_t __attribute__((vector_size(16)));
using LaneBytes = uint8_t __attribute__((vector_size(8)));

// Bytes in memory as a number whose low byte is the first, put together from whole loads: bytes that were stored singly
// a moment ago would keep a wider load waiting.
template <uint32_t count>
inline uint64_t load_little(const uint8_t *from) {
    static_assert(std::endian::native == std::endian::little);
    if constexpr (count == 8 || count == 4 || count == 2 || count == 1) {
        std::conditional_t<count == 8, uint64_t,
                           std::conditional_t<count == 4, uint32_t, std::conditional_t<count == 2, uint16_t, uint8_t>>>
            bytes;
        std::memcpy(&bytes, from, count);
        return bytes;
    } else {
        constexpr uint32_t head = count > 4 ? 4 : 2;
        return load_little<head>(from) | load_little<count - head>(from + head) << (8 * head);
    }
}

template <uint32_t count>
inline void store_little(uint8_t *to, uint64_t bytes) {
    constexpr uint32_t head = count >= 8 ? 8 : count >= 4 ? 4 : count >= 2 ? 2 : 1;
    std::memcpy(to, &bytes, head);
    if constexpr (count > head) store_little<count - head>(to + head, bytes >> (8 * head));
}

// `count` bytes (8 at most) into the first lanes; zeros in the others.
template <uint32_t count>
inline Lanes load_lanes(const uint8_t *from) {
    return __builtin_convertvector(std::bit_cast<LaneBytes>(load_little<count>(from)), Lanes);
}

// The low byte of each of the first `count` lanes.
template <uint32_t count>
inline void store_lanes(uint8_t *to, Lanes lanes) {
    store_little<count>(to, std::bit_cast<uint64_t>(__builtin_convertvector(lanes, LaneBytes)));
}

inline Lanes low_byte(Lanes lanes) {
    return lanes & 0xFF;
}

inline Lanes magnitude(Lanes lanes) {
    const Lanes sign = lanes >> 15;
    return (lanes ^ sign) - sign;
}

// `mask` is all ones or all zeros in each lane, as comparisons give it.
inline Lanes choose(Lanes mask, Lanes yes, Lanes no) {
    return (mask & yes) | (~mask & no);
}

} // namespace pelm

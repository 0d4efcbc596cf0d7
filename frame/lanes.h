// Sixteen bytes or eight 16-bit numbers at once: the compilers' portable vector types, and the few operations that
// these lack. For code whose plain form stands beside it.
#pragma once

#include <bit>
#include <cstdint>
#include <cstring>
#include <type_traits>

#if defined(__SSE2__)
#include <emmintrin.h>
#elif defined(__ARM_NEON)
#include <arm_neon.h>
#endif

namespace pelm {

// Where the processor that is compiled for lacks vectors the compilers take the lanes apart, and the plain form is the
// faster one: there is nothing here then.
#if defined(__SSE2__) || defined(__ARM_NEON)
#define PELM_HAS_LANES
constexpr bool lanes_are_fast = true;
#else
constexpr bool lanes_are_fast = false;
#endif

#ifdef PELM_HAS_LANES

using Bytes16 = uint8_t __attribute__((vector_size(16)));
using Lanes = int16_t __attribute__((vector_size(16)));
using Words4 = uint32_t __attribute__((vector_size(16)));
using Words2 = uint64_t __attribute__((vector_size(16)));

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
    if constexpr (std::has_single_bit(count)) {
        static_assert(count <= 8);
        std::memcpy(to, &bytes, count);
    } else {
        constexpr uint32_t head = count > 4 ? 4 : 2;
        std::memcpy(to, &bytes, head);
        store_little<count - head>(to + head, bytes >> (8 * head));
    }
}

// `count` bytes into the first lanes; zeros in the others.
template <uint32_t count>
inline Bytes16 load_bytes(const uint8_t *from) {
    if constexpr (count == 16) {
        Bytes16 bytes;
        std::memcpy(&bytes, from, 16);
        return bytes;
    } else if constexpr (count > 8) {
        return std::bit_cast<Bytes16>(Words2{load_little<8>(from), load_little<count - 8>(from + 8)});
    } else if constexpr (count > 4) {
        return std::bit_cast<Bytes16>(Words2{load_little<count>(from), 0});
    } else {
        return std::bit_cast<Bytes16>(Words4{static_cast<uint32_t>(load_little<count>(from)), 0, 0, 0});
    }
}

// The first `count` lanes.
template <uint32_t count>
inline void store_bytes(uint8_t *to, Bytes16 bytes) {
    if constexpr (count == 16) {
        std::memcpy(to, &bytes, 16);
    } else if constexpr (count > 8) {
        const auto words = std::bit_cast<Words2>(bytes);
        store_little<8>(to, words[0]);
        store_little<count - 8>(to + 8, words[1]);
    } else if constexpr (count > 4) {
        store_little<count>(to, std::bit_cast<Words2>(bytes)[0]);
    } else {
        store_little<count>(to, std::bit_cast<Words4>(bytes)[0]);
    }
}

// Every byte `count` lanes up, with zeros below; and down.
template <uint32_t count>
inline Bytes16 move_up(Bytes16 bytes) {
#if defined(__SSE2__)
    return std::bit_cast<Bytes16>(_mm_slli_si128(std::bit_cast<__m128i>(bytes), count));
#else
    return std::bit_cast<Bytes16>(vextq_u8(vdupq_n_u8(0), std::bit_cast<uint8x16_t>(bytes), 16 - count));
#endif
}

template <uint32_t count>
inline Bytes16 move_down(Bytes16 bytes) {
#if defined(__SSE2__)
    return std::bit_cast<Bytes16>(_mm_srli_si128(std::bit_cast<__m128i>(bytes), count));
#else
    return std::bit_cast<Bytes16>(vextq_u8(std::bit_cast<uint8x16_t>(bytes), vdupq_n_u8(0), count));
#endif
}

// The first eight bytes as numbers.
inline Lanes widen(Bytes16 bytes) {
#if defined(__SSE2__)
    return std::bit_cast<Lanes>(_mm_unpacklo_epi8(std::bit_cast<__m128i>(bytes), _mm_setzero_si128()));
#else
    return std::bit_cast<Lanes>(vmovl_u8(vget_low_u8(std::bit_cast<uint8x16_t>(bytes))));
#endif
}

// Numbers from 0 to 255 as the first eight bytes.
inline Bytes16 narrow(Lanes lanes) {
#if defined(__SSE2__)
    return std::bit_cast<Bytes16>(_mm_packus_epi16(std::bit_cast<__m128i>(lanes), _mm_setzero_si128()));
#else
    return std::bit_cast<Bytes16>(vcombine_u8(vmovn_u16(std::bit_cast<uint16x8_t>(lanes)), vdup_n_u8(0)));
#endif
}

// The last `unit` bytes (1, 2, 4 or 8) over and over.
template <uint32_t unit>
inline Bytes16 last_everywhere(Bytes16 bytes) {
    if constexpr (unit == 8) {
        const auto words = std::bit_cast<Words2>(bytes);
        return std::bit_cast<Bytes16>(__builtin_shufflevector(words, words, 1, 1));
    } else if constexpr (unit == 4) {
        const auto words = std::bit_cast<Words4>(bytes);
        return std::bit_cast<Bytes16>(__builtin_shufflevector(words, words, 3, 3, 3, 3));
    } else if constexpr (unit == 2) {
        const auto lanes = std::bit_cast<Lanes>(bytes);
        return std::bit_cast<Bytes16>(__builtin_shufflevector(lanes, lanes, 7, 7, 7, 7, 7, 7, 7, 7));
    } else {
        return last_everywhere<2>(
            __builtin_shufflevector(bytes, bytes, 8, 8, 9, 9, 10, 10, 11, 11, 12, 12, 13, 13, 14, 14, 15, 15));
    }
}

// Words of `unit` bytes (1, 2, 4 or 8) of the two first halves in turn.
template <uint32_t unit, class Vector>
inline Vector join_words(Vector a, Vector b) {
    if constexpr (unit == 1) {
        return std::bit_cast<Vector>(__builtin_shufflevector(std::bit_cast<Bytes16>(a), std::bit_cast<Bytes16>(b), 0,
                                                             16, 1, 17, 2, 18, 3, 19, 4, 20, 5, 21, 6, 22, 7, 23));
    } else if constexpr (unit == 2) {
        return std::bit_cast<Vector>(
            __builtin_shufflevector(std::bit_cast<Lanes>(a), std::bit_cast<Lanes>(b), 0, 8, 1, 9, 2, 10, 3, 11));
    } else if constexpr (unit == 4) {
        return std::bit_cast<Vector>(
            __builtin_shufflevector(std::bit_cast<Words4>(a), std::bit_cast<Words4>(b), 0, 4, 1, 5));
    } else {
        return std::bit_cast<Vector>(__builtin_shufflevector(std::bit_cast<Words2>(a), std::bit_cast<Words2>(b), 0, 2));
    }
}

// The first `unit` bytes (1, 2 or 4) of each of the 8 / `unit` vectors, one behind the other.
template <uint32_t unit>
inline Bytes16 join_first(const Bytes16 *vectors) {
    if constexpr (unit == 4) {
        return join_words<4>(vectors[0], vectors[1]);
    } else {
        Bytes16 joined[4 / unit];
        for (uint32_t i = 0; i < 4 / unit; ++i)
            joined[i] = join_words<unit>(vectors[2 * i], vectors[2 * i + 1]);
        return join_first<2 * unit>(joined);
    }
}

// a - b, which must not overflow. The compilers do not regroup it with other sums, so that it stays the only operation
// between b and the result.
inline Lanes subtract_alone(Lanes a, Lanes b) {
#if defined(__SSE2__)
    return std::bit_cast<Lanes>(_mm_subs_epi16(std::bit_cast<__m128i>(a), std::bit_cast<__m128i>(b)));
#else
    return std::bit_cast<Lanes>(vqsubq_s16(std::bit_cast<int16x8_t>(a), std::bit_cast<int16x8_t>(b)));
#endif
}

inline Lanes least(Lanes a, Lanes b) {
#if defined(__SSE2__)
    return std::bit_cast<Lanes>(_mm_min_epi16(std::bit_cast<__m128i>(a), std::bit_cast<__m128i>(b)));
#else
    return a < b ? a : b;
#endif
}

inline Lanes greatest(Lanes a, Lanes b) {
#if defined(__SSE2__)
    return std::bit_cast<Lanes>(_mm_max_epi16(std::bit_cast<__m128i>(a), std::bit_cast<__m128i>(b)));
#else
    return a < b ? b : a;
#endif
}

// The mean of each pair, halves rounded up.
inline Bytes16 mean_rounded_up(Bytes16 a, Bytes16 b) {
#if defined(__SSE2__)
    return std::bit_cast<Bytes16>(_mm_avg_epu8(std::bit_cast<__m128i>(a), std::bit_cast<__m128i>(b)));
#else
    return std::bit_cast<Bytes16>(vrhaddq_u8(std::bit_cast<uint8x16_t>(a), std::bit_cast<uint8x16_t>(b)));
#endif
}

// Numbers from 0 to 255, modulo 256.
inline Lanes add_low_bytes(Lanes a, Lanes b) {
    return std::bit_cast<Lanes>(std::bit_cast<Bytes16>(a) + std::bit_cast<Bytes16>(b));
}

inline Lanes subtract_low_bytes(Lanes a, Lanes b) {
    return std::bit_cast<Lanes>(std::bit_cast<Bytes16>(a) - std::bit_cast<Bytes16>(b));
}

#endif

} // namespace pelm

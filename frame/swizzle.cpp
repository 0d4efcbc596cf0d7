#include "frame/swizzle.h"

#include <cstring>

#include "frame/processor.h"
#include "frame/shuffles.h"

namespace pelm {

#ifdef PELM_SHUFFLES

namespace {

#if defined(__x86_64__) || defined(__i386__)

PELM_SHUFFLES inline Group join_halves(Group a, Group b) {
    return _mm_unpacklo_epi64(a, b);
}

PELM_SHUFFLES inline Group set_bits(Group a, Group b) {
    return _mm_or_si128(a, b);
}

PELM_SHUFFLES inline bool are_opaque(Group words) {
    return (_mm_movemask_epi8(_mm_cmpeq_epi8(words, _mm_set1_epi32(-1))) & 0x8888) == 0x8888;
}

PELM_SHUFFLES inline Group triples_of(Group words) {
    return _mm_shuffle_epi8(words, _mm_setr_epi8(0, 1, 2, 4, 5, 6, 8, 9, 10, 12, 13, 14, -1, -1, -1, -1));
}

// Into the first half of the group.
PELM_SHUFFLES inline Group pack_rgb565(Group words) {
    // The outer channels meet by one multiplication: red goes 13 bits up, blue, from its upper half, 2.
    const Group outer = _mm_madd_epi16(_mm_and_si128(words, _mm_set1_epi32(0x00F800F8)), _mm_set1_epi32(0x00042000));
    const Group green = _mm_and_si128(words, _mm_set1_epi32(0xFC00));
    const Group pixels = _mm_srli_epi32(_mm_or_si128(outer, green), 5);
    return _mm_shuffle_epi8(pixels, _mm_setr_epi8(0, 1, 4, 5, 8, 9, 12, 13, -1, -1, -1, -1, -1, -1, -1, -1));
}

PELM_SHUFFLES inline void store_half(uint8_t *to, Group group) {
    _mm_storel_epi64(reinterpret_cast<__m128i *>(to), group);
}

#else

inline Group join_halves(Group a, Group b) {
    return vcombine_u8(vget_low_u8(a), vget_low_u8(b));
}

inline Group set_bits(Group a, Group b) {
    return vorrq_u8(a, b);
}

inline bool are_opaque(Group words) {
    const uint32x4_t alphas = vreinterpretq_u32_u8(words);
    const uint32x2_t both = vand_u32(vget_low_u32(alphas), vget_high_u32(alphas));
    return (vget_lane_u32(both, 0) & vget_lane_u32(both, 1)) >> 24 == 0xFF;
}

inline Group triples_of(Group words) {
    static constexpr uint8_t places[16] = {0, 1, 2, 4, 5, 6, 8, 9, 10, 12, 13, 14, 0x80, 0x80, 0x80, 0x80};
    return shuffle(words, load_group(places));
}

inline Group pack_rgb565(Group words) {
    const uint32x4_t pixels = vreinterpretq_u32_u8(words);
    const uint32x4_t red = vshlq_n_u32(vandq_u32(pixels, vdupq_n_u32(0xF8)), 8);
    const uint32x4_t green = vshrq_n_u32(vandq_u32(pixels, vdupq_n_u32(0xFC00)), 5);
    const uint32x4_t blue = vshrq_n_u32(vandq_u32(pixels, vdupq_n_u32(0xF80000)), 19);
    const uint8x8_t packed = vreinterpret_u8_u16(vmovn_u32(vorrq_u32(vorrq_u32(red, green), blue)));
    return vcombine_u8(packed, packed);
}

inline void store_half(uint8_t *to, Group group) {
    vst1_u8(to, vget_low_u8(group));
}

#endif

// Four pixels of `size` bytes. Reads 16 bytes, or for the wider ones 2 x `size` and 16 more.
template <int32_t size>
PELM_SHUFFLES inline Group load_words(const uint8_t *from, Group places) {
    const Group first = shuffle(load_group(from), places);
    if constexpr (size <= 4) return first;
    return join_halves(first, shuffle(load_group(from + 2 * size), places));
}

// The pixels behind these may be blended with what lies there: nothing of it is written.
PELM_SHUFFLES inline void store_12(uint8_t *to, Group group) {
    uint8_t bytes[16];
    store_group(bytes, group);
    std::memcpy(to, bytes, 12);
}

template <int32_t size, SwizzleTo to, bool stops_at_alpha>
PELM_SHUFFLES int32_t swizzle_as(const Swizzle &how, const uint8_t *row, int32_t count, uint8_t *out) {
    constexpr int32_t target_size = to == SwizzleTo::words ? 4 : to == SwizzleTo::triples ? 3 : 2;
    constexpr int32_t bytes_read = size <= 4 ? 16 : 2 * size + 16;
    constexpr int32_t bytes_written = to == SwizzleTo::rgb565 ? 8 : 16;
    // Pixels that a group reads from and writes to.
    constexpr int32_t reach = (bytes_read + size - 1) / size > (bytes_written + target_size - 1) / target_size
                                  ? (bytes_read + size - 1) / size
                                  : (bytes_written + target_size - 1) / target_size;
    const Group places = load_group(how.places);
    const Group ones = load_group(how.ones);
    int32_t done = 0;
    if constexpr (to == SwizzleTo::rgb565 && !stops_at_alpha) {
        for (; done <= count - reach - 4; done += 8) {
            const Group first = pack_rgb565(load_words<size>(row, places));
            const Group last = pack_rgb565(load_words<size>(row + 4 * size, places));
            store_group(out, join_halves(first, last));
            row += 8 * size;
            out += 8 * target_size;
        }
    }
#pragma GCC unroll 4
    for (; done <= count - reach; done += 4) {
        const Group words = set_bits(load_words<size>(row, places), ones);
        if (stops_at_alpha && !are_opaque(words)) break;
        if constexpr (to == SwizzleTo::words)
            store_group(out, words);
        else if constexpr (to == SwizzleTo::triples)
            stops_at_alpha ? store_12(out, triples_of(words)) : store_group(out, triples_of(words));
        else
            store_half(out, pack_rgb565(words));
        row += 4 * size;
        out += 4 * target_size;
    }
    return done;
}

template <int32_t size>
int32_t swizzle_from(const Swizzle &how, const uint8_t *row, int32_t count, uint8_t *out) {
    switch (how.to) {
    case SwizzleTo::words: return swizzle_as<size, SwizzleTo::words, false>(how, row, count, out);
    case SwizzleTo::triples:
        return how.stops_at_alpha ? swizzle_as<size, SwizzleTo::triples, true>(how, row, count, out)
                                  : swizzle_as<size, SwizzleTo::triples, false>(how, row, count, out);
    case SwizzleTo::rgb565:
        return how.stops_at_alpha ? swizzle_as<size, SwizzleTo::rgb565, true>(how, row, count, out)
                                  : swizzle_as<size, SwizzleTo::rgb565, false>(how, row, count, out);
    }
    return 0;
}

} // namespace

bool can_swizzle() {
    return kernels() >= Kernels::shuffles;
}

int32_t swizzle(const Swizzle &how, const uint8_t *row, int32_t count, uint8_t *out) {
    switch (how.source_size) {
    case 1: return swizzle_from<1>(how, row, count, out);
    case 2: return swizzle_from<2>(how, row, count, out);
    case 3: return swizzle_from<3>(how, row, count, out);
    case 4: return swizzle_from<4>(how, row, count, out);
    case 6: return swizzle_from<6>(how, row, count, out);
    case 8: return swizzle_from<8>(how, row, count, out);
    default: return 0;
    }
}

#else

bool can_swizzle() {
    return false;
}

int32_t swizzle(const Swizzle &, const uint8_t *, int32_t, uint8_t *) {
    return 0;
}

#endif

} // namespace pelm

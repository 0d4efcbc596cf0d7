#include "frame/sixteen_colours.h"

#include <cstddef>

#include "frame/processor.h"
#include "frame/shuffles.h"

namespace pelm {

#ifdef PELM_SHUFFLES

namespace {

#if defined(__x86_64__) || defined(__i386__)

PELM_SHUFFLES inline bool are_below_16(Group samples) {
    const Group high = _mm_and_si128(samples, _mm_set1_epi8(-16));
    return _mm_movemask_epi8(_mm_cmpeq_epi8(high, _mm_setzero_si128())) == 0xFFFF;
}

// Sixteen pixels, byte by byte of them.
PELM_SHUFFLES inline void store_joined(uint8_t *to, const Group (&bytes)[2]) {
    store_group(to, _mm_unpacklo_epi8(bytes[0], bytes[1]));
    store_group(to + 16, _mm_unpackhi_epi8(bytes[0], bytes[1]));
}

PELM_SHUFFLES inline void store_joined(uint8_t *to, const Group (&bytes)[4]) {
    const Group low01 = _mm_unpacklo_epi8(bytes[0], bytes[1]), low23 = _mm_unpacklo_epi8(bytes[2], bytes[3]);
    const Group high01 = _mm_unpackhi_epi8(bytes[0], bytes[1]), high23 = _mm_unpackhi_epi8(bytes[2], bytes[3]);
    store_group(to, _mm_unpacklo_epi16(low01, low23));
    store_group(to + 16, _mm_unpackhi_epi16(low01, low23));
    store_group(to + 32, _mm_unpacklo_epi16(high01, high23));
    store_group(to + 48, _mm_unpackhi_epi16(high01, high23));
}

#else

inline bool are_below_16(Group samples) {
    const uint64x2_t high = vreinterpretq_u64_u8(vshrq_n_u8(samples, 4));
    return (vgetq_lane_u64(high, 0) | vgetq_lane_u64(high, 1)) == 0;
}

inline void store_joined(uint8_t *to, const Group (&bytes)[2]) {
    vst2q_u8(to, {{bytes[0], bytes[1]}});
}

inline void store_joined(uint8_t *to, const Group (&bytes)[4]) {
    vst4q_u8(to, {{bytes[0], bytes[1], bytes[2], bytes[3]}});
}

#endif

// Byte k of each colour.
PELM_SHUFFLES inline Group bytes_of_colours(const uint32_t *colours, int32_t k) {
    uint8_t bytes[16];
    for (int32_t i = 0; i < 16; ++i)
        bytes[i] = static_cast<uint8_t>(colours[i] >> (8 * k));
    return load_group(bytes);
}

template <int32_t size>
PELM_SHUFFLES int32_t write_as(const uint32_t *colours, const uint8_t *samples, int32_t count, uint8_t *out) {
    Group tables[size];
    for (int32_t k = 0; k < size; ++k)
        tables[k] = bytes_of_colours(colours, k);
    ptrdiff_t done = 0;
    for (; done <= count - 16; done += 16) {
        const Group group = load_group(samples + done);
        if (!are_below_16(group)) break;
        Group bytes[size];
        for (int32_t k = 0; k < size; ++k)
            bytes[k] = shuffle(tables[k], group);
        store_joined(out + size * done, bytes);
    }
    return static_cast<int32_t>(done);
}

} // namespace

int32_t write_sixteen_colours(const uint32_t *colours, int32_t size, const uint8_t *samples, int32_t count,
                              uint8_t *out) {
    if (kernels() < Kernels::shuffles) return 0;
    return size == 2 ? write_as<2>(colours, samples, count, out) : write_as<4>(colours, samples, count, out);
}

#else

int32_t write_sixteen_colours(const uint32_t *, int32_t, const uint8_t *, int32_t, uint8_t *) {
    return 0;
}

#endif

} // namespace pelm

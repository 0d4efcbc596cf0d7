// Sixteen bytes put into any order: the processor's shuffles, for functions that are compiled for them (PELM_SHUFFLES)
// and called where kernels() is at least Kernels::shuffles. Without PELM_SHUFFLES there are none.
#pragma once

#include <cstdint>

#if defined(__x86_64__) || defined(__i386__)
#include <tmmintrin.h>
#define PELM_SHUFFLES __attribute__((target("ssse3")))
#elif defined(__ARM_NEON)
#include <arm_neon.h>
#define PELM_SHUFFLES
#endif

namespace pelm {

#ifdef PELM_SHUFFLES

#if defined(__x86_64__) || defined(__i386__)

using Group = __m128i;

PELM_SHUFFLES inline Group load_group(const uint8_t *from) {
    return _mm_loadu_si128(reinterpret_cast<const __m128i *>(from));
}

PELM_SHUFFLES inline void store_group(uint8_t *to, Group group) {
    _mm_storeu_si128(reinterpret_cast<__m128i *>(to), group);
}

PELM_SHUFFLES inline Group shuffle(Group group, Group places) {
    return _mm_shuffle_epi8(group, places);
}

#else

using Group = uint8x16_t;

inline Group load_group(const uint8_t *from) {
    return vld1q_u8(from);
}

inline void store_group(uint8_t *to, Group group) {
    vst1q_u8(to, group);
}

inline Group shuffle(Group group, Group places) {
#if defined(__aarch64__)
    return vqtbl1q_u8(group, places);
#else
    const uint8x8x2_t table = {{vget_low_u8(group), vget_high_u8(group)}};
    return vcombine_u8(vtbl2_u8(table, vget_low_u8(places)), vtbl2_u8(table, vget_high_u8(places)));
#endif
}

#endif
#endif

} // namespace pelm

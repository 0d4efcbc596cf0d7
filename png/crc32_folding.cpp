// A block of 128 bits, as a polynomial, may be replaced by its product with x^n modulo the checksum's polynomial n bits
// further on, where it is added to the block that lies there.
#include "png/crc32_folding.h"

#if defined(__x86_64__) || defined(__i386__)
#include <immintrin.h>
#endif

#include "png/crc32.h"

namespace pelm {

#if defined(__x86_64__) || defined(__i386__)
namespace {

// x^n with the bits of a checksum, the highest power in bit 0, one up: the product of two numbers in such an order has
// a bit less than its place has.
constexpr int64_t power(uint32_t n) {
    uint32_t value = 0x80000000;
    for (; n > 0; --n)
        value = (value & 1) != 0 ? value >> 1 ^ crc32_polynomial : value >> 1;
    return int64_t{value} << 1;
}

#define PELM_CARRYLESS [[gnu::target("sse2,pclmul")]]

PELM_CARRYLESS inline __m128i load(const uint8_t *bytes) {
    return _mm_loadu_si128(reinterpret_cast<const __m128i *>(bytes));
}

PELM_CARRYLESS inline __m128i fold(__m128i block, __m128i factors, __m128i next) {
    const __m128i first = _mm_clmulepi64_si128(block, factors, 0x00);
    const __m128i second = _mm_clmulepi64_si128(block, factors, 0x11);
    return _mm_xor_si128(_mm_xor_si128(first, second), next);
}

} // namespace

PELM_CARRYLESS FoldedBytes crc32_fold(uint32_t crc, const uint8_t *bytes, size_t blocks) {
    // For the two halves of a block; a product of 64 and 32 bits reaches 32 bits beyond either.
    constexpr int64_t one_on[2] = {power(128 + 32), power(128 - 32)};
    constexpr int64_t four_on[2] = {power(512 + 32), power(512 - 32)};
    const __m128i by_one = _mm_set_epi64x(one_on[1], one_on[0]), by_four = _mm_set_epi64x(four_on[1], four_on[0]);
    __m128i sum = _mm_xor_si128(load(bytes), _mm_cvtsi32_si128(static_cast<int32_t>(crc)));
    bytes += 16;
    --blocks;
    if (blocks >= 7) { // four in parallel
        __m128i second = load(bytes), third = load(bytes + 16), fourth = load(bytes + 32);
        bytes += 48;
        blocks -= 3;
        for (; blocks >= 4; blocks -= 4, bytes += 64) {
            sum = fold(sum, by_four, load(bytes));
            second = fold(second, by_four, load(bytes + 16));
            third = fold(third, by_four, load(bytes + 32));
            fourth = fold(fourth, by_four, load(bytes + 48));
        }
        sum = fold(fold(fold(sum, by_one, second), by_one, third), by_one, fourth);
    }
    for (; blocks > 0; --blocks, bytes += 16)
        sum = fold(sum, by_one, load(bytes));
    FoldedBytes folded;
    _mm_storeu_si128(reinterpret_cast<__m128i *>(folded.bytes), sum);
    return folded;
}

#undef PELM_CARRYLESS

#else

FoldedBytes crc32_fold(uint32_t, const uint8_t *, size_t) {
    return {}; // no processor of this kind has it
}

#endif

} // namespace pelm

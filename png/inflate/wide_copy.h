// Copies of matches in whole words.
#pragma once

#include <cstdint>
#include <cstring>

namespace pelm {

// How many bytes behind its end a copy may write.
constexpr uint32_t wide_copy_overshoot = 32;

namespace wide {

template <size_t count>
struct Word {
    uint8_t bytes[count];
};

template <size_t count>
inline void move(uint8_t *to, const uint8_t *from) {
    Word<count> word;
    std::memcpy(&word, from, count);
    std::memcpy(to, &word, count);
}

inline void store(uint8_t *to, uint64_t word) {
    std::memcpy(to, &word, sizeof word);
}

// The first `period` bytes of `word`, 1 to 7, over and over.
inline uint64_t repeat(uint64_t word, uint32_t period) {
    word &= (uint64_t{1} << 8 * period) - 1;
    for (uint32_t bits = 8 * period; bits < 64; bits *= 2)
        word |= word << bits;
    return word;
}

} // namespace wide

// A match of `length` bytes, 3 to 258, at `distance`, 1 or more, from bytes that are all there. Writes up to
// wide_copy_overshoot bytes more, and before `out` reads no further back than the match does.
inline void copy_wide(uint8_t *out, uint32_t distance, uint32_t length) {
    const uint8_t *in = out - distance;
    uint8_t *const end = out + length;
    if (distance >= 16) {
        wide::move<16>(out, in);
        for (; (out += 16) < end;)
            wide::move<16>(out, in += 16);
    } else if (distance >= 8) {
        do {
            wide::move<8>(out, in);
            out += 8;
            in += 8;
        } while (out < end);
    } else {
        // Whole periods at a time.
        static constexpr uint8_t steps[8] = {0, 8, 8, 6, 8, 5, 6, 7};
        uint64_t word = 0;
        std::memcpy(&word, in, sizeof word);
        word = wide::repeat(word, distance);
        const uint32_t step = steps[distance];
        do {
            wide::store(out, word);
            out += step;
        } while (out < end);
    }
}

} // namespace pelm

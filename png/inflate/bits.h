// Compressed bits, least significant first. The reader holds whole bytes taken from an input ahead of what is needed; a
// missing byte matters only to whoever needs its bits.
//
// An input is a record with
//   const uint8_t *next, *end          bytes at hand
//   bool more(Input &)                 brings further ones; false: there are none
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace pelm {

struct BitReader {
    size_t bits;    // the next bit lowest; zeros above `count`
    uint32_t count; // valid bits
};

constexpr uint32_t bit_reader_width = 8 * sizeof(size_t);

// Bytes that lie in memory as a whole.
struct MemoryInput {
    const uint8_t *next, *end;
};

inline bool more(MemoryInput &) {
    return false;
}

// As many bytes as fit, without asking for further ones.
template <class Input>
inline void take_bytes_at_hand(BitReader &reader, Input &input) {
    if (input.end - input.next >= static_cast<ptrdiff_t>(sizeof(size_t))) {
        size_t word;
        std::memcpy(&word, input.next, sizeof word);
        reader.bits |= word << reader.count;
        const uint32_t bytes = (bit_reader_width - 1 - reader.count) >> 3;
        input.next += bytes;
        reader.count += 8 * bytes;
        // What the last load brought beyond `count` is loaded again next time, to the same bits.
        reader.bits &= ~size_t{0} >> (bit_reader_width - reader.count);
        return;
    }
    while (reader.count <= bit_reader_width - 8 && input.next != input.end) {
        reader.bits |= static_cast<size_t>(*input.next++) << reader.count;
        reader.count += 8;
    }
}

// Makes `wanted` bits (at most 16) valid if the input has them.
template <class Input>
inline void refill(BitReader &reader, Input &input, uint32_t wanted = 16) {
    if (reader.count >= wanted) return;
    take_bytes_at_hand(reader, input);
    while (reader.count < wanted && more(input))
        take_bytes_at_hand(reader, input);
}

inline uint32_t peek(const BitReader &reader, uint32_t count) {
    return static_cast<uint32_t>(reader.bits) & ((1u << count) - 1);
}

inline void drop(BitReader &reader, uint32_t count) {
    reader.bits >>= count;
    reader.count -= count;
}

// The next `count` bits (at most 16). False when the input ended first.
template <class Input>
inline bool take_bits(BitReader &reader, Input &input, uint32_t count, uint32_t &value) {
    refill(reader, input, count);
    if (reader.count < count) return false;
    value = peek(reader, count);
    drop(reader, count);
    return true;
}

// Drops the bits up to the next whole byte of the stream.
inline void align_to_byte(BitReader &reader) {
    drop(reader, reader.count & 7);
}

// Whole bytes of an aligned reader: those that it holds, then the input's. Returns how many there were.
template <class Input>
inline uint32_t take_bytes(BitReader &reader, Input &input, uint8_t *to, uint32_t count) {
    uint32_t taken = 0;
    for (; taken < count && reader.count != 0; drop(reader, 8))
        to[taken++] = static_cast<uint8_t>(reader.bits);
    while (taken < count) {
        if (input.next == input.end && !more(input)) break;
        const auto run = static_cast<uint32_t>(std::min<int64_t>(count - taken, input.end - input.next));
        std::memcpy(to + taken, input.next, run);
        input.next += run;
        taken += run;
    }
    return taken;
}

} // namespace pelm

#include "frame/export.h"

// The next n bits of `bytes` (right for n up to 17), advancing the position: `bitsLeftInByte` of the byte at
// `bytePosition` are unread, 1 to 8. Reads two bytes beyond the current one.
PELM_EXPORT uint32_t __PELMI_PngReadBits(const uint8_t *bytes, uint32_t *bytePosition, uint32_t *bitsLeftInByte,
                                         uint32_t n);

#include "png/inflate/fast_loop.h"

#include "frame/processor.h"
#include "png/inflate/wide_copy.h"

namespace pelm {
namespace {

static_assert(longest_match + wide_copy_overshoot <= window_slack);

// Bits of the stream, first one lowest. What lies above `count` is either right or zero.
struct Bits {
    uint64_t word;
    uint32_t count;
};

// At least 56 bits afterwards. Reads `fast_input` bytes.
inline void refill(Bits &bits, const uint8_t *&next) {
    uint64_t word = 0;
    std::memcpy(&word, next, sizeof word);
    bits.word |= word << bits.count;
    next += (63 - bits.count) >> 3;
    bits.count |= 56;
}

inline void drop_entry(Bits &bits, uint32_t entry) {
    bits.word >>= entry & 63;
    bits.count -= entry_bits(entry);
}

// Both bytes, whether or not there are two literals.
inline uint8_t *put_literals(uint8_t *out, uint32_t entry) {
    const auto pair = static_cast<uint16_t>(entry >> 8);
    std::memcpy(out, &pair, sizeof pair);
    return out + (entry >> 24 & 3);
}

// Back to what a BitReader holds, which may be less: bytes that do not fit are given back.
inline BitReader reader_of(Bits bits, const uint8_t *&next) {
    for (; bits.count >= bit_reader_width; bits.count -= 8)
        --next;
    const auto mask = (uint64_t{1} << bits.count) - 1;
    return {static_cast<size_t>(bits.word & mask), bits.count};
}

// The tables are copies, which no write to the window can be suspected of changing.
[[gnu::always_inline]] inline bool run(DecodingTable literals, DecodingTable distances, BitReader &reader,
                                       const uint8_t *&next, const uint8_t *end, Window &window) {
    if (end - next < fast_input || is_full(window)) return false;
    Bits bits = {reader.bits, reader.count};
    const uint8_t *in = next;
    const uint8_t *const last_in = end - fast_input;
    uint8_t *const begin = window.bytes;
    uint8_t *const first = begin + window.write;
    uint8_t *const full = begin + window_full;
    uint8_t *out = first;
    bool ended = false;

    refill(bits, in);
    uint32_t entry = look_up(literals, bits.word);
    // Here at least 56 bits are valid, and `entry` is that of the first of them.
    while (in <= last_in && out < full) {
        if ((entry & exceptional_literal) != 0) {
            if ((entry & entry_goes_on) != 0) entry = look_further(literals, bits.word, entry);
            if ((entry & exceptional_literal) != 0) {
                ended = (entry & entry_ends_block) != 0;
                if (ended) drop_entry(bits, entry);
                break;
            }
        }
        if ((entry & entry_is_literal) != 0) {
            // At most 15 and three times 11 bits, and the next entry's.
            drop_entry(bits, entry);
            out = put_literals(out, entry);
            entry = look_up(literals, bits.word);
#pragma GCC unroll 3
            for (uint32_t more = 0; more < 3; ++more) {
                if ((entry & entry_is_literal) == 0) break;
                drop_entry(bits, entry);
                out = put_literals(out, entry);
                entry = look_up(literals, bits.word);
            }
            refill(bits, in);
            continue;
        }
        const Bits at_length = bits;
        const uint32_t length = entry_base(entry, exceptional_literal) + entry_extra(entry, bits.word);
        drop_entry(bits, entry);
        entry = find_entry(distances, bits.word, exceptional_distance);
        const uint32_t distance = entry_base(entry, exceptional_distance) + entry_extra(entry, bits.word);
        if ((entry & exceptional_distance) != 0 || distance > static_cast<uint32_t>(out - begin)) {
            bits = at_length;
            break;
        }
        drop_entry(bits, entry);
        refill(bits, in);
        entry = look_up(literals, bits.word);
        copy_wide(out, distance, length);
        out += length;
    }
    reader = reader_of(bits, in);
    next = in;
    produced(window, static_cast<uint32_t>(out - first));
    return ended;
}

#if defined(__x86_64__)
[[gnu::target("bmi2")]] bool run_bmi2(DecodingTable literals, DecodingTable distances, BitReader &reader,
                                      const uint8_t *&next, const uint8_t *end, Window &window) {
    return run(literals, distances, reader, next, end, window);
}
#endif

} // namespace

bool run_fast(DecodingTable literals, DecodingTable distances, BitReader &reader, const uint8_t *&next,
              const uint8_t *end, Window &window) {
#if defined(__x86_64__)
    if (kernels() >= Kernels::bmi2) return run_bmi2(literals, distances, reader, next, end, window);
#endif
    return run(literals, distances, reader, next, end, window);
}

} // namespace pelm

// How decoding tables are made (png/inflate/decoding_table.h): from code lengths, each entry written once.
#pragma once

#include <bit>

#include "png/inflate/alphabets.h"
#include "png/inflate/decoding_table.h"

namespace pelm {

constexpr uint32_t longest_code = 15;
constexpr uint32_t largest_alphabet = 288;

// Symbols in the order of their codes, shorter ones first (RFC 1951, section 3.2.2), and the codes as they come in the
// stream: first bit lowest.
struct SortedCodes {
    uint32_t begin[longest_code + 2]; // of the symbols of each length; behind the last one, all of them
    uint16_t symbols[largest_alphabet];
    uint16_t codes[largest_alphabet];
    uint32_t longest; // 0: there are no codes
    bool complete;    // every string of bits begins with a code
};

// The code behind `code` of as many bits.
constexpr uint32_t next_code(uint32_t code, uint32_t length) {
    const uint32_t zeros = ~code & ((1u << length) - 1);
    const uint32_t highest = zeros == 0 ? 0 : std::bit_floor(zeros);
    return highest == 0 ? 0 : (code & (highest - 1)) | highest;
}

// False when there are more codes than fit their lengths.
constexpr bool sort_codes(const uint8_t *code_lengths, uint32_t count, SortedCodes &sorted) {
    uint32_t of_length[longest_code + 1] = {};
    for (uint32_t symbol = 0; symbol < count; ++symbol)
        ++of_length[code_lengths[symbol]];
    uint32_t next[longest_code + 1] = {};
    int32_t left = 1; // codes of the length that are not taken
    sorted.begin[0] = sorted.begin[1] = 0;
    sorted.longest = 0;
    for (uint32_t length = 1; length <= longest_code; ++length) {
        left = 2 * left - static_cast<int32_t>(of_length[length]);
        if (left < 0) return false;
        next[length] = sorted.begin[length];
        sorted.begin[length + 1] = sorted.begin[length] + of_length[length];
        if (of_length[length] != 0) sorted.longest = length;
    }
    sorted.complete = left == 0;
    for (uint32_t symbol = 0; symbol < count; ++symbol)
        if (code_lengths[symbol] != 0) sorted.symbols[next[code_lengths[symbol]]++] = static_cast<uint16_t>(symbol);
    uint32_t code = 0;
    for (uint32_t length = 1; length <= sorted.longest; ++length)
        for (uint32_t i = sorted.begin[length]; i < sorted.begin[length + 1]; ++i) {
            sorted.codes[i] = static_cast<uint16_t>(code);
            code = next_code(code, length);
        }
    return true;
}

// What the table says of a symbol whose code has `length` bits.
template <HuffmanAlphabetKind kind>
constexpr uint32_t entry_of(uint32_t symbol, uint32_t length) {
    constexpr uint32_t exceptional = kind == HUFFMAN_DISTANCE ? exceptional_distance : exceptional_literal;
    const Payload payload = payload_of(kind, symbol);
    if (kind != HUFFMAN_DISTANCE && payload.op == HUFFMAN_LITERAL)
        return entry_is_literal | length << 26 | 1u << 24 | payload.value << 8 | length;
    if (payload.op == HUFFMAN_END_OF_BLOCK) return exceptional | entry_ends_block | length;
    const bool is_base = payload.op >= HUFFMAN_BASE && payload.op < HUFFMAN_INVALID && payload.value != 0;
    if (!is_base) return exceptional;
    return payload.value << 16 | length << 8 | (length + payload.op - HUFFMAN_BASE);
}

// The same as the second one of two literals: added to the entry of the first.
constexpr uint32_t second_literal(uint32_t entry) {
    return (entry >> 8 & 0xFF) << 16 | 1u << 24 | entry_bits(entry);
}

// The entries of codes longer than `width`, behind those that the first look-up reaches: one group for each string of
// `width` bits that such codes begin with.
template <HuffmanAlphabetKind kind>
constexpr void enter_longer_codes(const SortedCodes &sorted, uint32_t width, uint32_t capacity, uint32_t *entries) {
    constexpr uint32_t exceptional = kind == HUFFMAN_DISTANCE ? exceptional_distance : exceptional_literal;
    const uint32_t group_bits = sorted.longest - width;
    const uint32_t group_size = 1u << group_bits;
    uint32_t used = 1u << width;
    uint32_t group = 0;
    uint32_t group_prefix = capacity; // none
    for (uint32_t length = width + 1; length <= sorted.longest; ++length)
        for (uint32_t i = sorted.begin[length]; i < sorted.begin[length + 1]; ++i) {
            const uint32_t prefix = sorted.codes[i] & ((1u << width) - 1);
            if (prefix != group_prefix) { // codes that begin alike follow each other
                group_prefix = prefix;
                group = used;
                const bool fits = capacity - used >= group_size;
                entries[prefix] = fits ? exceptional | entry_goes_on | group_bits << 24 | group << 8 : exceptional;
                if (!fits) continue;
                used += group_size;
                for (uint32_t k = 0; k < group_size; ++k)
                    entries[group + k] = exceptional;
            }
            if ((entries[prefix] & entry_goes_on) == 0) continue;
            const uint32_t entry = entry_of<kind>(sorted.symbols[i], length);
            for (uint32_t k = sorted.codes[i] >> width; k < group_size; k += 1u << (length - width))
                entries[group + k] = entry;
        }
}

// Entries for the codes of `length` bits: `seconds` are what may follow in the bits that such a code leaves, for each
// value of these.
template <HuffmanAlphabetKind kind>
constexpr void enter_codes(const SortedCodes &sorted, uint32_t length, uint32_t width, const uint32_t *seconds,
                           uint32_t *entries) {
    const uint32_t repeats = 1u << (width - length);
    for (uint32_t i = sorted.begin[length]; i < sorted.begin[length + 1]; ++i) {
        const uint32_t entry = entry_of<kind>(sorted.symbols[i], length);
        uint32_t *const to = entries + sorted.codes[i];
        if (seconds != nullptr && (entry & entry_is_literal) != 0)
            for (uint32_t k = 0; k < repeats; ++k)
                to[k << length] = entry + seconds[k];
        else
            for (uint32_t k = 0; k < repeats; ++k)
                to[k << length] = entry;
    }
}

// `kind`, `widest` and `capacity` as in decoding_table.h.
template <HuffmanAlphabetKind kind>
constexpr DecodingTable make_table(const uint8_t *code_lengths, uint32_t count, uint32_t widest, uint32_t capacity,
                                   uint32_t *entries) {
    SortedCodes sorted;
    if (!sort_codes(code_lengths, count, sorted)) return {nullptr, 0};
    const uint32_t width = sorted.longest < widest ? sorted.longest : widest;
    if (!sorted.complete)
        for (uint32_t i = 0; i < 1u << width; ++i)
            entries[i] = kind == HUFFMAN_DISTANCE ? exceptional_distance : exceptional_literal;

    if constexpr (kind == HUFFMAN_DISTANCE) {
        for (uint32_t length = 1; length <= width; ++length)
            enter_codes<kind>(sorted, length, width, nullptr, entries);
    } else {
        // The literals that fit `bits` bits, by those: a table that doubles with every bit more. Zeros where none does.
        uint32_t seconds[1u << (widest_literal_table - 1)];
        seconds[0] = 0;
        for (uint32_t bits = 0; bits < width; ++bits) {
            if (bits != 0) {
                const uint32_t half = 1u << (bits - 1);
                for (uint32_t i = 0; i < half; ++i)
                    seconds[half + i] = seconds[i];
                for (uint32_t i = sorted.begin[bits]; i < sorted.begin[bits + 1]; ++i)
                    if (sorted.symbols[i] < 256)
                        seconds[sorted.codes[i]] = second_literal(entry_of<kind>(sorted.symbols[i], bits));
            }
            enter_codes<kind>(sorted, width - bits, width, seconds, entries);
        }
    }
    enter_longer_codes<kind>(sorted, width, capacity, entries);
    return {entries, width};
}

} // namespace pelm

// How decoding tables are made (png/inflate/decoding_table.h): from code lengths, each entry written once.
#pragma once

#include <array>

#include "png/inflate/alphabets.h"
#include "png/inflate/coded_symbols.h"
#include "png/inflate/decoding_table.h"

namespace pelm {

// Symbols in the order of their codes, shorter ones first (RFC 1951, section 3.2.2), and the codes as they come in the
// stream: first bit lowest.
struct SortedCodes {
    uint32_t begin[longest_code + 2]; // of the symbols of each length; behind the last one, all of them
    uint16_t symbols[largest_alphabet];
    uint16_t codes[largest_alphabet];
    uint32_t longest; // 0: there are no codes
    bool complete;    // every string of bits begins with a code
};

// The bits of a byte in the opposite order.
inline constexpr auto reversed_bytes = [] {
    std::array<uint8_t, 256> reversed{};
    for (uint32_t byte = 0; byte < 256; ++byte)
        for (uint32_t bit = 0; bit < 8; ++bit)
            if ((byte >> bit & 1) != 0) reversed[byte] = static_cast<uint8_t>(reversed[byte] | 0x80u >> bit);
    return reversed;
}();

constexpr uint16_t reversed_code(uint32_t code, uint32_t length) {
    const uint32_t word = static_cast<uint32_t>(reversed_bytes[code & 0xFF]) << 8 | reversed_bytes[code >> 8];
    return static_cast<uint16_t>(word >> (16 - length));
}

// The symbols are sorted in parts side by side: within one, each waits for the counters of the one before it.
constexpr uint32_t sorted_parts = 4;

struct LengthCounters {
    uint32_t of[sorted_parts][longest_code + 1];
};

// visit(counters of the part, symbol), each part's symbols in order.
template <class Visit>
constexpr void visit_parts(const uint16_t *symbols, uint32_t count, LengthCounters &counters, Visit &&visit) {
    const uint32_t part = (count + sorted_parts - 1) / sorted_parts;
    for (uint32_t i = 0; i < part; ++i)
        for (uint32_t k = 0; k < sorted_parts; ++k)
            if (k * part + i < count) visit(counters.of[k], symbols[k * part + i]);
}

// False when there are more codes than fit their lengths.
constexpr bool sort_codes(const uint8_t *code_lengths, uint32_t count, SortedCodes &sorted) {
    uint16_t coded[largest_alphabet + 1];
    const uint32_t coded_count = list_coded_symbols(code_lengths, count, coded);
    LengthCounters counters{};
    visit_parts(coded, coded_count, counters,
                [&](uint32_t *of_length, uint32_t symbol) { ++of_length[code_lengths[symbol]]; });
    int32_t left = 1; // codes of the length that are not taken
    sorted.begin[0] = sorted.begin[1] = 0;
    sorted.longest = 0;
    for (uint32_t length = 1; length <= longest_code; ++length) {
        uint32_t next = sorted.begin[length];
        for (uint32_t k = 0; k < sorted_parts; ++k) {
            const uint32_t here = counters.of[k][length];
            counters.of[k][length] = next; // from here on: where the part's next symbol goes
            next += here;
        }
        left = 2 * left - static_cast<int32_t>(next - sorted.begin[length]);
        if (left < 0) return false;
        sorted.begin[length + 1] = next;
        if (next != sorted.begin[length]) sorted.longest = length;
    }
    sorted.complete = left == 0;
    visit_parts(coded, coded_count, counters, [&](uint32_t *next, uint32_t symbol) {
        sorted.symbols[next[code_lengths[symbol]]++] = static_cast<uint16_t>(symbol);
    });
    uint32_t code = 0;
    for (uint32_t length = 1; length <= sorted.longest; ++length, code <<= 1)
        for (uint32_t i = sorted.begin[length]; i < sorted.begin[length + 1]; ++i)
            sorted.codes[i] = reversed_code(code++, length);
    return true;
}

// What the table says of a symbol, but for the length of its code: that counts `per_bit` for each bit.
struct SymbolEntry {
    uint32_t entry, per_bit;
};

template <HuffmanAlphabetKind kind>
constexpr SymbolEntry make_symbol_entry(uint32_t symbol) {
    constexpr uint32_t exceptional = kind == HUFFMAN_DISTANCE ? exceptional_distance : exceptional_literal;
    const Payload payload = payload_of(kind, symbol);
    if (kind != HUFFMAN_DISTANCE && payload.op == HUFFMAN_LITERAL)
        return {entry_is_literal | 1u << 24 | payload.value << 8, 1u << 26 | 1};
    if (payload.op == HUFFMAN_END_OF_BLOCK) return {exceptional | entry_ends_block, 1};
    const bool is_base = payload.op >= HUFFMAN_BASE && payload.op < HUFFMAN_INVALID && payload.value != 0;
    if (!is_base) return {exceptional, 0};
    return {payload.value << 16 | (payload.op - HUFFMAN_BASE), 1u << 8 | 1};
}

template <HuffmanAlphabetKind kind>
constexpr auto make_symbol_entries() {
    std::array<SymbolEntry, kind == HUFFMAN_DISTANCE ? 32 : largest_alphabet> entries{};
    for (uint32_t symbol = 0; symbol < entries.size(); ++symbol)
        entries[symbol] = make_symbol_entry<kind>(symbol);
    return entries;
}

template <HuffmanAlphabetKind kind>
inline constexpr auto symbol_entries = make_symbol_entries<kind>();

template <HuffmanAlphabetKind kind>
constexpr uint32_t entry_of(uint32_t symbol, uint32_t length) {
    return symbol_entries<kind>[symbol].entry + length * symbol_entries<kind>[symbol].per_bit;
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
                // NOLINTNEXTLINE(clang-analyzer-core.UndefinedBinaryOperatorResult): not seen to be filled that far
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

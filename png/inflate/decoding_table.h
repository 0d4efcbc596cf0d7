// Tables that give a symbol, or two literals, for the next bits of a block at once: what the fast loop
// (png/inflate/fast_loop.h) runs on. They hold what the trees hold, for every code that is not over-subscribed; where
// they are silent the trees are asked.
//
// An entry is one word.
//   literals   31: set   29..26: bits of the first   25..24: how many, 1 or 2   23..16, 15..8: second, first
//              7..0: bits of all
//   lengths    30, 31: clear   24..16: base   15..8: bits of the code   7..0: with the extra bits
//   distances  31: clear   30..16: base   15..8, 7..0: as lengths
//   others     `exceptional` set, and
//     end of block   29: set   7..0: bits
//     longer codes   28: set   27..24: bits to look at next   23..8: index of the entries for them
//     nothing        ask the trees
#pragma once

#include "png/inflate/huffman.h"

namespace pelm {

constexpr uint32_t entry_is_literal = 1u << 31;
constexpr uint32_t entry_ends_block = 1u << 29;
constexpr uint32_t entry_goes_on = 1u << 28;

// The bit that is set in exceptional entries of either alphabet.
constexpr uint32_t exceptional_literal = 1u << 30;
constexpr uint32_t exceptional_distance = 1u << 31;

constexpr uint32_t widest_literal_table = 11; // bits
constexpr uint32_t widest_distance_table = 9;

// With the entries of longer codes, which take more where a few symbols have short codes and hundreds have long ones:
// what does not fit is left to the trees.
constexpr uint32_t literal_table_entries = (1u << widest_literal_table) + 1024;
constexpr uint32_t distance_table_entries = (1u << widest_distance_table) + 512;

struct DecodingTable {
    const uint32_t *entries; // NULL: there is none, the code is over-subscribed
    uint32_t width;          // bits that the first look-up takes
};

// Makes the table of `count` code lengths in `entries`, with room for as many as above. It is no wider than the longest
// code, nor than `widest`; two literals share an entry where both codes fit.
DecodingTable make_literal_table(const uint8_t *code_lengths, uint32_t count, uint32_t widest, uint32_t *entries);
DecodingTable make_distance_table(const uint8_t *code_lengths, uint32_t count, uint32_t widest, uint32_t *entries);

constexpr uint32_t entry_bits(uint32_t entry) {
    return entry & 0xFF;
}

constexpr uint32_t entry_base(uint32_t entry, uint32_t exceptional) {
    return (entry & (exceptional - 1)) >> 16;
}

// The value of the extra bits that follow the code at the beginning of `bits`.
constexpr uint32_t entry_extra(uint32_t entry, uint64_t bits) {
    return static_cast<uint32_t>(bits & ((uint64_t{1} << entry_bits(entry)) - 1)) >> (entry >> 8 & 0xFF);
}

// The entry for the next `width` bits.
inline uint32_t look_up(const DecodingTable &table, uint64_t bits) {
    return table.entries[bits & ((1u << table.width) - 1)];
}

// The one behind an entry that goes on.
inline uint32_t look_further(const DecodingTable &table, uint64_t bits, uint32_t entry) {
    const uint64_t further = bits >> table.width & ((1u << (entry >> 24 & 15)) - 1);
    return table.entries[(entry >> 8 & 0xFFFF) + further];
}

inline uint32_t find_entry(const DecodingTable &table, uint64_t bits, uint32_t exceptional) {
    const uint32_t entry = look_up(table, bits);
    return (entry & exceptional) != 0 && (entry & entry_goes_on) != 0 ? look_further(table, bits, entry) : entry;
}

} // namespace pelm

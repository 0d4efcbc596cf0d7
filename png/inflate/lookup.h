// The first bits of a code resolved at once: a table of what the tree walk finds, built from the tree, which stays the
// truth for everything longer.
#pragma once

#include "png/inflate/huffman.h"

namespace pelm {

constexpr uint32_t lookup_width = 9;      // bits
constexpr uint32_t code_length_width = 7; // of the code that code lengths are written in: all of its codes
constexpr uint32_t lookup_entries = 1u << lookup_width;

// `op` of entries that are no leaves.
enum : uint8_t {
    code_goes_on = 0xFF, // `value`: the node behind the first `lookup_width` bits
    code_is_missing = 0xFE
};

struct Symbol {
    uint16_t value;
    uint8_t op;
    uint8_t bits; // of the code; where it is missing, up to the missing branch
};

struct LookupTables {
    Symbol literal[lookup_entries];
    Symbol distance[lookup_entries];
};

// Level by level: the table of one bit more is that of the level before twice, but for what goes on. So that a stream
// of many small blocks pays little more for each than its few codes.
template <uint32_t width>
void fill_lookup(Symbol (&table)[1 << width], const HuffmanNode *nodes, uint32_t root);

// Goes on from a node that `depth` bits lead to; `bits` are the following ones, lowest first.
Symbol walk_on(const HuffmanNode *nodes, uint32_t node, uint32_t depth, size_t bits);

// The symbol that `bits` begin with, lowest first. Bits that are not there count as zeros: whoever calls compares
// `Symbol::bits` with how many there are.
inline Symbol find_symbol(const Symbol (&table)[lookup_entries], const HuffmanNode *nodes, size_t bits) {
    const Symbol symbol = table[bits & (lookup_entries - 1)];
    if (symbol.op != code_goes_on) return symbol;
    return walk_on(nodes, symbol.value, lookup_width, bits >> lookup_width);
}

} // namespace pelm

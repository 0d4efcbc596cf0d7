#include "png/inflate/lookup.h"

namespace pelm {
namespace {

Symbol symbol_of(const HuffmanNode &leaf) {
    return {static_cast<uint16_t>(leaf.value), static_cast<uint8_t>(leaf.op), static_cast<uint8_t>(leaf.codeLength)};
}

// Every entry whose lowest `depth` bits are `prefix`.
void fill_entries(Symbol (&table)[lookup_entries], uint32_t prefix, uint32_t depth, Symbol symbol) {
    for (uint32_t i = prefix; i < lookup_entries; i += 1u << depth)
        table[i] = symbol;
}

void fill_below(Symbol (&table)[lookup_entries], const HuffmanNode *nodes, uint32_t node, uint32_t prefix,
                uint32_t depth) {
    for (uint32_t branch = 0; branch < 2; ++branch) {
        const uint32_t child = nodes[node].child[branch];
        const uint32_t bits = prefix | branch << depth;
        if (child == 0)
            fill_entries(table, bits, depth + 1, {0, code_is_missing, static_cast<uint8_t>(depth + 1)});
        else if (is_leaf(nodes[child]))
            fill_entries(table, bits, depth + 1, symbol_of(nodes[child]));
        else if (depth + 1 == lookup_width)
            table[bits] = {static_cast<uint16_t>(child), code_goes_on, lookup_width};
        else
            fill_below(table, nodes, child, bits, depth + 1);
    }
}

} // namespace

void fill_lookup(Symbol (&table)[lookup_entries], const HuffmanNode *nodes, uint32_t root) {
    fill_below(table, nodes, root, 0, 0);
}

Symbol walk_on(const HuffmanNode *nodes, uint32_t node, uint32_t depth, size_t bits) {
    for (;; bits >>= 1) {
        node = nodes[node].child[bits & 1];
        ++depth;
        if (node == 0) return {0, code_is_missing, static_cast<uint8_t>(depth)};
        if (is_leaf(nodes[node])) return symbol_of(nodes[node]);
    }
}

} // namespace pelm

#include "png/inflate/lookup.h"

#include <cstring>

namespace pelm {
namespace {

Symbol symbol_of(const HuffmanNode &leaf) {
    return {static_cast<uint16_t>(leaf.value), static_cast<uint8_t>(leaf.op), static_cast<uint8_t>(leaf.codeLength)};
}

Symbol entry_of(const HuffmanNode *nodes, uint32_t node, uint32_t depth) {
    if (node == 0) return {0, code_is_missing, static_cast<uint8_t>(depth)};
    if (is_leaf(nodes[node])) return symbol_of(nodes[node]);
    return {static_cast<uint16_t>(node), code_goes_on, lookup_width};
}

// The first `count` entries behind themselves, four at once where there are as many: a call for the many short copies
// would cost more than they do.
void copy_up(Symbol *table, uint32_t count) {
    constexpr uint32_t group = 4;
    if (count < group)
        for (uint32_t i = 0; i < count; ++i)
            table[count + i] = table[i];
    else
        for (uint32_t i = 0; i < count; i += group)
            std::memcpy(table + count + i, table + i, group * sizeof(Symbol));
}

} // namespace

// Level by level: the table of one bit more is that of the level before twice, but for what goes on. So that a stream
// of many small blocks pays little more for each than its few codes.
void fill_lookup(Symbol (&table)[lookup_entries], const HuffmanNode *nodes, uint32_t root) {
    uint16_t lists[2][lookup_entries]; // the entries whose codes go on, of this level and of the next
    uint32_t going_on = 1;
    lists[0][0] = 0;
    table[0] = {static_cast<uint16_t>(root), code_goes_on, lookup_width};
    for (uint32_t depth = 0; depth < lookup_width; ++depth) {
        const uint16_t *const entries = lists[depth & 1];
        uint16_t *const next = lists[(depth + 1) & 1];
        uint32_t next_count = 0;
        copy_up(table, 1u << depth);
        for (uint32_t i = 0; i < going_on; ++i) {
            const HuffmanNode &node = nodes[table[entries[i]].value];
            for (uint32_t branch = 0; branch < 2; ++branch) {
                const uint32_t at = entries[i] | branch << depth;
                table[at] = entry_of(nodes, node.child[branch], depth + 1);
                if (table[at].op == code_goes_on) next[next_count++] = static_cast<uint16_t>(at);
            }
        }
        going_on = next_count;
    }
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

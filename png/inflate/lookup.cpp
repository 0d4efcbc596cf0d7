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
    return {static_cast<uint16_t>(node), code_goes_on, static_cast<uint8_t>(depth)};
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

template <uint32_t width>
void fill_lookup(Symbol (&table)[1 << width], const HuffmanNode *nodes, uint32_t root) {
    uint16_t lists[2][1 << width]; // the entries whose codes go on, of this level and of the next
    uint32_t going_on = 1;
    lists[0][0] = 0;
    table[0] = {static_cast<uint16_t>(root), code_goes_on, 0};
    for (uint32_t depth = 0; depth < width; ++depth) {
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

template void fill_lookup<lookup_width>(Symbol (&)[1 << lookup_width], const HuffmanNode *, uint32_t);
template void fill_lookup<code_length_width>(Symbol (&)[1 << code_length_width], const HuffmanNode *, uint32_t);

Symbol walk_on(const HuffmanNode *nodes, uint32_t node, uint32_t depth, size_t bits) {
    for (;; bits >>= 1) {
        node = nodes[node].child[bits & 1];
        ++depth;
        if (node == 0) return {0, code_is_missing, static_cast<uint8_t>(depth)};
        if (is_leaf(nodes[node])) return symbol_of(nodes[node]);
    }
}

} // namespace pelm

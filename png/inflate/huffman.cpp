#include "png/inflate/huffman.h"

#include <algorithm>
#include <bit>

#include "frame/memory.h"
#include "png/inflate/alphabets.h"
#include "png/inflate/coded_symbols.h"

namespace {

using namespace pelm;

// Codes are handed out by length, shorter ones first (RFC 1951, section 3.2.2); here also the symbols, sorted the same
// way.
struct Codes {
    uint32_t of_length[longest_code + 1]; // how many codes have it
    uint32_t first[longest_code + 1];     // the first code of the length
    uint16_t symbols[largest_alphabet];   // in order of length, then of symbol
    uint32_t begin[longest_code + 2];     // where a length's symbols start
};

void assign_codes(const uint8_t *code_lengths, uint32_t count, Codes &codes) {
    std::fill_n(codes.of_length, longest_code + 1, 0u);
    uint16_t coded[largest_alphabet + 1];
    const uint32_t coded_count = list_coded_symbols(code_lengths, count, coded);
    for (uint32_t i = 0; i < coded_count; ++i)
        ++codes.of_length[code_lengths[coded[i]]];
    codes.first[0] = 0;
    codes.begin[1] = 0;
    uint32_t next[longest_code + 1];
    for (uint32_t bits = 1; bits <= longest_code; ++bits) {
        codes.first[bits] = (codes.first[bits - 1] + codes.of_length[bits - 1]) << 1;
        next[bits] = codes.begin[bits];
        codes.begin[bits + 1] = codes.begin[bits] + codes.of_length[bits];
    }
    for (uint32_t i = 0; i < coded_count; ++i)
        codes.symbols[next[code_lengths[coded[i]]]++] = coded[i];
}

uint32_t new_node(HuffmanNodePool &pool) {
    if (pool.nodeCount >= HUFFMAN_POOL_NODES) return HUFFMAN_POOL_NODES - 1; // no code is as large as that
    HuffmanNode &node = pool.nodes[pool.nodeCount];
    node.child[0] = 0;
    node.child[1] = 0;
    return pool.nodeCount++;
}

// The nodes on the way to the code that was placed last. The next code of the same length shares all of it but its end.
struct Path {
    uint32_t nodes[longest_code + 1]; // [depth]
    uint32_t code;
};

uint32_t child_of(HuffmanNodePool &pool, uint32_t node, uint32_t branch) {
    if (pool.nodes[node].child[branch] == 0) {
        const uint32_t fresh = new_node(pool);
        pool.nodes[node].child[branch] = fresh;
    }
    return pool.nodes[node].child[branch];
}

// Goes down to `code`, whose upper `known` bits lead the way that the path went before.
HuffmanNode &go_to_code(HuffmanNodePool &pool, Path &path, uint32_t code, uint32_t length, uint32_t known) {
    for (uint32_t depth = known; depth < length; ++depth)
        path.nodes[depth + 1] = child_of(pool, path.nodes[depth], code >> (length - 1 - depth) & 1);
    path.code = code;
    return pool.nodes[path.nodes[length]];
}

uint32_t shared_bits(uint32_t code, uint32_t other, uint32_t length) {
    return length - static_cast<uint32_t>(std::bit_width(code ^ other));
}

void fill_leaf(HuffmanNode &leaf, uint32_t symbol, uint32_t length, HuffmanAlphabetKind kind) {
    const Payload payload = payload_of(kind, symbol);
    leaf = {payload.value, payload.op, length, {leaf.child[0], leaf.child[1]}};
}

} // namespace

HuffmanNode *__PELMI_PngBuildHuffmanTable(const uint8_t *codeLengths, uint32_t count, uint32_t kind,
                                          HuffmanNodePool *pool) {
    Codes codes;
    assign_codes(codeLengths, std::min(count, largest_alphabet), codes);
    const uint32_t root = new_node(*pool);
    Path path{};
    path.nodes[0] = root;

    // The longest codes first: in an over-subscribed code a shorter one may end on their way, and then counts for
    // nothing.
    for (uint32_t length = longest_code; length > 0; --length) {
        const uint16_t *const symbols = codes.symbols + codes.begin[length];
        for (uint32_t i = 0; i < codes.of_length[length]; ++i) {
            const uint32_t code = (codes.first[length] + i) & ((1u << length) - 1);
            const uint32_t known = i == 0 ? 0 : shared_bits(code, path.code, length);
            fill_leaf(go_to_code(*pool, path, code, length, known), symbols[i], length,
                      static_cast<HuffmanAlphabetKind>(kind));
        }
    }
    return &pool->nodes[root];
}

void PELMI_FreePNGHuffmanMemory(HuffmanNodePool **pool) {
    if (pool != nullptr) free_block(*pool);
}

#include "png/inflate/huffman.h"

#include <algorithm>

#include "frame/host.h"
#include "png/inflate/alphabets.h"

namespace {

using namespace pelm;

constexpr uint32_t longest_code = 15;
constexpr uint32_t largest_alphabet = 288;

// Codes are handed out by length, shorter ones first (RFC 1951, section 3.2.2); here also the symbols, sorted the same
// way.
struct Codes {
    uint32_t of_length[longest_code + 1]; // how many codes have it
    uint32_t first[longest_code + 1];     // the first code of the length
    uint16_t symbols[largest_alphabet];   // in order of length, then of symbol
    uint32_t begin[longest_code + 2];     // where a length's symbols start
};

void assign_codes(const uint8_t *code_lengths, uint32_t count, Codes &codes) {
    for (uint32_t &number : codes.of_length)
        number = 0;
    for (uint32_t i = 0; i < count; ++i)
        ++codes.of_length[code_lengths[i] & 15];
    codes.of_length[0] = 0;
    codes.first[0] = 0;
    codes.begin[1] = 0;
    uint32_t next[longest_code + 1];
    for (uint32_t bits = 1; bits <= longest_code; ++bits) {
        codes.first[bits] = (codes.first[bits - 1] + codes.of_length[bits - 1]) << 1;
        next[bits] = codes.begin[bits];
        codes.begin[bits + 1] = codes.begin[bits] + codes.of_length[bits];
    }
    for (uint32_t symbol = 0; symbol < count; ++symbol)
        if (code_lengths[symbol] != 0) codes.symbols[next[code_lengths[symbol] & 15]++] = static_cast<uint16_t>(symbol);
}

uint32_t new_node(HuffmanNodePool &pool) {
    if (pool.nodeCount >= HUFFMAN_POOL_NODES) return HUFFMAN_POOL_NODES - 1; // no code is as large as that
    HuffmanNode &node = pool.nodes[pool.nodeCount];
    node.child[0] = 0;
    node.child[1] = 0;
    return pool.nodeCount++;
}

HuffmanNode &node_of_code(HuffmanNodePool &pool, uint32_t root, uint32_t code, uint32_t length) {
    uint32_t at = root;
    for (uint32_t bit = length; bit-- > 0;) {
        const uint32_t branch = (code >> bit) & 1;
        if (pool.nodes[at].child[branch] == 0) {
            const uint32_t fresh = new_node(pool);
            pool.nodes[at].child[branch] = fresh;
        }
        at = pool.nodes[at].child[branch];
    }
    return pool.nodes[at];
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

    // The longest codes first, so that a shorter one that claims the same place comes last and wins it.
    for (uint32_t length = longest_code; length > 0; --length) {
        const uint16_t *const symbols = codes.symbols + codes.begin[length];
        for (uint32_t i = 0; i < codes.of_length[length]; ++i)
            fill_leaf(node_of_code(*pool, root, codes.first[length] + i, length), symbols[i], length,
                      static_cast<HuffmanAlphabetKind>(kind));
    }
    return &pool->nodes[root];
}

void PELMI_FreePNGHuffmanMemory(HuffmanNodePool **pool) {
    if (pool == nullptr || *pool == nullptr) return;
    ZOTARPELM_OsFree(*pool);
    *pool = nullptr;
}

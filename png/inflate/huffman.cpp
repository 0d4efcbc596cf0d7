#include "png/inflate/huffman.h"

#include "frame/host.h"

namespace {

// RFC 1951, section 3.2.5. Symbols that stand for a base; extra bits are stored as the leaf's `op`.
constexpr uint32_t base_symbols = 32;

constexpr uint16_t length_bases[base_symbols] = {3,  4,  5,  6,  7,  8,  9,  10,  11,  13,  15,  17,  19,  23, 27, 31,
                                                 35, 43, 51, 59, 67, 83, 99, 115, 131, 163, 195, 227, 258, 0,  0,  0};
constexpr uint8_t length_ops[base_symbols] = {16, 16, 16, 16, 16, 16, 16, 16, 17, 17, 17, 17, 18, 18,  18,  18,
                                              19, 19, 19, 19, 20, 20, 20, 20, 21, 21, 21, 21, 16, 112, 112, 0};
constexpr uint16_t distance_bases[base_symbols] = {1,    2,    3,    4,    5,    7,     9,     13,    17,  25,   33,
                                                   49,   65,   97,   129,  193,  257,   385,   513,   769, 1025, 1537,
                                                   2049, 3073, 4097, 6145, 8193, 12289, 16385, 24577, 0,   0};
constexpr uint8_t distance_ops[base_symbols] = {16, 16, 16, 16, 17, 17, 18, 18, 19, 19, 20, 20, 21, 21, 22, 22,
                                                23, 23, 24, 24, 25, 25, 26, 26, 27, 27, 28, 28, 29, 29, 16, 0};

struct AlphabetPayloadDescriptor {
    uint32_t first_payload_symbol; // this one and those above it take base and op from the tables
    const uint16_t *bases;
    const uint8_t *ops;
};

constexpr AlphabetPayloadDescriptor alphabets[] = {
    {257, length_bases, length_ops}, {0, distance_bases, distance_ops}, {20, nullptr, nullptr}};

constexpr uint32_t longest_code = 15;
constexpr uint32_t end_of_block = 256;

// The first code of each length (RFC 1951, section 3.2.2).
void first_codes(const uint8_t *code_lengths, uint32_t count, uint32_t (&next)[longest_code + 1]) {
    uint32_t of_length[longest_code + 1] = {};
    for (uint32_t i = 0; i < count; ++i)
        ++of_length[code_lengths[i] & 15];
    of_length[0] = 0;
    uint32_t code = 0;
    next[0] = 0;
    for (uint32_t bits = 1; bits <= longest_code; ++bits) {
        code = (code + of_length[bits - 1]) << 1;
        next[bits] = code;
    }
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

void fill_leaf(HuffmanNode &leaf, uint32_t symbol, uint32_t length, const AlphabetPayloadDescriptor &alphabet) {
    leaf.codeLength = length;
    leaf.value = symbol;
    leaf.op = symbol == end_of_block ? HUFFMAN_END_OF_BLOCK : HUFFMAN_LITERAL;
    if (symbol < alphabet.first_payload_symbol || alphabet.bases == nullptr) return;
    const uint32_t payload = symbol - alphabet.first_payload_symbol;
    if (payload >= base_symbols) return;
    leaf.value = alphabet.bases[payload];
    leaf.op = alphabet.ops[payload];
}

} // namespace

HuffmanNode *__PELMI_PngBuildHuffmanTable(const uint8_t *codeLengths, uint32_t count, uint32_t kind,
                                          HuffmanNodePool *pool) {
    const AlphabetPayloadDescriptor &alphabet = alphabets[kind];
    uint32_t next[longest_code + 1];
    first_codes(codeLengths, count, next);
    const uint32_t root = new_node(*pool);

    // The longest codes first, so that a shorter one that claims the same place comes last and wins it.
    for (uint32_t length = longest_code; length > 0; --length)
        for (uint32_t symbol = 0; symbol < count; ++symbol)
            if (codeLengths[symbol] == length)
                fill_leaf(node_of_code(*pool, root, next[length]++, length), symbol, length, alphabet);
    return &pool->nodes[root];
}

void PELMI_FreePNGHuffmanMemory(HuffmanNodePool **pool) {
    if (pool == nullptr || *pool == nullptr) return;
    ZOTARPELM_OsFree(*pool);
    *pool = nullptr;
}

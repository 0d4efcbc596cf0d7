// Canonical Huffman codes as explicit binary trees, all nodes out of one preallocated pool. A leaf carries what the
// symbol means: its value or base, and how many extra bits follow.
#pragma once

#include <cstddef>
#include <cstdint>

#include "frame/export.h"

// `op` of a leaf.
enum : uint32_t {
    HUFFMAN_LITERAL = 0,
    HUFFMAN_END_OF_BLOCK = 10,
    HUFFMAN_BASE = 16, // + n: a length or distance base that n extra bits follow
    HUFFMAN_INVALID = 112
};

// A node without a zero branch is a leaf: codes are canonical, so a node with a one branch has a zero branch too, even
// in over-subscribed codes.
struct HuffmanNode {
    uint32_t value; // leaves only: symbol, length base or distance base
    uint32_t op;
    uint32_t codeLength; // bits, 1 to 15
    uint32_t child[2];   // index in the pool of the node behind a 0 and a 1 bit; 0: none, for node 0 is always a root
};

constexpr uint32_t HUFFMAN_POOL_NODES = 2500;
constexpr uint32_t HUFFMAN_BLOCK_NODES = 1100; // a deflate block's two codes need fewer, whatever their lengths

struct HuffmanNodePool {
    uint32_t nodeCount; // used so far
    uint32_t capacity;
    HuffmanNode nodes[HUFFMAN_POOL_NODES];
};

static_assert(sizeof(HuffmanNode) == 20 && sizeof(HuffmanNodePool) == 50008);

enum HuffmanAlphabetKind : uint32_t { HUFFMAN_LITERAL_LENGTH = 0, HUFFMAN_DISTANCE = 1, HUFFMAN_CODE_LENGTH = 2 };

// Builds the tree of `count` code lengths (0 to 15; 0: unused symbol) behind what the pool already holds, and returns
// its root. Checks nothing: an incomplete code has missing branches; of an over-subscribed one longer codes win, and
// among equally long ones the later.
PELM_EXPORT HuffmanNode *__PELMI_PngBuildHuffmanTable(const uint8_t *codeLengths, uint32_t count, uint32_t kind,
                                                      HuffmanNodePool *pool);

// Frees the pool, if there is one, and clears the pointer.
PELM_EXPORT void PELMI_FreePNGHuffmanMemory(HuffmanNodePool **pool);

namespace pelm {

inline void reset_pool(HuffmanNodePool &pool) {
    pool.nodeCount = 0;
    pool.capacity = HUFFMAN_POOL_NODES;
}

inline bool is_leaf(const HuffmanNode &node) {
    return node.child[0] == 0;
}

} // namespace pelm

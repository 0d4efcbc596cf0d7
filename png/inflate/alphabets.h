// What the symbols of deflate's three alphabets stand for.
#pragma once

#include "png/inflate/huffman.h"

namespace pelm {

constexpr uint32_t longest_code = 15; // bits
constexpr uint32_t largest_alphabet = 288;

// RFC 1951, section 3.2.5. Symbols that stand for a base; extra bits are stored as the leaf's `op`.
constexpr uint32_t base_symbols = 32;

inline constexpr uint16_t length_bases[base_symbols] = {3,  4,   5,   6,   7,   8,   9,   10, 11, 13, 15,
                                                        17, 19,  23,  27,  31,  35,  43,  51, 59, 67, 83,
                                                        99, 115, 131, 163, 195, 227, 258, 0,  0,  0};
inline constexpr uint8_t length_ops[base_symbols] = {16, 16, 16, 16, 16, 16, 16, 16, 17, 17, 17, 17, 18, 18,  18,  18,
                                                     19, 19, 19, 19, 20, 20, 20, 20, 21, 21, 21, 21, 16, 112, 112, 0};
inline constexpr uint16_t distance_bases[base_symbols] = {
    1,   2,   3,   4,   5,    7,    9,    13,   17,   25,   33,   49,    65,    97,    129, 193,
    257, 385, 513, 769, 1025, 1537, 2049, 3073, 4097, 6145, 8193, 12289, 16385, 24577, 0,   0};
inline constexpr uint8_t distance_ops[base_symbols] = {16, 16, 16, 16, 17, 17, 18, 18, 19, 19, 20, 20, 21, 21, 22, 22,
                                                       23, 23, 24, 24, 25, 25, 26, 26, 27, 27, 28, 28, 29, 29, 16, 0};

struct AlphabetPayloadDescriptor {
    uint32_t first_payload_symbol; // this one and those above it take base and op from the tables
    uint32_t payload_symbols;
    const uint16_t *bases;
    const uint8_t *ops;
};

inline constexpr AlphabetPayloadDescriptor alphabets[] = {{257, base_symbols, length_bases, length_ops},
                                                          {0, base_symbols, distance_bases, distance_ops},
                                                          {20, 0, nullptr, nullptr}};

struct Payload {
    uint32_t value, op; // as in a leaf
};

constexpr Payload payload_of(HuffmanAlphabetKind kind, uint32_t symbol) {
    constexpr uint32_t end_of_block = 256;
    const AlphabetPayloadDescriptor &alphabet = alphabets[kind];
    const uint32_t payload = symbol - alphabet.first_payload_symbol;
    if (symbol >= alphabet.first_payload_symbol && payload < alphabet.payload_symbols)
        return {alphabet.bases[payload], alphabet.ops[payload]};
    return {symbol, symbol == end_of_block ? HUFFMAN_END_OF_BLOCK : HUFFMAN_LITERAL};
}

} // namespace pelm

// The code lengths at the head of a dynamic block.
#pragma once

#include "frame/memory.h"
#include "png/inflate/state.h"

namespace pelm {

using CodeLengthTable = Symbol[1 << code_length_width];

template <class Input>
Stop take_code_length_symbol(BitReader &bits, Input &input, const CodeLengthTable &table, uint32_t &value) {
    refill(bits, input);
    const Symbol symbol = table[bits.bits & ((1u << code_length_width) - 1)];
    if (symbol.bits > bits.count) return Stop::input_ended;
    if (symbol.op == code_is_missing) return Stop::bad_code;
    drop(bits, symbol.bits);
    value = symbol.value;
    return Stop::go_on;
}

// A run of `repeat` times `length`, as symbols 16 to 18 say. False when the input ended.
template <class Input>
bool take_run(BitReader &bits, Input &input, uint32_t symbol, uint32_t &repeat) {
    constexpr uint32_t extra_bits[3] = {2, 3, 7};
    constexpr uint32_t shortest[3] = {3, 3, 11};
    if (!take_bits(bits, input, extra_bits[symbol - 16], repeat)) return false;
    repeat += shortest[symbol - 16];
    return true;
}

template <class Input>
Stop take_code_lengths(BitReader &bits, Input &input, const CodeLengthTable &table, uint32_t total, uint8_t *lengths) {
    for (uint32_t done = 0; done < total;) {
        uint32_t symbol = 0;
        const Stop got = take_code_length_symbol(bits, input, table, symbol);
        if (got != Stop::go_on) return got;
        uint32_t repeat = 1;
        uint8_t length = static_cast<uint8_t>(symbol);
        if (symbol >= 16) {
            if (symbol == 16 && done == 0) return Stop::bad_stream;
            if (!take_run(bits, input, symbol, repeat)) return Stop::input_ended;
            if (repeat > total - done) return Stop::bad_stream;
            length = symbol == 16 ? lengths[done - 1] : uint8_t{0};
        }
        std::memset(lengths + done, length, repeat);
        done += repeat;
    }
    return Stop::go_on;
}

// Grown behind the trees of the latest block, which may serve once more.
inline void make_code_length_table(const uint8_t (&code_lengths)[19], HuffmanNodePool &pool, CodeLengthTable &table) {
    reset_pool(pool);
    pool.nodeCount = HUFFMAN_BLOCK_NODES;
    const HuffmanNode *const root = __PELMI_PngBuildHuffmanTable(code_lengths, 19, HUFFMAN_CODE_LENGTH, &pool);
    fill_lookup<code_length_width>(table, pool.nodes, static_cast<uint32_t>(root - pool.nodes));
}

template <class Input>
Stop read_dynamic_header(InflateState &state, Input &input, HuffmanNodePool *&pool) {
    constexpr uint8_t order[19] = {16, 17, 18, 0, 8, 7, 9, 6, 10, 5, 11, 4, 12, 3, 13, 2, 14, 1, 15};
    if (pool == nullptr) pool = allocate_array<HuffmanNodePool>(1);
    if (pool == nullptr) return Stop::no_memory;

    uint32_t counts = 0;
    if (!take_bits(state.bits, input, 14, counts)) return Stop::input_ended;
    CodeLengths lengths;
    lengths.literals = (counts & 31) + 257;
    // Required: 31 means no distance codes at all (docs/oddities.md, "Thirty-two distance codes").
    lengths.distances = ((counts >> 5 & 31) + 1) & 31;
    const uint32_t code_length_codes = (counts >> 10) + 4;

    uint8_t code_length_lengths[19] = {};
    for (uint32_t i = 0; i < code_length_codes; ++i) {
        uint32_t length = 0;
        if (!take_bits(state.bits, input, 3, length)) return Stop::input_ended;
        code_length_lengths[order[i]] = static_cast<uint8_t>(length);
    }
    CodeLengthTable table;
    make_code_length_table(code_length_lengths, *pool, table);
    const Stop got = take_code_lengths(state.bits, input, table, lengths.literals + lengths.distances, lengths.lengths);
    return got == Stop::go_on ? use_dynamic_codes(state, lengths, *pool) : got;
}

} // namespace pelm

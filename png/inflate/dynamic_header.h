// The code lengths at the head of a dynamic block.
#pragma once

#include "frame/memory.h"
#include "png/inflate/state.h"

namespace pelm {

// One symbol of the code-length code, walked from the root: the code is used too briefly for a table.
template <class Input>
Stop take_code_length_symbol(BitReader &bits, Input &input, const HuffmanNode *nodes, uint32_t root, uint32_t &value) {
    refill(bits, input);
    const Symbol symbol = walk_on(nodes, root, 0, bits.bits);
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
Stop take_code_lengths(InflateState &state, Input &input, const HuffmanNode *nodes, uint32_t root, uint32_t total) {
    uint8_t *const lengths = state.code_lengths;
    for (uint32_t done = 0; done < total;) {
        uint32_t symbol = 0;
        const Stop got = take_code_length_symbol(state.bits, input, nodes, root, symbol);
        if (got != Stop::go_on) return got;
        uint32_t repeat = 1;
        uint8_t length = static_cast<uint8_t>(symbol);
        if (symbol >= 16) {
            if (symbol == 16 && done == 0) return Stop::bad_stream;
            if (!take_run(state.bits, input, symbol, repeat)) return Stop::input_ended;
            if (repeat > total - done) return Stop::bad_stream;
            length = symbol == 16 ? lengths[done - 1] : uint8_t{0};
        }
        std::memset(lengths + done, length, repeat);
        done += repeat;
    }
    return Stop::go_on;
}

template <class Input>
Stop read_dynamic_header(InflateState &state, Input &input, HuffmanNodePool *&pool) {
    constexpr uint8_t order[19] = {16, 17, 18, 0, 8, 7, 9, 6, 10, 5, 11, 4, 12, 3, 13, 2, 14, 1, 15};
    if (pool == nullptr) pool = allocate_array<HuffmanNodePool>(1);
    if (pool == nullptr) return Stop::no_memory;

    uint32_t counts = 0;
    if (!take_bits(state.bits, input, 14, counts)) return Stop::input_ended;
    const uint32_t literals = (counts & 31) + 257;
    // Required: 31 means no distance codes at all (docs/oddities.md, "Thirty-two distance codes").
    const uint32_t distances = ((counts >> 5 & 31) + 1) & 31;
    const uint32_t code_length_codes = (counts >> 10) + 4;

    uint8_t code_length_lengths[19] = {};
    for (uint32_t i = 0; i < code_length_codes; ++i) {
        uint32_t length = 0;
        if (!take_bits(state.bits, input, 3, length)) return Stop::input_ended;
        code_length_lengths[order[i]] = static_cast<uint8_t>(length);
    }
    reset_pool(*pool);
    const HuffmanNode *const root = __PELMI_PngBuildHuffmanTable(code_length_lengths, 19, HUFFMAN_CODE_LENGTH, pool);
    const Stop got =
        take_code_lengths(state, input, pool->nodes, static_cast<uint32_t>(root - pool->nodes), literals + distances);
    return got == Stop::go_on ? use_dynamic_trees(state, *pool, literals, distances) : got;
}

} // namespace pelm

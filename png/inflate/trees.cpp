// A block's trees and the lookup tables in front of them.
#include "frame/memory.h"
#include "png/inflate/fixed_codes.h"
#include "png/inflate/state.h"

namespace pelm {
namespace {

uint32_t build(HuffmanNodePool &pool, const uint8_t *code_lengths, uint32_t count, HuffmanAlphabetKind kind) {
    return static_cast<uint32_t>(__PELMI_PngBuildHuffmanTable(code_lengths, count, kind, &pool) - pool.nodes);
}

// The allocation comes with the first compressed block, whatever its codes.
bool allocate_lookup(InflateState &state) {
    if (state.lookup == nullptr) state.lookup = static_cast<LookupTables *>(allocate(lookup_allocation));
    return state.lookup != nullptr;
}

} // namespace

void reset_pool(HuffmanNodePool &pool) {
    pool.nodeCount = 0;
    pool.capacity = HUFFMAN_POOL_NODES;
}

void restart(InflateState &state) {
    uint8_t *const window = state.window.bytes;
    state.window = {window, 0, 0, 0, 0};
    state.bits = {};
    state.step = Step::zlib_header;
    state.final_block = false;
    state.held = Stop::go_on;
    state.stored_left = 0;
    state.copy_length = 0;
}

Stop use_fixed_codes(InflateState &state) {
    if (!allocate_lookup(state)) return Stop::no_lookup_memory;
    state.codes = &fixed_lookup;
    state.nodes = nullptr; // no walk goes beyond the tables
    state.step = Step::symbols;
    return Stop::go_on;
}

Stop use_dynamic_trees(InflateState &state, HuffmanNodePool &pool, uint32_t literal_count, uint32_t distance_count) {
    reset_pool(pool);
    const uint32_t literal = build(pool, state.code_lengths, literal_count, HUFFMAN_LITERAL_LENGTH);
    const uint32_t distance = build(pool, state.code_lengths + literal_count, distance_count, HUFFMAN_DISTANCE);
    if (!allocate_lookup(state)) return Stop::no_lookup_memory;
    fill_lookup(state.lookup->literal, pool.nodes, literal);
    fill_lookup(state.lookup->distance, pool.nodes, distance);
    state.codes = state.lookup;
    state.nodes = pool.nodes;
    state.step = Step::symbols;
    return Stop::go_on;
}

} // namespace pelm

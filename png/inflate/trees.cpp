// A block's trees and the lookup tables in front of them.
#include "frame/host.h"
#include "png/inflate/state.h"

namespace pelm {
namespace {

void reset(HuffmanNodePool &pool) {
    pool.nodeCount = 0;
    pool.capacity = HUFFMAN_POOL_NODES;
}

uint32_t build(HuffmanNodePool &pool, const uint8_t *code_lengths, uint32_t count, HuffmanAlphabetKind kind) {
    return static_cast<uint32_t>(__PELMI_PngBuildHuffmanTable(code_lengths, count, kind, &pool) - pool.nodes);
}

Stop use_trees(InflateState &state, const HuffmanNodePool &pool, uint32_t literal_root, uint32_t distance_root) {
    if (state.lookup == nullptr) state.lookup = static_cast<LookupTables *>(ZOTARPELM_OsMalloc(lookup_allocation));
    if (state.lookup == nullptr) return Stop::no_lookup_memory;
    state.nodes = pool.nodes;
    state.literal_root = literal_root;
    state.distance_root = distance_root;
    fill_lookup(state.lookup->literal, state.nodes, literal_root);
    fill_lookup(state.lookup->distance, state.nodes, distance_root);
    state.step = Step::symbols;
    return Stop::go_on;
}

} // namespace

void restart(InflateState &state) {
    uint8_t *const window = state.window.bytes;
    state.window = {window, 0, 0, 0, 0};
    ZOTARPELM_OsMemset(window, 0, window_size);
    state.bits = {};
    state.step = Step::zlib_header;
    state.final_block = false;
    state.held = Stop::go_on;
    state.stored_left = 0;
    state.copy_length = 0;
}

bool build_fixed_trees(InflateState &state, HuffmanNodePool *&fixed) {
    if (fixed != nullptr) return true;
    fixed = static_cast<HuffmanNodePool *>(ZOTARPELM_OsMalloc(sizeof(HuffmanNodePool)));
    if (fixed == nullptr) return false;
    uint8_t *const lengths = state.code_lengths;
    for (uint32_t symbol = 0; symbol < 288; ++symbol)
        lengths[symbol] = static_cast<uint8_t>(symbol < 144 ? 8 : symbol < 256 ? 9 : symbol < 280 ? 7 : 8);
    reset(*fixed);
    state.fixed_roots[0] = build(*fixed, lengths, 288, HUFFMAN_LITERAL_LENGTH);
    for (uint32_t symbol = 0; symbol < 32; ++symbol)
        lengths[symbol] = 5;
    state.fixed_roots[1] = build(*fixed, lengths, 30, HUFFMAN_DISTANCE);
    return true;
}

Stop use_fixed_trees(InflateState &state, const HuffmanNodePool &fixed) {
    if (state.lookup_is_fixed) {
        state.step = Step::symbols;
        return Stop::go_on;
    }
    const Stop got = use_trees(state, fixed, state.fixed_roots[0], state.fixed_roots[1]);
    state.lookup_is_fixed = got == Stop::go_on;
    return got;
}

Stop use_dynamic_trees(InflateState &state, HuffmanNodePool &pool, uint32_t literal_count, uint32_t distance_count) {
    state.lookup_is_fixed = false;
    reset(pool);
    const uint32_t literal = build(pool, state.code_lengths, literal_count, HUFFMAN_LITERAL_LENGTH);
    const uint32_t distance = build(pool, state.code_lengths + literal_count, distance_count, HUFFMAN_DISTANCE);
    return use_trees(state, pool, literal, distance);
}

} // namespace pelm

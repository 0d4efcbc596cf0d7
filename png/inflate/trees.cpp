// A block's codes: decoding tables at once; trees, and the lookup tables in front of them, when something asks for
// them.
#include "frame/memory.h"
#include "frame/processor.h"
#include "png/inflate/fixed_codes.h"
#include "png/inflate/state.h"

namespace pelm {
namespace {

// The allocation comes with the first compressed block, whatever its codes.
bool allocate_tables(InflateState &state) {
    if (state.dynamic != nullptr) return true;
    state.dynamic = allocate_array<BlockCodes>(1);
    if (state.dynamic == nullptr) return false;
    state.dynamic->lengths.literals = 0;
    return true;
}

bool are_equal(const CodeLengths &a, const CodeLengths &b) {
    return a.literals == b.literals && a.distances == b.distances &&
           std::memcmp(a.lengths, b.lengths, a.literals + a.distances) == 0;
}

struct Widths {
    uint32_t literals, distances;
};

constexpr Widths widest = {widest_literal_table, widest_distance_table};

// Wide tables take longer to make than a small block takes to decode, and small blocks come one after another.
constexpr Widths for_small_blocks = {8, 7};
constexpr uint32_t small_block = 1024; // bytes, inflated

void make_tables(BlockCodes &codes, Widths widths) {
    const CodeLengths &lengths = codes.lengths;
    codes.literals = make_literal_table(lengths.lengths, lengths.literals, widths.literals, codes.literal_entries);
    codes.distances = make_distance_table(lengths.lengths + lengths.literals, lengths.distances, widths.distances,
                                          codes.distance_entries);
    if (codes.distances.entries == nullptr) codes.literals = {};
}

void use_tables(InflateState &state, const DecodingTable &literals, const DecodingTable &distances) {
    state.literals = kernels() == Kernels::careful ? DecodingTable{} : literals;
    state.distances = distances;
}

uint32_t grow_tree(HuffmanNodePool &pool, const uint8_t *code_lengths, uint32_t count, HuffmanAlphabetKind kind) {
    return static_cast<uint32_t>(__PELMI_PngBuildHuffmanTable(code_lengths, count, kind, &pool) - pool.nodes);
}

} // namespace

void restart(InflateState &state) {
    uint8_t *const window = state.window.bytes;
    state.window = {window, 0, 0, 0};
    state.bits = {};
    state.step = Step::zlib_header;
    state.final_block = false;
    state.held = Stop::go_on;
    state.stored_left = 0;
    if (state.dynamic != nullptr) state.dynamic->lengths.literals = 0;
}

Stop use_fixed_codes(InflateState &state) {
    if (!allocate_tables(state)) return Stop::no_lookup_memory;
    use_tables(state, fixed_literals, fixed_distances);
    state.codes = &fixed_lookup;
    state.nodes = nullptr; // no walk goes beyond the tables
    state.step = Step::symbols;
    return Stop::go_on;
}

Stop use_dynamic_codes(InflateState &state, const CodeLengths &lengths, HuffmanNodePool &pool) {
    if (!allocate_tables(state)) return Stop::no_lookup_memory;
    BlockCodes &codes = *state.dynamic;
    const uint32_t before = state.window.total - state.dynamic_begin; // bytes since the latest such block began
    const bool after_small_block = codes.lengths.literals != 0 && before < small_block;
    state.dynamic_begin = state.window.total;
    if (!are_equal(codes.lengths, lengths)) {
        codes.lengths = lengths;
        codes.trees_are_grown = false;
        make_tables(codes, after_small_block ? for_small_blocks : widest);
    }
    use_tables(state, codes.literals, codes.distances);
    state.codes = nullptr;
    state.pool = &pool;
    state.step = Step::symbols;
    return Stop::go_on;
}

void grow_trees(InflateState &state) {
    if (state.codes != nullptr) return;
    BlockCodes &codes = *state.dynamic;
    HuffmanNodePool &pool = *state.pool;
    if (!codes.trees_are_grown) {
        reset_pool(pool);
        const uint8_t *const lengths = codes.lengths.lengths;
        const uint32_t literals = grow_tree(pool, lengths, codes.lengths.literals, HUFFMAN_LITERAL_LENGTH);
        const uint32_t distances =
            grow_tree(pool, lengths + codes.lengths.literals, codes.lengths.distances, HUFFMAN_DISTANCE);
        fill_lookup<lookup_width>(codes.lookup.literal, pool.nodes, literals);
        fill_lookup<lookup_width>(codes.lookup.distance, pool.nodes, distances);
        codes.trees_are_grown = true;
    }
    state.codes = &codes.lookup;
    state.nodes = pool.nodes;
}

} // namespace pelm

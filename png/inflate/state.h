// What a decompression keeps between calls, where it may stop, and why it did.
#pragma once

#include "png/inflate/bits.h"
#include "png/inflate/decoding_table.h"
#include "png/inflate/lookup.h"
#include "png/inflate/window.h"

namespace pelm {

// Why the core returned. It stops only when its rows ask for it, at the end of a block, or for good.
enum class Stop : uint8_t {
    go_on,
    finished,    // the final block has ended
    block_ended, // another block has, and the caller wanted to know
    rows_done,   // the rows have what they want for now
    host_stopped,
    bad_stream, // zlib header, block type, stored length or code lengths
    bad_code,   // bits that stand for no symbol
    input_ended,
    input_ended_stored, // within a stored block
    no_memory,
    no_lookup_memory
};

// Where the core goes on. Each step starts from the record alone, so that entering it anew and coming back to it are
// the same.
enum class Step : uint8_t { zlib_header, block_header, stored, symbols, ended };

// The code lengths of a dynamic block.
struct CodeLengths {
    uint32_t literals, distances; // how many there are of each; 0 literals: no block yet
    uint8_t lengths[320];         // those of literals first
};

// What the lookup allocation holds: all that was made of the latest dynamic block's code lengths.
struct BlockCodes {
    CodeLengths lengths;
    DecodingTable literals, distances;
    bool trees_are_grown; // in the pool, and `lookup` is filled
    LookupTables lookup;
    uint32_t literal_entries[literal_table_entries];
    uint32_t distance_entries[distance_table_entries];
};

static_assert(sizeof(BlockCodes) == (sizeof(void *) == 4 ? 20828 : 20848));

struct InflateState {
    Window window;
    BitReader bits;
    Step step;
    bool final_block;
    Stop held;            // outcome that waits until the bytes before it have been delivered; go_on: none
    uint32_t stored_left; // step stored: bytes of the block still to come
    // Step symbols, of the block:
    DecodingTable literals, distances; // both or none
    const LookupTables *codes;         // for what these do not say; NULL until the trees are grown
    const HuffmanNode *nodes;          // what the codes' longer ones go on in
    BlockCodes *dynamic;               // owned; NULL until the first compressed block
    uint32_t dynamic_begin;            // window.total where the latest dynamic block began, if there was one
    HuffmanNodePool *pool;             // for its trees
};

// Puts the state to the start of a stream. Keeps what it owns.
void restart(InflateState &state);

// Take the codes of fixed blocks, or those of the lengths, for the block that begins.
Stop use_fixed_codes(InflateState &state);
Stop use_dynamic_codes(InflateState &state, const CodeLengths &lengths, HuffmanNodePool &pool);

// Sees to it that `codes` and `nodes` are those of the block.
void grow_trees(InflateState &state);

} // namespace pelm

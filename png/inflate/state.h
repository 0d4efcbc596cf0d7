// What a decompression keeps between calls, where it may stop, and why it did.
#pragma once

#include "png/inflate/bits.h"
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
enum class Step : uint8_t { zlib_header, block_header, stored, symbols, copy, ended };

struct InflateState {
    Window window;
    BitReader bits;
    Step step;
    bool final_block;
    Stop held;            // outcome that waits until the bytes before it have been delivered; go_on: none
    uint32_t stored_left; // step stored: bytes of the block still to come
    uint32_t copy_length; // step copy: of the match, still to come
    uint32_t copy_distance;
    const LookupTables *codes; // step symbols, copy: of the block
    const HuffmanNode *nodes;  // what the codes' longer ones go on in
    LookupTables *lookup;      // owned; NULL until the first compressed block
    uint8_t code_lengths[320]; // 288 literal/length, 32 distance
};

// Puts the state to the start of a stream. Keeps what it owns.
void restart(InflateState &state);

void reset_pool(HuffmanNodePool &pool);

// Take the codes of fixed blocks, or those of the code lengths, for the block that begins. `literal_count` lengths
// stand first.
Stop use_fixed_codes(InflateState &state);
Stop use_dynamic_trees(InflateState &state, HuffmanNodePool &pool, uint32_t literal_count, uint32_t distance_count);

} // namespace pelm

// The fast way through a block's symbols: does exactly what the careful loop (png/inflate/inflate.h) does for as long
// as there are `fast_input` bytes at hand and the window is not full, and hands back to it, before the symbol in
// question, whatever the decoding tables do not say.
#pragma once

#include "png/inflate/bits.h"
#include "png/inflate/decoding_table.h"
#include "png/inflate/window.h"

namespace pelm {

constexpr ptrdiff_t fast_input = 8; // bytes: what one look at the input takes

// True when the block has ended.
bool run_fast(DecodingTable literals, DecodingTable distances, BitReader &reader, const uint8_t *&next,
              const uint8_t *end, Window &window);

} // namespace pelm

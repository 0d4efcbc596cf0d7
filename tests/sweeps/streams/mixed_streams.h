// zlib streams of blocks of every kind, without a pattern.
#pragma once

#include "tests/sweeps/streams/code_sets.h"

namespace pelm::sweeps {

// Some blocks: stored ones, empty ones, fixed and dynamic ones of few and of all symbols, with matches that may reach
// back beyond the beginning. Some streams begin with most of a window. A checksum that is none follows.
Bytes mixed_stream(Random &random);

// One of at most `most` bytes, and at least a third of that.
Bytes short_mixed_stream(Random &random, size_t most);

// With a few bits, or bytes, changed.
Bytes damaged(Random &random, Bytes stream);

} // namespace pelm::sweeps

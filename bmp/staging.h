// The buffer between a stream and whoever takes the pixel array apart: where it lies, how it is filled, and how the
// data ended.
#pragma once

#include "bmp/state.h"

namespace pelm {

struct Staging {
    InputSource *input;
    uint8_t *bytes;
    int32_t capacity; // whole rows as they are stored plainly, at least one
    bool owned;       // allocated here, for a sequential source; otherwise the source's
    int32_t result;   // of the decode, once the data has ended: 1, or 5 after a failed read
};

// For a stream. Seekable ones are moved to `offset`, sequential ones are read from where they stand. False when there
// is no memory for the buffer.
bool open_staging(Staging &staging, const BmpState &state, int64_t offset);

// Reads on behind the `held` bytes at the start of the buffer, fewer than its capacity. The number of bytes that
// arrived; 0 once the data has ended: `result` says how.
int32_t fill_staging(Staging &staging, int32_t held);

void close_staging(Staging &staging);

} // namespace pelm

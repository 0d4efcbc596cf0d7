// Plainly stored rows in file order, one at a time, from memory in place or from a stream through a buffer. What a
// row's bytes mean is the caller's business.
#pragma once

#include "bmp/staging.h"

namespace pelm {

struct RowReader {
    InputSource *input;
    int32_t stride;
    int32_t current; // file row that `row` holds; one before the first one at the start
    const uint8_t *row;
    int32_t result; // of the decode, once the data has ended: 1, or 5 after a failed read

    // Memory: file offset of row 0, and how a row counts as there.
    int64_t first_row_offset;
    int32_t bytes_needed; // of each row
    int32_t bytes_behind; // that must follow the first byte of each row

    // Streams: `held` bytes from `start` on in the staging buffer, the current row among them.
    Staging staging;
    int32_t start;
    int32_t held;
};

// Starts in front of file row `first`. Streams are positioned there; a sequential one is read from where it stands.
// False when there is no memory for the row buffer.
bool open_rows(RowReader &reader, const BmpState &state, int32_t first);

// File row `index`, which is the current one or a later one. NULL once the data has ended: `result` says how.
const uint8_t *read_row(RowReader &reader, int32_t index);

void close_rows(RowReader &reader);

} // namespace pelm

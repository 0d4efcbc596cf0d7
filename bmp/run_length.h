// Rows stored as run-length codes, in file order, expanded one at a time into palette indices of a byte each, whatever
// the depth. Where a row begins is known only from the codes before it: they are always read from the first one on.
#pragma once

#include "bmp/staging.h"

namespace pelm {

// Code bytes one after another: in place in memory, or through the staging buffer. Codes may straddle its refills.
struct CodeBytes {
    const uint8_t *at, *end; // at hand
    Staging staging;         // of a stream
    bool in_memory;
};

struct RunLengthReader {
    CodeBytes codes;
    int32_t bits; // 4 or 8: what an index takes in the codes
    int32_t width;
    int32_t current; // file row that `row` holds; one before the first one at the start
    uint8_t *row;    // `width` indices
    int32_t covered; // that the codes have set of them; when the row has ended, those behind are 0
    int32_t result;  // of the decode, once the codes have run out: 1, or 5 after a failed read
};

// Whether the image's rows are codes that its depth can have. With others it is stored plainly.
bool is_run_length(const BmpState &state);

// As the functions of the same names for plain rows (bmp/row_reader.h). False also without memory for the row.
bool open_rows(RunLengthReader &reader, const BmpState &state, int32_t first);
const uint8_t *read_row(RunLengthReader &reader, int32_t index);
void close_rows(RunLengthReader &reader);

} // namespace pelm

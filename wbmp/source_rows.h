// The stored rows of a WBMP, in place in memory or one at a time in the buffer of a stream.
#pragma once

#include "wbmp/header.h"

namespace pelm {

struct SourceRows {
    InputSource *input; // of a stream: its `data` is the row buffer
    int32_t first;      // where row 0 begins, in bytes from the start of the input
    int32_t size;       // of a row, in bytes
    int32_t held;       // of a stream: the row in the buffer, -1 for none; the stream stands behind it
};

// Allocates a stream's row buffer. False without memory.
bool open_rows(SourceRows &rows, InputSource &input, const WbmpHeader &header);

// Row `index`, which lies within the input; nullptr when a stream does not deliver it. A stream's row lasts until the
// next one. Rows in between are passed over.
const uint8_t *read_row(SourceRows &rows, int32_t index);

} // namespace pelm

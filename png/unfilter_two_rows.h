// Undoing the filters of two rows at once. Within a row each pixel waits for the one before it; the second row, a pixel
// behind the first, waits for other pixels meanwhile.
#pragma once

#include <cstdint>

namespace pelm {

// Two rows, one below the other, of the same length; filter bytes are not among theirs.
struct TwoRows {
    uint8_t *first;
    uint8_t *second;
    const uint8_t *above; // the reconstructed row above the first one, or zeros
    uint32_t length;
    uint32_t distance; // to the byte on the left
    uint8_t first_filter;
    uint8_t second_filter;
};

// Whether it is faster than a row after the other: Average and Paeth, in any order, for pixels of three bytes and more,
// unless many runs of a first Paeth row are zero, which a row alone makes use of. Both rows are as they were filtered.
bool two_rows_pay(const TwoRows &rows);

// The first row below `above` and the second one below the first, in place, where two_rows_pay. Nothing outside the
// three rows is read or written. They do not overlap.
void unfilter_two_rows(const TwoRows &rows);

} // namespace pelm

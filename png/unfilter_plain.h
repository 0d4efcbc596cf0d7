// Undoing filters byte by byte: the definition that the other code is held against, and what processors without vectors
// use (but for Paeth), odd pixel sizes, and what is left of a row.
#pragma once

#include <cstdint>

namespace pelm {

enum PngFilter : uint8_t { FILTER_NONE, FILTER_SUB, FILTER_UP, FILTER_AVERAGE, FILTER_PAETH };

// A whole row in place; `distance` is that to the byte on the left, at least 1.
void unfilter_plain(uint8_t filter, uint8_t *row, const uint8_t *above, uint32_t length, uint32_t distance);

// Paeth, with runs of zeros at once (png/paeth_runs.h): the form for processors without vectors.
void unfilter_paeth_by_runs(uint8_t *row, const uint8_t *above, uint32_t length, uint32_t distance);

// The end of a row whose first `done` bytes are done. Filters 0 to 4.
void unfilter_plain_from(uint32_t done, uint8_t filter, uint8_t *row, const uint8_t *above, uint32_t length,
                         uint32_t distance);

} // namespace pelm

// Undoing filters with vectors, a pixel or a vector at a time.
#pragma once

#include <cstdint>

namespace pelm {

// unfilter_plain for filters 0 to 4 and distances 1, 2, 3, 4, 6 and 8. Nothing outside the two rows is read or written.
void unfilter_lanes(uint8_t filter, uint8_t *row, const uint8_t *above, uint32_t length, uint32_t distance);

} // namespace pelm

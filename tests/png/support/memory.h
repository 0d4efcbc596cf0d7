// The sizes of PNG's blocks that take a formula (docs/formats.md, "Memory").
#pragma once

#include <algorithm>
#include <cstdint>

namespace pelm::test {

// The colours table and the rows: `row` bytes with the filter byte, `width` pixels.
constexpr uint64_t row_buffer_bytes(uint64_t row, uint64_t width) {
    const uint64_t two_rows = 2 * (row + width);
    return 1280 + (row <= 65536 ? std::max(two_rows, 3 * row) : two_rows);
}

constexpr uint32_t window_bytes = 98608;

} // namespace pelm::test

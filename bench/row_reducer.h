// What a host does that reduces pictures with a decoder that cannot: each pixel is the average of four samples, at the
// quarter points of its footprint, and goes to RGB565. As little work as that takes: most rows are not looked at.
#pragma once

#include <cstdint>
#include <vector>

#include "bench/output.h"

namespace bench {

class RowReducer {
public:
    // As large as the box is wide, keeping the aspect.
    RowReducer(uint32_t width, uint32_t height, Box box, uint8_t *output);

    // Rows come from the top; those not wanted need not be given.
    bool wants(uint32_t y) const { return y == next_row_; }
    void add_row(uint32_t y, const uint8_t *rgb);

private:
    uint32_t sample_at(uint32_t number, uint32_t size, uint32_t scaled_size) const {
        return static_cast<uint32_t>(uint64_t{2 * number + 1} * size / (4 * uint64_t{scaled_size}));
    }
    void write_row();

    uint32_t height_, scaled_width_, scaled_height_;
    uint32_t sample_row_ = 0, next_row_; // number of the next row of samples, and the row that it is
    std::vector<uint32_t> columns_;      // two for each pixel, as offsets into a row of RGB
    std::vector<uint32_t> sums_;
    uint8_t *output_;
};

} // namespace bench

#include "bench/row_reducer.h"

#include <cstring>

namespace bench {

RowReducer::RowReducer(uint32_t width, uint32_t height, Box box, uint8_t *output)
    : height_(height), scaled_width_(static_cast<uint32_t>(box.width)), scaled_height_(height * scaled_width_ / width),
      next_row_(sample_at(0, height, scaled_height_)), sums_(size_t{3} * scaled_width_), output_(output) {
    for (uint32_t i = 0; i < 2 * scaled_width_; ++i)
        columns_.push_back(3 * sample_at(i, width, scaled_width_));
}

void RowReducer::add_row(uint32_t y, const uint8_t *rgb) {
    for (; y == next_row_; next_row_ = sample_at(sample_row_, height_, scaled_height_)) {
        for (size_t x = 0; x < scaled_width_; ++x) {
            const uint8_t *const left = rgb + columns_[2 * x], *const right = rgb + columns_[2 * x + 1];
            for (size_t i = 0; i < 3; ++i)
                sums_[3 * x + i] += uint32_t{left[i]} + right[i];
        }
        ++sample_row_;
        if (sample_row_ % 2 == 0) write_row();
    }
}

void RowReducer::write_row() {
    for (size_t x = 0; x < scaled_width_; ++x, output_ += 2) {
        const uint32_t *const sum = &sums_[3 * x];
        const auto value = static_cast<uint16_t>(sum[0] >> 5 << 11 | sum[1] >> 4 << 5 | sum[2] >> 5);
        std::memcpy(output_, &value, sizeof value);
    }
    sums_.assign(sums_.size(), 0);
}

} // namespace bench

#include "tools/line_buffer.h"

#include <algorithm>

namespace pelm_tool {

LinePlace centred_lines(const DecodeJob &job) {
    const int32_t width = job.info.outputWidth;
    const int32_t left = (static_cast<int32_t>(job.picture->width) - width) / 2;
    const int32_t top = (static_cast<int32_t>(job.picture->height) - job.info.outputHeight) / 2;
    return {job.box.width, 0, width, left, top};
}

LineBuffer::LineBuffer(Picture &picture, const LinePlace &place, int32_t lines)
    : picture_(picture), place_(place), count_(lines),
      row_bytes_(static_cast<size_t>(place.width) * picture.format->bytes),
      lines_(static_cast<size_t>(lines) * static_cast<size_t>(place.buffer_width) * picture.format->bytes) {}

uint8_t *LineBuffer::line(int32_t number) {
    const size_t pixel = static_cast<size_t>(number) * static_cast<size_t>(place_.buffer_width);
    return lines_.data() + (pixel + static_cast<size_t>(place_.column)) * picture_.format->bytes;
}

uint8_t *LineBuffer::place_of(int64_t row) {
    const int64_t y = place_.top + row;
    if (y >= static_cast<int64_t>(picture_.height)) return nullptr;
    const size_t pixel = static_cast<size_t>(y) * picture_.width + static_cast<size_t>(place_.left);
    return picture_.bytes.data() + pixel * picture_.format->bytes;
}

void LineBuffer::load(int64_t row) {
    for (int32_t i = 0; i < count_; ++i)
        if (const uint8_t *const from = place_of(row + i)) std::copy_n(from, row_bytes_, line(i));
}

void LineBuffer::store(int64_t row) {
    for (int32_t i = 0; i < count_; ++i)
        if (uint8_t *const to = place_of(row + i)) std::copy_n(line(i), row_bytes_, to);
}

} // namespace pelm_tool

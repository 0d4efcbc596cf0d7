// Which pixels of a row lie inside the caller's buffer. Positions are byte offsets in 64 bits, so that a pixel outside
// never becomes a pointer.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>

// The caller's buffer as linear memory. `size` is 0 when nothing may be written, and always fits ptrdiff_t.
struct OutputBuffer {
    uint8_t *start;
    size_t size;
};

namespace pelm {

struct Run {
    int64_t first;
    int32_t count;
};

constexpr int64_t farthest_clipped = int64_t{1} << 62;

// Of `count` pixels at position, position + step, ..., those that lie wholly within 0 .. buffer_size: always one run,
// since positions only grow or only fall. |position| is at most `farthest_clipped`; `step` is not 0 and at most 2^32
// either way.
constexpr Run clip_run(int64_t position, int64_t step, int32_t count, int32_t pixel_bytes, size_t buffer_size) {
    const int64_t last_place = static_cast<int64_t>(buffer_size) - pixel_bytes;
    if (count <= 0 || last_place < 0) return {0, 0};

    // Seen in the direction of the walk: `behind` bytes to go until the buffer begins, `ahead` until its last place.
    const int64_t behind = step > 0 ? -position : position - last_place;
    const int64_t ahead = step > 0 ? last_place - position : position;
    const int64_t stride = step > 0 ? step : -step;
    if (ahead < 0) return {0, 0};
    // NOLINTBEGIN(clang-analyzer-core.DivideZero): not seen across the pixel formats
    const int64_t first = behind > 0 ? (behind - 1) / stride + 1 : 0;
    const int64_t end = std::min<int64_t>(count, ahead / stride + 1);
    // NOLINTEND(clang-analyzer-core.DivideZero)
    return first < end ? Run{first, static_cast<int32_t>(end - first)} : Run{0, 0};
}

} // namespace pelm

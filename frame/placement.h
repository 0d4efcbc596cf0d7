// Where an image goes in the caller's buffer: rotation, size after scaling, position of its first pixel and the steps
// from there.
#pragma once

#include <algorithm>
#include <cstdint>
#include <limits>

#include "PelmImageDecoder.h"
#include "frame/clip.h"

namespace pelm {

struct Size {
    int32_t width, height; // pixels
};

// Clockwise degrees: 0, 90, 180 or 270.
constexpr int32_t rotation_of(uint32_t flags) {
    return static_cast<int32_t>((flags & PELM_ROTATE_MASK) >> 2) * 90;
}

constexpr bool turns_sideways(int32_t rotation) {
    return rotation == 90 || rotation == 270;
}

constexpr uint32_t placement_mode(uint32_t flags) {
    return flags & PELM_PLACE_MASK;
}

// All in pixels of the buffer, counted through linear memory.
struct Placement {
    int64_t first;      // index of the image's first pixel; may lie outside the buffer
    int64_t row_step;   // to the image's next row
    int64_t pixel_step; // to the next pixel of a row
};

// Centres an image of size `scaled` (in its own orientation) in a buffer, rounding the margins down.
Placement place(int32_t rotation, Size buffer, Size scaled);

// The same in bytes.
struct BytePlacement {
    intptr_t first;
    int32_t row_step, pixel_step;
};

// How far from the buffer's start, either way, a first pixel may lie: the walk over all rows stays in range from there,
// in 64 bits.
constexpr int64_t farthest_position = std::min<int64_t>(std::numeric_limits<intptr_t>::max(), farthest_clipped);

// False when it does not fit that record, or lies too far.
bool place_bytes(int32_t rotation, Size buffer, Size scaled, int32_t pixel_bytes, BytePlacement &placement);

} // namespace pelm

// The placement table that the decoders share. Margins are halved by arithmetic shifts: a negative one, which a turned
// image in a buffer of its unturned size has, is rounded down too.
#include "frame/placement.h"

#include <cstdlib>
#include <limits>

namespace pelm {

Placement place(int32_t rotation, Size buffer, Size scaled) {
    const int64_t ow = buffer.width;
    const int64_t oh = buffer.height;
    const int64_t sw = scaled.width;
    const int64_t sh = scaled.height;
    switch (rotation) {
    case 90: return {sh - 1 + ((ow - sh) >> 1) + ow * ((oh - sw) >> 1), -1, ow};
    case 180: return {sw - 1 + ((ow - sw) >> 1) + ow * (sh - 1 + ((oh - sh) >> 1)), -ow, -1};
    case 270: return {((ow - sh) >> 1) + ow * (sw - 1 + ((oh - sw) >> 1)), 1, -ow};
    default: return {((ow - sw) >> 1) + ow * ((oh - sh) >> 1), ow, 1};
    }
}

bool place_bytes(int32_t rotation, Size buffer, Size scaled, int32_t pixel_bytes, BytePlacement &placement) {
    const Placement pixels = place(rotation, buffer, scaled);
    const int64_t row_step = pixels.row_step * pixel_bytes;
    const int64_t pixel_step = pixels.pixel_step * pixel_bytes;
    constexpr int64_t longest_step = std::numeric_limits<int32_t>::max(); // either way: steps can be turned round
    if (std::abs(pixels.first) > farthest_position / pixel_bytes || std::abs(row_step) > longest_step ||
        std::abs(pixel_step) > longest_step)
        return false;
    placement = {static_cast<intptr_t>(pixels.first * pixel_bytes), static_cast<int32_t>(row_step),
                 static_cast<int32_t>(pixel_step)};
    return true;
}

} // namespace pelm

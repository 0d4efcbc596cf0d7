// The placement table that the decoders share. Margins are halved by arithmetic shifts: a negative one, which a turned
// image in a buffer of its unturned size has, is rounded down too.
#include "frame/placement.h"

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

} // namespace pelm

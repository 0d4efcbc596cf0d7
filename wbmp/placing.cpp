#include "wbmp/placing.h"

#include "frame/single.h"

namespace pelm {

// Required: the flags count as a whole, so that any other bit beside PELM_PLACE_STRETCH makes the image fit, and
// neither PELM_PLACE_EXACT nor a rotation means anything (docs/oddities.md, "WBMP flags").
WbmpScaling scale_wbmp(Size image, Size box, uint32_t flags) {
    if (box.width <= 0 || box.height <= 0) return {{0, 0}, false};
    if (flags == PELM_PLACE_STRETCH) return {box, false};
    if (image.height <= box.height && image.width <= box.width) return {image, true};

    // One side of the image exceeds the box. So neither divisor is 0, and no result above 2^28: single precision may
    // take the wrong one of two nearly equal ratios (docs/oddities.md, "Huge WBMP sizes"), but no other.
    const bool is_higher = single_quotient(image.width, box.width) < single_quotient(image.height, box.height);
    if (is_higher) return {{static_cast<int32_t>(int64_t{box.height} * image.width / image.height), box.height}, false};
    return {{box.width, static_cast<int32_t>(int64_t{box.width} * image.height / image.width)}, false};
}

// Required: odd margins put the larger half left and above, unlike the other formats (docs/oddities.md, "WBMP
// margins").
int64_t first_pixel(Size box, Size scaled) {
    const int64_t x = (int64_t{box.width} - scaled.width + 1) >> 1;
    const int64_t y = (int64_t{box.height} + 1 - scaled.height) >> 1;
    return box.width * y + x;
}

} // namespace pelm

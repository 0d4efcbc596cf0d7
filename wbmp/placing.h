// How large a WBMP becomes, and where it goes in the caller's buffer.
#pragma once

#include "frame/placement.h"

namespace pelm {

struct WbmpScaling {
    Size size;       // in the output; a side may be 0 or, in an empty box, negative
    bool one_to_one; // pixel for pixel; otherwise through sample points, also at the image's own size
};

WbmpScaling scale_wbmp(Size image, Size box, uint32_t flags);

// The first pixel's index in the buffer. Negative where rounding has made the image larger than its box.
int64_t first_pixel(Size box, Size scaled);

} // namespace pelm

// How large a BMP becomes in the box it is given.
#pragma once

#include "frame/placement.h"

namespace pelm {

struct Scaling {
    Size size;       // in the image's own orientation; sides may be 0 or below when the box's are
    bool one_to_one; // pixel for pixel
};

// `box` is measured in the image's orientation. False when a side does not fit 32 bits, or when an image without rows
// does not fit the box.
bool scale_to_box(Size image, Size box, bool stretch, Scaling &scaling);

} // namespace pelm

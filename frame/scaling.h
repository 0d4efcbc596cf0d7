// How large an image becomes in the box it is given, as BMP and GIF compute it.
#pragma once

#include "frame/placement.h"

namespace pelm {

// In the image's own orientation. Sides may be 0 or below, and beyond 32 bits, when the box's are below 0.
struct Scaling {
    int64_t width, height;
    bool one_to_one; // pixel for pixel

    // False when a side does not fit 32 bits.
    bool narrow_to(Size &size) const;
};

// Reduces the image to fit the box with its aspect kept; never enlarges. `box` is measured in the image's orientation,
// and neither side of the image is 0.
Scaling scale_to_fit(Size image, Size box);

} // namespace pelm

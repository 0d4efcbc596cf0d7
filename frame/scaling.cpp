#include "frame/scaling.h"

#include "frame/sizes.h"

namespace pelm {

bool Scaling::narrow_to(Size &size) const {
    if (!fits_int32(width) || !fits_int32(height)) return false;
    size = {static_cast<int32_t>(width), static_cast<int32_t>(height)};
    return true;
}

Scaling scale_to_fit(Size image, Size box) {
    if (box.width >= image.width && box.height >= image.height) return {image.width, image.height, true};

    // The side that follows when the other one takes the box's.
    const int64_t width_for_box_height = static_cast<int64_t>(image.width) * box.height / image.height;
    const int64_t height_for_box_width = static_cast<int64_t>(image.height) * box.width / image.width;
    // Where either is the box's too, the box is no larger than the image, whichever sides it has.
    if (height_for_box_width == box.height || width_for_box_height == box.width) return {box.width, box.height, false};

    Scaling scaling = {image.width, image.height, false};
    if (box.width < scaling.width) {
        scaling.width = box.width;
        scaling.height = height_for_box_width;
    }
    if (box.height < scaling.height) {
        scaling.width = width_for_box_height;
        scaling.height = box.height;
    }
    return scaling;
}

} // namespace pelm

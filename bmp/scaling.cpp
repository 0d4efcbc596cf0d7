#include "bmp/scaling.h"

#include "frame/sizes.h"

namespace pelm {

bool scale_to_box(Size image, Size box, bool stretch, Scaling &scaling) {
    if (stretch) {
        scaling = {box, false};
        return true;
    }
    if (box.width >= image.width && box.height >= image.height) {
        scaling = {image, true};
        return true;
    }
    if (image.height == 0) return false;

    // The side that follows when the other one takes the box's.
    const int64_t width_for_box_height = static_cast<int64_t>(image.width) * box.height / image.height;
    const int64_t height_for_box_width = static_cast<int64_t>(image.height) * box.width / image.width;
    const bool fills_the_box = (height_for_box_width == box.height || width_for_box_height == box.width) &&
                               box.width <= image.width && box.height <= image.height;
    if (fills_the_box) {
        scaling = {box, false};
        return true;
    }

    int64_t width = image.width;
    int64_t height = image.height;
    if (box.width < width) {
        width = box.width;
        height = height_for_box_width;
    }
    if (box.height < height) {
        width = width_for_box_height;
        height = box.height;
    }
    if (!fits_int32(width) || !fits_int32(height)) return false;
    scaling = {{static_cast<int32_t>(width), static_cast<int32_t>(height)}, false};
    return true;
}

} // namespace pelm

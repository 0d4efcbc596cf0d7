// What a decode is given to write into: the box that the user asked for, and a picture filled with the background.
#pragma once

#include "tools/image_description.h"
#include "tools/options.h"
#include "tools/pixels.h"

namespace pelm_tool {

// The image's size over the divisor, at least 1 x 1.
Box divided(const ImageDescription &image, int32_t divisor);

Box box_for(const Options &options, const ImageDescription &image);

std::string size_words(int64_t width, int64_t height);

void refuse_huge(const Box &box, const PixelFormat &format); // throws Failure

Picture blank_picture(const Options &options, int32_t width, int32_t height); // throws Failure

} // namespace pelm_tool

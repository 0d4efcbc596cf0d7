// Plays a GIF once: decodes its frames one after the other, each composed with those before it.
#pragma once

#include <functional>

#include "tools/decode.h"

namespace pelm_tool {

// A composed frame; `index` counts from 0, `delay` is for how many milliseconds to show it.
using TakeFrame = std::function<void(const Picture &picture, size_t index, uint32_t delay)>;

// Hands over the frame that the options choose, or all of them. Throws Failure, also where only a part was handed over.
Remarks play(Input &input, const ImageFormat &image, const ImageDescription &description, const Options &options,
             Session &session, const TakeFrame &take);

} // namespace pelm_tool

// The driver behind all public calls: sets up on the first call, goes on with the decode on later ones.
#pragma once

#include "png/state.h"

namespace pelm {

enum class CallStyle : uint8_t { one_shot, iterative, line };

// `rows`: how many to decode in this call; 0: the limit of an earlier call stays; below 0: no limit. Internal codes.
uint32_t drive_png(ImageDecodeInfo &info, void *output, int32_t boxWidth, int32_t boxHeight, int32_t rows,
                   CallStyle style);

} // namespace pelm

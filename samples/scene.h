// The sample picture: a sunset at sea. Nothing in it is symmetric, so that every turn and mirroring shows.
#pragma once

#include "samples/picture.h"

namespace pelm_samples {

Drawing draw_scene(); // 320 x 240

} // namespace pelm_samples

// The sample picture: a sunset at sea. Nothing in it is symmetric, so that every turn and mirroring shows.
#pragma once

#include "samples/picture.h"

namespace pelm_samples {

// What moves.
struct Moment {
    int beam_rise = 20; // of the lighthouse's beam, in hundredths of its length
    int sailed = 0;     // by the boat to the left, in pixels
};

Drawing draw_scene(Moment moment = {}); // 320 x 240

} // namespace pelm_samples

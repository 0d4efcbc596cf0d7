// giflib as a peer: decodes from memory into a buffer of the caller that is as large as the screen.
#pragma once

#include <cstdint>
#include <vector>

#include "bench/png_peers.h"

namespace bench {

// The first image, its transparent pixels in their colour; the rest of the file is not looked at.
bool giflib_decode(const std::vector<uint8_t> &gif, Target target, uint8_t *output);

// Every frame: composed on a screen of its own and copied whole to the buffer, as callers get it that hand over another
// buffer each time. Disposal is not looked at: for animations that keep what they have painted.
bool giflib_decode_frames(const std::vector<uint8_t> &gif, Target target, uint8_t *output);

} // namespace bench

// Other decoders, which decode from memory: to RGBA into a buffer of the caller, if nothing else is said.
#pragma once

#include <cstdint>
#include <vector>

#include "bench/output.h"

namespace bench {

bool libpng_decode(const std::vector<uint8_t> &file, uint8_t *output);
bool spng_decode(const std::vector<uint8_t> &file, uint8_t *output);

// The first image, its transparent pixels in their colour; the rest of the file is not looked at.
bool giflib_decode(const std::vector<uint8_t> &file, uint8_t *output);

// Every frame: composed on a screen of its own and copied whole to the buffer, as callers get it that hand over another
// buffer each time. Disposal is not looked at: for animations that keep what they have painted.
bool giflib_decode_frames(const std::vector<uint8_t> &file, uint8_t *output);

// To RGB565, reduced to the box by bench/row_reducer.h, row by row as they come.
bool libpng_reduce(const std::vector<uint8_t> &file, Box box, uint8_t *output);
bool giflib_reduce(const std::vector<uint8_t> &file, Box box, uint8_t *output);

// Into a buffer of its own; all frames of a GIF to one buffer each.
bool stb_decode(const std::vector<uint8_t> &file);
bool stb_decode_frames(const std::vector<uint8_t> &gif);

} // namespace bench

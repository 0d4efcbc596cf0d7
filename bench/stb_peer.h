// stb_image as a peer: a decode from memory to RGBA into a buffer of its own.
#pragma once

#include <cstdint>
#include <vector>

namespace bench {

bool stb_decode_rgba(const std::vector<uint8_t> &file);

// All frames of a GIF, each to a buffer of its own.
bool stb_decode_frames(const std::vector<uint8_t> &gif);

} // namespace bench

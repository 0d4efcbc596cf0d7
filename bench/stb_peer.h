// stb_image as a peer: a decode from memory to RGBA into a buffer of its own.
#pragma once

#include <cstdint>
#include <vector>

namespace bench {

bool stb_decode_rgba(const std::vector<uint8_t> &file);

} // namespace bench

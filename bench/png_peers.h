// libpng and libspng as peers: decodes from memory into a buffer of the caller.
#pragma once

#include <cstdint>
#include <vector>

namespace bench {

// The peers know no RGB565: they decode to 8 bits per channel, and each row is packed, or blended, from there.
enum class Target { rgba, rgb565 };

bool libpng_decode(const std::vector<uint8_t> &file, Target target, uint8_t *output);
bool spng_decode(const std::vector<uint8_t> &file, Target target, uint8_t *output);

} // namespace bench

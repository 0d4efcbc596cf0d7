// Mutates PNG files so that they stay PNG files: every chunk has its length and its CRC, without which the decoder
// would see nothing of what was changed.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace pelm::fuzz {

using Bytes = std::vector<uint8_t>;

// At most `most` bytes.
Bytes mutate_png(const Bytes &file, size_t most, uint32_t seed);

} // namespace pelm::fuzz

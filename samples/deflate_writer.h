// A zlib stream of blocks with the fixed codes, made the same way for ever: no compression library's version shows in
// the samples.
#pragma once

#include <cstdint>
#include <span>
#include <vector>

namespace pelm_samples {

// `pieces` become one block each.
std::vector<uint8_t> zlib_stream(std::span<const std::vector<uint8_t>> pieces);

} // namespace pelm_samples

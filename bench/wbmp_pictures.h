// WBMPs made at start.
#pragma once

#include <cstdint>
#include <vector>

namespace bench {

// A page: white with dithered patches, and runs of black.
std::vector<uint8_t> wbmp_page(uint32_t width, uint32_t height);

} // namespace bench

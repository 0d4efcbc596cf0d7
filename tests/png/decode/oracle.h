// Whole decodes beside libpng's.
#pragma once

#include <span>

#include "tests/png/decode/decoding.h"

namespace pelm::test {

// At the picture's own size, by every call, line calls of `rows` rows. Empty when both read the same pixels.
std::string disagreement_with_libpng(const Bytes &file, std::span<const uint32_t> kinds, int32_t rows);

} // namespace pelm::test

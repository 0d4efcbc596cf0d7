// Rows of bytes that stand for sixteen colours at most, as in text and small pictures: sixteen pixels at once.
#pragma once

#include <cstdint>

namespace pelm {

// Writes as many of `count` pixels of `size` bytes, 2 or 4, as it can in groups of sixteen, and returns how many: up to
// the first sample of 16 or more, and none where this processor has no shuffles. A pixel is the first bytes of a word.
int32_t write_sixteen_colours(const uint32_t *colours, int32_t size, const uint8_t *samples, int32_t count,
                              uint8_t *out);

} // namespace pelm

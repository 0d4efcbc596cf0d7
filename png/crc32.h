// The checksum of PNG chunks (PNG specification, annex D).
#pragma once

#include <cstddef>

#include "frame/export.h"

namespace pelm {

constexpr uint32_t crc32_polynomial = 0xEDB88320; // reflected
constexpr uint32_t crc32_start = 0xFFFFFFFF;

// Goes on over `length` bytes; the checksum of all bytes so far is the complement.
uint32_t crc32_go_on(uint32_t crc, const uint8_t *bytes, size_t length);

} // namespace pelm

PELM_EXPORT uint32_t __PELMI_PngCrc32(const uint8_t *bytes, uint32_t length);

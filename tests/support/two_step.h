// A BMP decode in two steps, as a graphics library makes it.
#pragma once

#include "tests/support/bmp_check.h"

namespace pelm::test {

// The source gets a staging buffer of `bufferSize` bytes from the host, where its kind wants one.
void give_staging(InputSource &source);

// Both steps with these calls' box; 0 when a step fails. Words of the request that the first step sets are set back.
BmpCalls two_steps(const BmpRequest &request, int32_t divisor = 1);

} // namespace pelm::test

// Carries a plan out: makes the calls on a request, with buffers of exactly the size that each is told, and ends the
// program when a promise is broken.
#pragma once

#include "fuzz/plan.h"

namespace pelm::fuzz {

void carry_out(const Plan &plan);

} // namespace pelm::fuzz

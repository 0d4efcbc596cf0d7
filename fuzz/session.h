// Carries a plan out: makes the calls on a request, with buffers of exactly the size that each is told, and ends the
// program when a promise is broken.
#pragma once

#include <vector>

#include "fuzz/account.h"
#include "fuzz/request_model.h"

namespace pelm::fuzz {

// What can be seen of a decode, or of a sequence of calls.
struct Outcome {
    std::vector<int32_t> results;
    std::vector<Sides> scaled;    // after each call, as far as it is known by then
    std::vector<uint64_t> pixels; // where the plan looks at them, after each call: all buffers so far, hashed
    bool wrote_anything = false;  // the same: a byte of a buffer is another one than before
    bool operator==(const Outcome &) const = default;
};

struct Report {
    Outcome outcome;
    Outcome again; // of a plan that goes on with a second decode
    std::vector<Service> services;
    uint64_t calls = 0; // made, all in all
};

Report carry_out(const Plan &plan);

} // namespace pelm::fuzz

// Files changed here and there.
#pragma once

#include "tests/sweeps/inputs.h"
#include "tests/sweeps/random.h"

namespace pelm::sweeps {

// One to four changes: a byte or a bit, a few bytes left out, doubled, moved in or cut off at the end. The first `kept`
// bytes stay as they are in most files.
Bytes mutated(Random &random, Bytes file, size_t kept);

// The inputs of one format.
std::vector<Input> inputs_of(const std::vector<Input> &inputs, fuzz::Format format);

} // namespace pelm::sweeps

// From a way to decode to a plan that fuzz/session.h carries out: with the checks of fuzzing, but over chosen cases.
#pragma once

#include "fuzz/session.h"
#include "tests/sweeps/decodes.h"

namespace pelm::sweeps {

// To its end, from a host that behaves.
fuzz::Plan plan_of(const Decode &decode, const Setting &setting);

// `count` plans that go through all ways of the input, all output formats and many settings, the next to the last.
std::vector<fuzz::Plan> plans_of(const Input &input, size_t count);

} // namespace pelm::sweeps

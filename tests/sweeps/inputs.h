// Files of every format and kind, small and as large as the samples, sound and cut short.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "fuzz/plan.h"
#include "tests/support/bmp_builder.h"

namespace pelm::sweeps {

using test::Bytes;

struct Input {
    std::string name;
    fuzz::Format format; // gif for animations too
    int32_t width, height;
    Bytes bytes;
};

// Of the builders: every depth and colour type, every kind of frame; a few hundred pixels each.
// They fit sides of 15 and more.
std::vector<Input> small_inputs(int32_t width = 23, int32_t height = 19);

// Of some tens to a few hundred bytes.
std::vector<Input> tiny_inputs();

// These, with the last third missing.
std::vector<Input> cut_short(std::vector<Input> inputs);

// The files in samples/.
std::vector<Input> sample_inputs();

} // namespace pelm::sweeps

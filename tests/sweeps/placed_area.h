// Where in its buffer a decode may write at most, by what the documents say.
#pragma once

#include "tests/sweeps/decodes.h"

namespace pelm::sweeps {

struct Area {
    int32_t left, top, width, height;
};

// What decides it: the scaled size as the request has it, and the buffer's in pixels.
struct Placing {
    const Decode *decode;
    const Setting *setting;
    int32_t scaled_width, scaled_height;
    int32_t buffer_width, buffer_height;
};

// The centred, turned rectangle; for line calls the rows of one call.
Area placed_area(const Placing &placing);

// Decodes that write elsewhere in the buffer too, each with its entry in docs/oddities.md.
struct Exception {
    const char *oddity;
    bool (*holds)(const Placing &placing);
    // What may stand in this row outside the placed area; NULL: anything.
    bool (*allows)(const Area &placed, int32_t row, uint8_t byte) = nullptr;
};
std::span<const Exception> exceptions_of(fuzz::Format format);

// The one that holds, or NULL.
const Exception *exception_for(const Placing &placing);

} // namespace pelm::sweeps

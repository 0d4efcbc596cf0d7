// What must come out the same in more than one way, and why some ways are left out.
#pragma once

#include <string>

#include "tests/sweeps/decodes.h"

namespace pelm::sweeps {

// A further way for an input and a setting, beside one call from memory.
struct OtherWay {
    const fuzz::Call *call;
    uint32_t kind;
    int32_t rows = 0; // per call
};

// All of them. `thoroughly`: rows of every number up to the image's.
std::vector<OtherWay> other_ways(const Input &input, fuzz::Format calls, bool thoroughly);

// Of calls that write a band to the start of a buffer of its own, unturned; the others leave one buffer.
bool gives_bands(const OtherWay &way, const Input &input, const Setting &setting, const Reply &scaled);

// The entry in docs/oddities.md (or docs/formats.md) that makes the other way come out differently; "" when the same is
// demanded of it. `scaled` is what one call answered.
std::string exception_of(const OtherWay &way, const Input &input, const Setting &setting, const Reply &scaled);

} // namespace pelm::sweeps

// The files of samples/.
#pragma once

#include <string>
#include <vector>

#include "tests/support/bytes.h"

namespace pelm::test {

struct Sample {
    std::string name;
    Bytes bytes;
    bool ends_with(const char *ending) const { return name.ends_with(ending); }
};

std::vector<Sample> samples();

struct SampleSize {
    uint32_t width, height;
};

// As its header says.
SampleSize size_of(const Sample &sample);

} // namespace pelm::test

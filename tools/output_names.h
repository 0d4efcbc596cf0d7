// Where the output of each input goes, and of which type it is.
#pragma once

#include <string>
#include <vector>

#include "tools/options.h"

namespace pelm_tool {

struct OutputName {
    std::string path;
    OutputType type;
};

// One for each input, in their order. Throws Failure when names or types cannot be told, or coincide.
std::vector<OutputName> output_names(const Options &options);

} // namespace pelm_tool

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

// For the frames of the only input: %n is the number of the frame, and files in a folder get it behind their name.
// Throws Failure as above, and where all frames would have the same name.
OutputName frame_output_name(const Options &options, size_t frame);

} // namespace pelm_tool

// What can be told of run-length codes only by reading them.
#pragma once

#include "tools/bytes.h"
#include "tools/image_description.h"

namespace pelm_tool {

// Adds to a description with `run_length_bits`: rows that the codes do not end are missing, and moves are not made.
void describe_codes(ImageDescription &description, Bytes file);

} // namespace pelm_tool

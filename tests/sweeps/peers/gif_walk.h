// What a GIF file holds up to its first image, and which codes the image's data is made of.
#pragma once

#include "tests/sweeps/inputs.h"

namespace pelm::sweeps {

struct GifWalk {
    bool has_unknown_extension = false; // before the image
    uint8_t min_code_size = 0;
    bool has_unknown_code = false; // before the last pixel: one that is not in the table, nor the next to come there
};

// Of a file whose first image some reader has read.
GifWalk walk_to_the_first_image(const Bytes &file);

} // namespace pelm::sweeps

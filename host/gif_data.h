// How far the decoder reads the image data of a GIF, and how many pixels it finds there.
#pragma once

#include <cstdint>

#include "host/gif_reader.h"

namespace pelm::host {

// Follows the codes from the first sub-block on until they stand for `wanted` pixels, or end. Leaves the reader behind
// the last byte used. Returns the number of pixels, which may exceed what is wanted.
uint64_t follow_gif_data(GifReader &reader, uint32_t min_code_size, uint64_t wanted);

} // namespace pelm::host

// Where the image data lies: one entry per IDAT chunk.
#pragma once

#include "png/reader.h"

namespace pelm {

// Adds the chunk whose data begins at the read position. False without memory; the index may be gone then.
bool index_idat(PngDecodeState &state, const PngInputBuffer &input, uint32_t length);

} // namespace pelm

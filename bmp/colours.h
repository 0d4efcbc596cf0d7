// Where the colours of a BMP's pixels come from: the palette up to 8 bits per pixel, the masks at 16.
#pragma once

#include "bmp/header.h"
#include "bmp/state.h"

namespace pelm {

// Reads what stands between the header and the pixels, by the header's bit count, compression and pixel offset, into
// the record. Streams must stand behind the 54 header bytes. In two steps what does not arrive counts as zeros.
SetUp read_colours(BmpState &state, const BmpHeader &header, InputSource &input, Calls calls);

} // namespace pelm

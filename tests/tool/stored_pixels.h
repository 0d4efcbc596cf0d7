// What the pixels of a well-formed BMP or WBMP mean, read pixel by pixel and sharing nothing with the library.
#pragma once

#include "tests/tool/image_files.h"

namespace pelm::test {

// Headers of 40 bytes, uncompressed or with masks at 16 bits. 5- and 4-bit channels are shifted to the top of 8 bits,
// and their low bits are 0. Every pixel is opaque.
Image stored_image(const Bytes &bmp);

// A WBMP: opaque black and white. The header's integers may be of any length.
Image stored_wbmp_image(const Bytes &wbmp);

} // namespace pelm::test

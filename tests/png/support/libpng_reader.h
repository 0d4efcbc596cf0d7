// Pixels of PNG files as libpng reads them.
#pragma once

#include <optional>

#include "tests/png/support/deflate_builder.h"

namespace pelm::test {

struct LibpngPicture {
    uint32_t width, height;
    uint8_t depth, colour_type; // as stored
    bool is_interlaced;
    Bytes rgba; // 16 bits cut, everything else expanded
};

// Nothing for what libpng refuses, and for more than 2^22 pixels. Image data's checksums need not be right.
std::optional<LibpngPicture> read_with_libpng(const Bytes &file);

// What this library states to make of the picture otherwise: grey of 2 and 4 bits is widened with ones, and below 8
// bits no transparent grey is looked for (docs/oddities.md, "Narrow grey", "Colour keys of narrow grey images").
void as_this_library_widens(LibpngPicture &picture);

} // namespace pelm::test

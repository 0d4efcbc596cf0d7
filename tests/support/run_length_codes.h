// Run-length codes of BMP files: written by an encoder that knows every code, and expanded by the rules as they are
// stated, byte by byte.
#pragma once

#include "tests/support/bmp_builder.h"

namespace pelm::test {

// What an encoder does beyond the plain minimum.
struct CodeHabits {
    bool leaves_out = false; // indices of 0 at a row's end are not written
    bool overshoots = false; // codes may go on behind the row's width
    bool deltas = false;     // moves here and there
    bool ends_often = false; // rows may end like the bitmap
    bool ends_bitmap = true; // an end of the bitmap follows the last row
};

// `rows` in file order, of palette indices; `bits` is 8 or 4. Which code is taken where is left to the noise.
Bytes run_length_codes(const Picture &rows, int bits, Noise &noise, const CodeHabits &habits);

// Up to `most` rows of `width` indices, in file order: those that are ended before the codes run out.
Picture expanded_rows(const Bytes &codes, int bits, int32_t width, int32_t most);

// A file of these codes, of 8 or 4 bits.
BmpFile run_length_bmp(int bits, int32_t width, int32_t height, Bytes codes, Bytes palette);

// A plain 8-bit file whose pixels are those of the expanded rows. When codes have run out, its last rows are missing.
struct PlainTwin {
    BmpFile file;
    size_t length; // bytes that are there
};
PlainTwin plain_twin(const BmpFile &file, const Bytes &codes);

} // namespace pelm::test

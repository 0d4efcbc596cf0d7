// The decoding loop for data as encoders write it.
#pragma once

#include "gif/lzw/loop.h"

namespace pelm {

enum class FastFill {
    full,     // a row waits
    ended,    // the image ends before: `ending` tells how
    irregular // nothing of the next code has been used: only the careful loop can go on
};

// Does exactly what the careful loop does, but that up to seven pixels behind the waiting ones are overwritten. Its
// tables are those of gif/lzw/fast_strings.h, and each entry's `prefix`.
FastFill fill_row_fast(Lzw &lzw, int32_t width);

} // namespace pelm

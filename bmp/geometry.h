// How large an image becomes in the caller's buffer, where its first pixel goes, and the steps from there.
#pragma once

#include "bmp/header.h"
#include "bmp/state.h"
#include "frame/placement.h"

namespace pelm {

// What the caller wants the image to be written to, and how.
struct Target {
    Size box;
    uint32_t flags;
    void *output;
};

// Fills in the record's geometry and the start of the decode in the request. The image's size must be known.
SetUp set_geometry(BmpState &state, ImageDecodeInfo &info, const Target &target);

// Moves the cursor on by so many image rows. A row may begin far outside the buffer and still end in it; only where 64
// bits cannot tell the place any more nothing is written from then on.
void advance_cursor(BmpState &state, int32_t rows);

// The place that `cursor` stands for, with what a cursor of 32 bits has no room for.
int64_t band_cursor(const BmpState &state, intptr_t cursor);

} // namespace pelm

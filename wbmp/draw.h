// From stored rows of bits to pixels in the caller's buffer, pixel for pixel or through sample points.
#pragma once

#include "frame/clip.h"
#include "frame/placement.h"
#include "wbmp/source_rows.h"

namespace pelm {

// 0 for a format that WBMP does not write.
int32_t wbmp_pixel_bytes(uint32_t format);

// The image and its place. No side is 0, and the format is one that is written.
struct WbmpDrawing {
    SourceRows rows;
    Size image, scaled;
    OutputBuffer output;
    int64_t position; // of the first pixel, in bytes
    int64_t row_step; // bytes
    uint32_t format;
};

// Black and white. The image lies wholly inside the buffer. False when a row is not delivered.
bool copy_rows(WbmpDrawing &drawing);

// Five levels of grey. Each of the two blocks of `sums` has an entry per scaled column, for the samples of one source
// row. Pixels outside the buffer are dropped. False when a row is not delivered.
bool reduce_rows(WbmpDrawing &drawing, uint32_t *const (&sums)[2]);

} // namespace pelm

// The whole-frame buffer of interlaced images: a word per output pixel, R, G, B, A from the high byte down, and the way
// from there to the caller's buffer.
#pragma once

#include "png/placing.h"

// Writes the frame through outputCursor and the steps, and leaves the cursor behind the last row. Formats 0 and 1 blend
// when the image has a tRNS chunk, and only then, with the weights alpha and 255 - alpha.
PELM_EXPORT void __PELMI_WriteOutputDataFromINTBuffer(PngDecodeState *state);

namespace pelm {

// Scaled images only; does nothing without a frame.
void clear_frame(const PngDecodeState &state);
void divide_frame_by_alpha(const PngDecodeState &state);

// Writes the frame from `position` on, the byte offset of its first pixel, and returns that of the row behind its last.
// Positions and steps may be more than the record's words hold.
int64_t write_frame(const PngDecodeState &state, int64_t position, const OutputSteps &steps);

} // namespace pelm

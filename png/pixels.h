// From reconstructed rows to pixels in the caller's buffer.
#pragma once

#include "png/state.h"

// Writes the state's current row, or adds it to the reduced row in progress, and counts it. `area` is the byte offset
// of the placed image's first pixel in the buffer of the current call; imageWidth and imageHeight are the whole
// image's. `row` is the row's index in its pass (interlaced images).
PELM_EXPORT void __PELMI_PngWriteDataToOutputBuffer(PngDecodeState *state, uint32_t row, uint32_t imageWidth,
                                                    uint32_t imageHeight, uint32_t outputWidth, uint32_t outputHeight,
                                                    int64_t area);

namespace pelm {

// Byte offset of a row of the buffer, `row` rows below `area`. Never so far away that adding a row's width could wrap.
int64_t row_position(const PngDecodeState &state, int64_t area, int64_t row);

void write_scaled_grey_row(PngDecodeState &state, uint32_t x_step, uint32_t y_step, uint32_t scaled_width,
                           uint32_t scaled_height, int64_t area);
void reduce_row(PngDecodeState &state);

// The current row as row `row` of the pass that interlaceMethod holds.
void write_pass_row(PngDecodeState &state, uint32_t row, int64_t area);

} // namespace pelm

// How large a PNG becomes and where it goes in the caller's buffer.
#pragma once

#include "png/state.h"

namespace pelm {

// Sets the scaled size and isOneToOne for a box given in the output's orientation. `zoom` is the request's
// decodeStarted, which the public calls make 1.
void scale_png(PngDecodeState &state, uint32_t flags, uint32_t zoom, int32_t boxWidth, int32_t boxHeight);

// Sets stride, offsets, steps and cursor, once per decode.
void place_png(PngDecodeState &state, uint32_t flags, int32_t boxWidth, int32_t boxHeight);

// Takes the buffer of the current call, whose box may be another one than the first call's.
void use_output(PngDecodeState &state, void *output, int32_t boxWidth, int32_t boxHeight);

// In bytes, from the pixels of an image row to each other, and to those of the next row.
struct OutputSteps {
    int64_t pixel, row;
};

OutputSteps output_steps(const PngDecodeState &state);

// Byte offset, in the buffer, of the pixel that shows image pixel (0, 0).
int64_t first_pixel_position(const PngDecodeState &state);

// Byte offset of the placed area's top left pixel.
int64_t area_position(const PngDecodeState &state);

} // namespace pelm

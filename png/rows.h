// What happens between inflated bytes and pixels: rows are cut, unfiltered, written, and the host is asked after each.
#pragma once

#include "png/state.h"

namespace pelm {

// Rows of a picture that is not interlaced, as the core's consumer of bytes.
struct PlainRows {
    PngDecodeState *state;
    uint32_t output_width, output_height;
    int64_t area;
};

// Allocates the row buffers, once. False without memory.
bool allocate_rows(PngDecodeState &state);

// Puts rows, writer and sampling to the image's beginning.
void restart_rows(PngDecodeState &state);

Stop take_run(PlainRows &rows, const uint8_t *bytes, uint32_t count, uint32_t &taken);

// go_on, or host_stopped.
Stop ask_host(const PngDecodeState &state);

} // namespace pelm

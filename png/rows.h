// What happens between inflated bytes and pixels: rows are cut, unfiltered, written, and the host is asked after each.
// The two kinds of rows differ in what a finished row means.
#pragma once

#include <algorithm>
#include <cstring>

#include "png/state.h"

namespace pelm {

// Rows as the core's consumer of bytes (png/inflate/inflate.h).
struct Rows {
    PngDecodeState *state;
    uint32_t output_width, output_height;
    int64_t area;
};

// One after the other.
struct PlainRows : Rows {};

// Pass by pass.
struct Adam7Rows : Rows {};

// Allocate what the rows need, once. False without memory.
bool allocate_rows(PlainRows &rows);
bool allocate_rows(Adam7Rows &rows);

// Put rows, writer and sampling to the image's beginning.
void restart_rows(PlainRows &rows);
void restart_rows(Adam7Rows &rows);

// The current row is complete; `following` are the bytes of the next one where all of them are at hand, else NULL.
// go_on, rows_done or host_stopped.
Stop finish_row(PlainRows &rows, const uint8_t *following);
Stop finish_row(Adam7Rows &rows, const uint8_t *following);

// The image is complete.
void finish_image(PlainRows &rows);
void finish_image(Adam7Rows &rows);

// go_on, or host_stopped.
Stop ask_host();
Stop ask_host(const PlainRows &rows);
Stop ask_host(const Adam7Rows &rows);

template <class Kind>
Stop take_run(Kind &rows, const uint8_t *bytes, uint32_t count, uint32_t &taken) {
    PngDecodeState &state = *rows.state;
    for (taken = 0; taken < count;) {
        const uint32_t run = std::min(count - taken, state.rowLength - state.rowFilled);
        std::memcpy(state.rowNow + state.rowFilled, bytes + taken, run);
        state.rowFilled += run;
        taken += run;
        if (state.rowFilled < state.rowLength) break;
        state.rowFilled = 0;
        const Stop stop = finish_row(rows, count - taken >= state.rowLength ? bytes + taken : nullptr);
        if (stop != Stop::go_on) return stop;
    }
    return Stop::go_on;
}

} // namespace pelm

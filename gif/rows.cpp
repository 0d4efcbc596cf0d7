// One row of the image after the other: which writer it goes to, and which screen row the next one belongs to.
#include "gif/working.h"

namespace pelm {
namespace {

void write_row(GifDecoderState &state, intptr_t start) {
    if (state.animated == 0)
        state.oneToOne != 0 ? PELMI_WriteGIFOneToOneRow(&state, start) : PELMI_DownsizeGIFRow(&state, start);
    else if (state.sourceRow < state.screenHeight)
        state.oneToOne != 0 ? PELMI_WriteAGIFOneToOneRow(&state, start) : PELMI_DownsizeAGIFRow(&state, start);
}

struct Pass {
    int32_t step;       // to the pass's next row
    int32_t next_start; // row of the image that the next pass begins with
};

// GIF89a, appendix E; the rows after the last pass do not exist.
constexpr Pass passes[] = {{8, 4}, {8, 2}, {4, 1}, {2, 0}};

void advance_in_passes(GifDecoderState &state) {
    const Pass pass = passes[state.interlaced - 1];
    state.sourceRow += pass.step;
    if (state.sourceRow < state.imageTop + state.imageHeight) return;
    if (state.interlaced == 4) {
        state.interlaced = 0;
        return;
    }
    state.sourceRow = state.imageTop + pass.next_start;
    ++state.interlaced;
}

constexpr int32_t no_more_rows = -1;

// The rows of images too low for the steps, one to a pass: what follows the passes 1 to 4.
constexpr int32_t rows_of_two[] = {1, no_more_rows, no_more_rows, no_more_rows};
constexpr int32_t rows_of_three[] = {2, 1, no_more_rows, no_more_rows};
constexpr int32_t rows_of_others[] = {2, 1, 3, no_more_rows};

void advance_in_few_rows(GifDecoderState &state) {
    const int32_t *const rows = state.imageHeight == 2   ? rows_of_two
                                : state.imageHeight == 3 ? rows_of_three
                                                         : rows_of_others;
    const int32_t row = rows[state.interlaced - 1];
    if (row == no_more_rows) {
        state.sourceRow = state.imageTop + state.imageHeight;
        state.interlaced = 0;
        return;
    }
    state.sourceRow = state.imageTop + row;
    ++state.interlaced;
}

} // namespace
} // namespace pelm

int32_t PELMI_WriteTheLine(GifDecoderState *state, intptr_t outBuffer) {
    pelm::write_row(*state, outBuffer);
    if (state->interlaced == 0) {
        ++state->sourceRow;
        return 1;
    }
    if (state->interlaced > 4) return 0;
    if (state->imageHeight >= 5)
        pelm::advance_in_passes(*state);
    else
        pelm::advance_in_few_rows(*state);
    return 1;
}

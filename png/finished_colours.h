// Which PNGs are written by a table of finished colours (frame/finished_colours.h).
#pragma once

#include "frame/finished_colours.h"
#include "png/loads.h"

namespace pelm {

// Fills the state's table in its output format, or makes it NULL: where colours blend with what is in the buffer, and
// for small images.
void finish_colours(PngDecodeState &state);

// Calls `visit` with the load for the state's current row that is to be written: a finished one where there is.
template <class Visit>
void visit_written_row(const PngDecodeState &state, Visit &&visit) {
    if (state.finished == nullptr) return visit_row(state, visit);
    switch (state.bitDepth) {
    case 1: return visit(FinishedRow<1>{state.currentRow, state.finished});
    case 2: return visit(FinishedRow<2>{state.currentRow, state.finished});
    case 4: return visit(FinishedRow<4>{state.currentRow, state.finished});
    default: return visit(FinishedRow<8>{state.currentRow, state.finished});
    }
}

} // namespace pelm

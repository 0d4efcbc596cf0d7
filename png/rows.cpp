#include "png/rows.h"

#include <algorithm>
#include <cstring>
#include <limits>
#include <utility>

#include "frame/host.h"
#include "png/pixels.h"
#include "png/unfilter.h"

namespace pelm {
namespace {

// In line mode a call ends when the rows done reach its last one. Where one source row can finish several output rows
// they may also pass it; a last row that an earlier call has reached ends nothing.
bool stops_here(const PngDecodeState &state, uint32_t rows_before) {
    if (state.stopRow == 0 || state.stopRow == state.imageHeight) return false;
    const bool counts_each_row = state.isOneToOne != 0 || (state.colourType == 0 && state.bitDepth == 8);
    if (counts_each_row) return state.rowsDone == state.stopRow;
    return rows_before < state.stopRow && state.rowsDone >= state.stopRow;
}

Stop finish_row(PlainRows &rows) {
    PngDecodeState &state = *rows.state;
    state.rowFilled = 0;
    state.currentRow = state.rowNow + 1;
    __PELMI_PngReadFilterRow(&state, state.rowNow + 1, state.rowBefore + 1, state.rowLength - 1);
    std::swap(state.rowNow, state.rowBefore);

    const uint32_t rows_before = state.rowsDone;
    __PELMI_PngWriteDataToOutputBuffer(&state, 0, state.imageWidth, state.imageHeight, rows.output_width,
                                       rows.output_height, rows.area);
    return stops_here(state, rows_before) ? Stop::rows_done : ask_host(state);
}

} // namespace

bool allocate_rows(PngDecodeState &state) {
    const uint64_t row = (uint64_t{state.imageWidth} * state.bitsPerPixel + 7) / 8 + 1;
    const uint64_t bytes = 2 * (row + state.imageWidth);
    if (bytes > std::numeric_limits<uint32_t>::max()) return false;
    state.rowLength = static_cast<uint32_t>(row);
    if (state.rowBuffers == nullptr)
        state.rowBuffers = static_cast<uint8_t *>(ZOTARPELM_OsMalloc(static_cast<uint32_t>(bytes)));
    return state.rowBuffers != nullptr;
}

void restart_rows(PngDecodeState &state) {
    state.rowNow = state.rowBuffers;
    state.rowBefore = state.rowBuffers + state.rowLength;
    state.rowFilled = 0;
    ZOTARPELM_OsMemset(state.rowBefore, 0, state.rowLength);

    for (uint32_t i = 0; i < 4; ++i) {
        const auto across = uint64_t{state.imageWidth} * (i % 2 == 0 ? 1 : 3) >> 2;
        const auto down = uint64_t{state.imageHeight} * (i < 2 ? 1 : 3) >> 2;
        state.samplePoints[i] = {static_cast<uint32_t>(across), static_cast<uint32_t>(down)};
    }
    state.sourceX = state.sourceY = state.rowsWritten = state.rowFlag = 0;
    state.rowsDone = 0;
    state.resizeState = 0;
    if (state.resizeOutAccum != nullptr) ZOTARPELM_OsMemset(state.resizeOutAccum, 0, state.scaledWidth * 4);
}

Stop take_run(PlainRows &rows, const uint8_t *bytes, uint32_t count, uint32_t &taken) {
    PngDecodeState &state = *rows.state;
    for (taken = 0; taken < count;) {
        const uint32_t run = std::min(count - taken, state.rowLength - state.rowFilled);
        std::memcpy(state.rowNow + state.rowFilled, bytes + taken, run);
        state.rowFilled += run;
        taken += run;
        if (state.rowFilled < state.rowLength) break;
        const Stop stop = finish_row(rows);
        if (stop != Stop::go_on) return stop;
    }
    return Stop::go_on;
}

Stop ask_host(const PngDecodeState &state) {
    if (state.skipStatusCheck != 0) return Stop::go_on;
    int32_t status = 0;
    ZOTARPELM_CheckExStatus(&status);
    if (status < 0) return Stop::host_stopped;
    if (status > 0) ZOTARPELM_OsSleep(status);
    return Stop::go_on;
}

} // namespace pelm

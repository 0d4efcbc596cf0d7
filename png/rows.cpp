#include "png/rows.h"

#include <utility>

#include "frame/memory.h"
#include "png/adam7.h"
#include "png/finished_colours.h"
#include "png/frame_buffer.h"
#include "png/pixels.h"
#include "png/placing.h"
#include "png/unfilter.h"
#include "png/unfilter_two_rows.h"

namespace pelm {
namespace {

// The longest rows, in bytes, that a third buffer is spent on.
constexpr uint32_t longest_row_ahead = 65536;

bool has_row_ahead(uint64_t row) {
    return row <= longest_row_ahead;
}

// The row buffers fit a row of the whole image.
bool allocate_row_buffers(PngDecodeState &state) {
    const uint64_t row = (uint64_t{state.wholeWidth} * state.bitsPerPixel + 7) / 8 + 1;
    state.rowLength = static_cast<uint32_t>(row); // wraps only where there is no memory for it
    const uint64_t two_rows = 2 * (row + state.wholeWidth);
    const uint64_t rows = has_row_ahead(row) ? std::max(two_rows, 3 * row) : two_rows;
    if (state.rowBuffers == nullptr) state.rowBuffers = allocate_array<uint8_t>(sizeof(FinishedColours) + rows);
    return state.rowBuffers != nullptr;
}

void restart_state(PngDecodeState &state) {
    state.imageWidth = state.wholeWidth;
    state.imageHeight = state.wholeHeight;
    finish_colours(state);
    state.rowNow = state.rowBuffers + sizeof(FinishedColours);
    state.rowBefore = state.rowNow + state.rowLength;
    state.rowAhead = has_row_ahead(state.rowLength) ? state.rowBefore + state.rowLength : nullptr;
    state.rowAheadIsDone = 0;
    state.rowFilled = 0;
    for (uint32_t i = 0; i < 4; ++i) {
        const auto across = uint64_t{state.wholeWidth} * (i % 2 == 0 ? 1 : 3) >> 2;
        const auto down = uint64_t{state.wholeHeight} * (i < 2 ? 1 : 3) >> 2;
        state.samplePoints[i] = {static_cast<uint32_t>(across), static_cast<uint32_t>(down)};
    }
    state.sourceX = state.sourceY = state.rowsWritten = state.rowFlag = 0;
    state.rowsDone = 0;
    state.resizeState = 0;
}

void write_current_row(const Rows &rows, uint32_t row) {
    const PngDecodeState &state = *rows.state;
    __PELMI_PngWriteDataToOutputBuffer(rows.state, row, state.wholeWidth, state.wholeHeight, rows.output_width,
                                       rows.output_height, rows.area);
}

// In line mode a call ends when the rows done reach its last one. Where one source row can finish several output rows
// they may also pass it; a last row that an earlier call has reached ends nothing.
bool stops_here(const PngDecodeState &state, uint32_t rows_before) {
    if (state.stopRow == 0 || state.stopRow == state.imageHeight) return false;
    const bool counts_each_row = state.isOneToOne != 0 || (state.colourType == 0 && state.bitDepth == 8);
    if (counts_each_row) return state.rowsDone == state.stopRow;
    return rows_before < state.stopRow && state.rowsDone >= state.stopRow;
}

// Reconstructs the complete row in rowNow, below `above`, and the one after it in rowAhead, where that is faster than a
// row after the other.
bool reconstruct_two_rows(PngDecodeState &state, const uint8_t *above, const uint8_t *following) {
    if (following == nullptr || state.rowAhead == nullptr) return false;
    const TwoRows rows = {state.rowNow + 1,    state.rowAhead + 1, above,       state.rowLength - 1,
                          state.bytesPerPixel, state.rowNow[0],    following[0]};
    if (!two_rows_pay(rows)) return false;
    std::memcpy(state.rowAhead, following, state.rowLength);
    unfilter_two_rows(rows);
    return true;
}

// Makes the complete row in rowNow the current one, its filter undone. Nothing of a row ahead shows: its bytes come
// again.
void reconstruct_row(PngDecodeState &state, const uint8_t *above, const uint8_t *following) {
    if (state.rowAheadIsDone != 0) {
        state.rowAheadIsDone = 0;
        std::swap(state.rowNow, state.rowAhead);
    } else if (reconstruct_two_rows(state, above, following)) {
        state.rowAheadIsDone = 1;
    } else {
        __PELMI_PngReadFilterRow(&state, state.rowNow + 1, above, state.rowLength - 1);
    }
    state.currentRow = state.rowNow + 1;
}

// To pass `pass`, or the next one that has pixels. Behind the last one there is only surplus data.
void enter_pass(PngDecodeState &state, uint32_t pass) {
    pass = std::min(pass, pass_count + 1);
    state.rowLength = getPassRowBytes(&state, state.wholeWidth, state.wholeHeight, &pass) + 1;
    state.passRow = 0;
}

} // namespace

bool allocate_rows(PlainRows &rows) {
    return allocate_row_buffers(*rows.state);
}

bool allocate_rows(Adam7Rows &rows) {
    PngDecodeState &state = *rows.state;
    if (!allocate_row_buffers(state)) return false;
    if (state.zeroRow != nullptr) return true;
    const uint64_t zeros = uint64_t{state.wholeWidth} * 8; // a pixel has no more bytes than that
    state.zeroRow = allocate_array<uint8_t>(zeros);
    if (state.zeroRow != nullptr) ZOTARPELM_OsMemset(state.zeroRow, 0, static_cast<uint32_t>(zeros));
    return state.zeroRow != nullptr;
}

void restart_rows(PlainRows &rows) {
    PngDecodeState &state = *rows.state;
    restart_state(state);
    ZOTARPELM_OsMemset(state.rowBefore, 0, state.rowLength);
    state.sums = PNG_SUMS_ARE_OLD;
}

void restart_rows(Adam7Rows &rows) {
    restart_state(*rows.state);
    clear_frame(*rows.state);
    enter_pass(*rows.state, 1);
}

Stop finish_row(PlainRows &rows, const uint8_t *following) {
    PngDecodeState &state = *rows.state;
    reconstruct_row(state, state.rowBefore + 1, following);
    std::swap(state.rowNow, state.rowBefore);
    const uint32_t rows_before = state.rowsDone;
    write_current_row(rows, 0);
    return stops_here(state, rows_before) ? Stop::rows_done : ask_host(rows);
}

Stop finish_row(Adam7Rows &rows, const uint8_t *following) {
    PngDecodeState &state = *rows.state;
    const bool is_last = state.passRow + 1 == state.imageHeight; // what follows is the next pass
    reconstruct_row(state, state.passRow == 0 ? state.zeroRow : state.rowBefore + 1, is_last ? nullptr : following);
    std::swap(state.rowNow, state.rowBefore);
    write_current_row(rows, state.passRow);
    const Stop stop = ask_host(rows);
    if (++state.passRow == state.imageHeight) enter_pass(state, state.interlaceMethod + 1u);
    return stop;
}

void finish_image(PlainRows &) {}

void finish_image(Adam7Rows &rows) {
    PngDecodeState &state = *rows.state;
    if (state.isOneToOne != 0 || state.interlaceFrameUsed == 0 || state.output.size == 0) return;
    divide_frame_by_alpha(state);
    write_frame(state, first_pixel_position(state), output_steps(state));
}

Stop ask_host() {
    int32_t status = 0;
    ZOTARPELM_CheckExStatus(&status);
    if (status < 0) return Stop::host_stopped;
    if (status > 0) ZOTARPELM_OsSleep(status);
    return Stop::go_on;
}

Stop ask_host(const PlainRows &rows) {
    return rows.state->skipStatusCheck != 0 ? Stop::go_on : ask_host();
}

// Required: interlaced images ask whatever skipStatusCheck says.
Stop ask_host(const Adam7Rows &) {
    return ask_host();
}

} // namespace pelm

// Rows for line calls: left-aligned, unturned, one output row at a time.
#include "gif/line_rows.h"

#include "gif/row_writers.h"
#include "gif/working.h"

namespace pelm {
namespace {

OutputRow next_output_row(const GifDecoderState &state, intptr_t start) {
    const int64_t size = GifFormats::size(state.outputFormat);
    return {start + int64_t{state.rowsOut} * state.requestedWidth * size, size};
}

void write_whole_row(GifDecoderState &state, intptr_t start) {
    const OutputRow row = next_output_row(state, start);
    write_row_clipped(state.output, row.position, row.step, state.outputFormat,
                      IndexedRow{state.pixelBuffer, finished_colours(state)}, 0,
                      std::min(state.imageWidth, state.requestedWidth));
}

void write_sampled_row(GifDecoderState &state, intptr_t start) {
    const OutputRow row = next_output_row(state, start);
    write_samples(state, row.position, row.step, IndexedRow{state.pixelBuffer, finished_colours(state)},
                  state.imageWidth, std::min(state.scaledWidth, state.requestedWidth));
}

} // namespace

bool next_row_is_outside(const GifDecoderState &state) {
    const int64_t row_bytes = int64_t{state.requestedWidth} * GifFormats::size(state.outputFormat);
    return row_bytes <= 0 ||
           static_cast<uint64_t>(state.rowsOut) * static_cast<uint64_t>(row_bytes) >= state.output.size;
}

void pass_over_output_rows(GifDecoderState &state, int32_t wanted) {
    const int64_t ahead = state.samplePosition - int64_t{state.scaledHeight} * state.sourceRow;
    if (state.oneToOne != 0 || ahead < 0 || ahead >= state.scaledHeight) return;
    const int64_t rows_of_this = (state.scaledHeight - ahead + state.screenHeight - 1) / state.screenHeight;
    const int64_t rows = std::min<int64_t>(rows_of_this, wanted - state.rowsOut);
    state.samplePosition += rows * state.screenHeight;
    state.rowsOut += static_cast<int32_t>(rows);
}

} // namespace pelm

int32_t PELMI_GIFMakeOut1Row(GifDecoderState *state, intptr_t outBuffer, uint32_t *consumed) {
    *consumed = 0;
    if (state->interlaced != 0) return 0;
    if (state->oneToOne != 0) {
        pelm::write_whole_row(*state, outBuffer);
        ++state->rowsOut;
        ++state->sourceRow;
        *consumed = 1;
        return 1;
    }
    const int64_t ahead = state->samplePosition - int64_t{state->scaledHeight} * state->sourceRow;
    if (ahead < 0 || ahead >= state->scaledHeight) {
        ++state->sourceRow;
        *consumed = 1;
        return 1;
    }
    pelm::write_sampled_row(*state, outBuffer);
    state->samplePosition += state->screenHeight;
    ++state->rowsOut;
    return 1;
}

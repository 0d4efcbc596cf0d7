// The row writers of still and animated images: they differ in where a pixel's colour comes from and in how far the
// rows reach.
#include "gif/row_writers.h"

#include "gif/working.h"

namespace pelm {
namespace {

// Required: pixels of these formats follow each other in memory, whatever the rotation (docs/oddities.md, "Turned
// images in 32-bit formats").
bool always_steps_forward(uint32_t format) {
    return format == PELM_FORMAT_ARGB8888 || format == PELM_FORMAT_RGBA8888 || format == PELM_FORMAT_BGRA8888;
}

// The screen's row, pixel for pixel.
template <class Load>
void write_one_to_one(const GifDecoderState &state, intptr_t start, const Load &load) {
    if (!is_shown(shown_rows(state))) return;
    const OutputRow row = output_row(state, start, state.sourceRow);
    const int64_t step = always_steps_forward(state.outputFormat) ? 4 : row.step;
    write_row_clipped(state.output, row.position, step, state.outputFormat, load, 0, state.screenWidth);
}

template <class Load>
void write_scaled(const GifDecoderState &state, intptr_t start, const Load &load, int32_t pixels) {
    const ShownRows rows = shown_rows(state);
    for (int64_t k = rows.first; k < rows.end; ++k) {
        const OutputRow row = output_row(state, start, k);
        write_samples(state, row.position, row.step, load, pixels, state.scaledWidth);
    }
}

} // namespace

ShownRows shown_rows(const GifDecoderState &state) {
    const int64_t row = state.sourceRow;
    if (row >= state.screenHeight || state.output.size == 0) return {0, 0};
    if (state.oneToOne != 0) return {row, row + 1};
    if (state.scaledHeight <= 0) return {0, 0};
    const int64_t height = state.screenHeight;
    const int64_t half = height >> 1;
    // Output row k shows screen row (k x height + half) / scaledHeight.
    const int64_t from = row * state.scaledHeight - half;
    const int64_t behind = from + state.scaledHeight;
    const auto first_at = [height](int64_t place) { return place <= 0 ? 0 : (place + height - 1) / height; };
    return {first_at(from), first_at(behind)};
}

namespace {

IndexedRow still_row(GifDecoderState &state) {
    return {state.pixelBuffer, finished_colours(state)};
}

} // namespace
} // namespace pelm

void PELMI_WriteGIFOneToOneRow(GifDecoderState *state, intptr_t outBuffer) {
    // Required: as many pixels as the screen has columns, from its left edge on (docs/oddities.md, "Still images fill
    // the screen").
    pelm::write_one_to_one(*state, outBuffer, pelm::still_row(*state));
}

void PELMI_DownsizeGIFRow(GifDecoderState *state, intptr_t outBuffer) {
    pelm::write_scaled(*state, outBuffer, pelm::still_row(*state), state->imageWidth);
}

void PELMI_WriteAGIFOneToOneRow(GifDecoderState *state, intptr_t outBuffer) {
    pelm::write_one_to_one(*state, outBuffer, pelm::PackedRow{state->canvasRow});
}

void PELMI_DownsizeAGIFRow(GifDecoderState *state, intptr_t outBuffer) {
    pelm::write_scaled(*state, outBuffer, pelm::PackedRow{state->canvasRow}, state->screenWidth);
}

#include "bmp/decode_rows.h"

#include "bmp/geometry.h"

namespace pelm {

// Rows are finished in file order: a bottom-up file's first row goes lowest. The record's row step is negated for
// top-down files, so that subtracting it walks the other way.
// Required: on a sequential source a top-down file walks upwards instead (docs/oddities.md, "Top-down files on
// sequential sources").
OutputRows output_rows(const BmpState &state, intptr_t cursor, int32_t count) {
    const int64_t step = state.rowStep;
    const int64_t pixel_step = pixel_step_bytes(state.pixelStep, state.outputFormat);
    const int64_t first = band_cursor(state, cursor);
    if (state.topDown == 0) return {first + step * (count - 1), -step, pixel_step};
    return {first, state.input->kind == PELM_SOURCE_SEQUENTIAL ? step : -step, pixel_step};
}

int32_t last_file_row(const BmpState &state, Band band) {
    if (state.oneToOne != 0) return first_file_row(state, band) + band.count - 1;
    const SamplePoints points = quarter_points(state.height);
    if (state.topDown != 0)
        return sampled_at(band.first + band.count - 1, points.second, state.height, state.scaledHeight);
    return state.height - 1 - sampled_at(band.first, points.first, state.height, state.scaledHeight);
}

int32_t first_file_row(const BmpState &state, Band band) {
    int64_t first = band.first;
    int64_t last = int64_t{band.first} + band.count; // one past
    if (state.oneToOne == 0) {
        first = (first * state.height + state.height / 4) / state.scaledHeight;
        last = (state.scaledHeight - 1 + last * state.height) / state.scaledHeight;
    }
    return static_cast<int32_t>(state.topDown != 0 ? first : state.height - last);
}

} // namespace pelm

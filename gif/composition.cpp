// An animation's frame over what the frames before it left: the canvas. It is changed at once to what the next frame is
// to be painted over, so that disposal needs no second walk.
#include <algorithm>

#include "frame/host.h"
#include "gif/composition.h"
#include "gif/row_writers.h"
#include "gif/working.h"

namespace pelm {
namespace {

enum Disposal : uint32_t { to_background = 2, to_previous = 3 };

// The frame's pixels of a row. The output takes what shows now, the canvas what the next frame finds.
struct FrameRow {
    const uint8_t *indices;
    const uint32_t *colours;
    uint32_t *output;
    uint32_t *canvas;
    int32_t count;
};

void paint_opaque(const FrameRow &row) {
    for (int32_t x = 0; x < row.count; ++x)
        row.output[x] = row.colours[row.indices[x]];
}

void paint_transparent(const FrameRow &row, int32_t transparent) {
    for (int32_t x = 0; x < row.count; ++x)
        row.output[x] = row.indices[x] != transparent ? row.colours[row.indices[x]] : row.canvas[x];
}

void paint_row(const GifDecoderState &state, const FrameRow &row) {
    if (state.hasTransparency == 0)
        paint_opaque(row);
    else
        paint_transparent(row, state.transparentIndex);

    switch (state.disposal) {
    case to_background:
        // Required: without transparency the canvas takes the background colour, with it it becomes unpainted again
        // (docs/oddities.md, "Disposal to the background").
        std::fill_n(row.canvas, row.count,
                    state.hasTransparency == 0 ? state.globalTable[state.backgroundIndex] : gif_never_painted);
        break;
    case to_previous: break;
    default: std::copy_n(row.output, row.count, row.canvas);
    }
}

void compose(const GifDecoderState &state, bool with_columns_beside) {
    if (state.sourceRow >= state.screenHeight) return;
    uint32_t *const canvas = state.canvas + static_cast<ptrdiff_t>(state.sourceRow) * state.screenWidth;
    if (with_columns_beside) ZOTARPELM_OsMemcpy(state.rowBuffer, canvas, static_cast<uint32_t>(state.screenWidth) * 4);
    const int32_t columns = std::min(state.imageWidth, state.screenWidth - state.imageLeft);
    if (columns <= 0) return;
    paint_row(state, {state.pixelBuffer, state.activeTable, state.rowBuffer + state.imageLeft, canvas + state.imageLeft,
                      columns});
}

} // namespace

void compose_to_be_shown(const GifDecoderState &state) {
    compose(state, is_shown(shown_rows(state)));
}

} // namespace pelm

int32_t PELMI_MakeFrameLineBuffer(GifDecoderState *state) {
    pelm::compose(*state, true);
    return 1;
}

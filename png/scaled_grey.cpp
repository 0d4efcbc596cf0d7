// Reduced grey images of 8 bits: nearest neighbours, by accumulators that the state keeps.
//
// Required: the accumulators are advanced exactly like this, although only dropped rows move the source position on and
// the image ends before the box does (docs/oddities.md, "Reduced grey images of 8 bits"). They wrap at 32 bits.
#include "frame/write_row.h"
#include "png/loads.h"
#include "png/pixels.h"

namespace pelm {
namespace {

// Writes the pixels of one used row and leaves the x accumulator behind its last one.
template <class Load>
void write_columns(PngDecodeState &state, const Load &load, uint32_t x_step, uint32_t scaled_width, int64_t position) {
    const int32_t pixel_bytes = bytes_per_pixel(state.outputFormat);
    uint32_t &x = state.samplePoints[0].x;
    state.sourceX = 0;
    for (uint32_t i = 0; i < state.imageWidth; ++i, state.sourceX += scaled_width)
        for (; x - state.sourceX < scaled_width; x += x_step) {
            const int64_t column = x / state.imageWidth;
            write_row_clipped(state.output, position + column * pixel_bytes, pixel_bytes, state.outputFormat, load,
                              static_cast<int32_t>(i), 1);
        }
}

} // namespace

void write_scaled_grey_row(PngDecodeState &state, uint32_t x_step, uint32_t y_step, uint32_t scaled_width,
                           uint32_t scaled_height, int64_t area) {
    uint32_t &x = state.samplePoints[0].x;
    uint32_t &y = state.samplePoints[0].y;
    if (y - state.sourceY >= scaled_height) {
        state.sourceY += scaled_height;
        state.rowFlag = 0;
        return;
    }
    ++state.rowsDone;
    const int64_t output_row = int64_t{y / state.imageHeight} - state.firstRowOfCall;
    const bool visible = state.output.size != 0 && state.rowsWritten < state.imageHeight;
    if (visible)
        visit_grey_row<1>(state, narrow_key(state), [&](const auto &load) {
            write_columns(state, load, x_step, scaled_width, row_position(state, area, output_row));
        });
    x = x_step >> 1;
    y += y_step;
    state.rowFlag = 1;
}

} // namespace pelm

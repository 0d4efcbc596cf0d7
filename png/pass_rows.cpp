// Where the pixels of an Adam7 row go: to their places in the image, or scaled, to the output pixels that show them.
#include "frame/sampling.h"
#include "frame/write_row.h"
#include "png/adam7.h"
#include "png/finished_colours.h"
#include "png/pixels.h"
#include "png/placing.h"
#include "png/weighted.h"

namespace pelm {
namespace {

// Output rows (or columns) whose sample point at `point` falls into source row (or column) `source`.
struct Span {
    uint64_t begin, end;
};

Span showing(uint64_t source, uint64_t point, uint64_t full, uint64_t scaled) {
    const auto rows_below = [&](uint64_t limit) { return limit > point ? (limit - point - 1) / full + 1 : 0; };
    return {rows_below(source * scaled), std::min(rows_below((source + 1) * scaled), scaled)};
}

// The index in its pass row of the pixel in column x of the image; false when the pass has none there.
bool pass_pixel(const PassGrid &grid, uint32_t x, int32_t &index) {
    index = static_cast<int32_t>(x / grid.x_step);
    return (x & (grid.x_step - 1)) == grid.x_start;
}

template <class Load>
void write_in_place(const PngDecodeState &state, const PassGrid &grid, uint32_t row, int64_t area, const Load &load) {
    const int32_t pixel_bytes = bytes_per_pixel(state.outputFormat);
    const int64_t y = int64_t{row} * grid.y_step + grid.y_start;
    const int64_t position = row_position(state, area, y) + int64_t{grid.x_start} * pixel_bytes;
    write_row_clipped(state.output, position, int64_t{grid.x_step} * pixel_bytes, state.outputFormat, load, 0,
                      static_cast<int32_t>(state.imageWidth));
}

// Without a frame each output pixel shows the source pixel under its centre.
template <class Load>
void write_centres(const PngDecodeState &state, const PassGrid &grid, uint32_t y, const Load &load) {
    const OutputSteps steps = output_steps(state);
    const Span rows = showing(y, state.wholeHeight >> 1, state.wholeHeight, state.scaledHeight);
    for (uint64_t m = rows.begin; m < rows.end; ++m) {
        SampleWalk column(state.wholeWidth >> 1, static_cast<int32_t>(state.wholeWidth),
                          static_cast<int32_t>(state.scaledWidth));
        int64_t position = first_pixel_position(state) + static_cast<int64_t>(m) * steps.row;
        for (uint32_t j = 0; j < state.scaledWidth; ++j, position += steps.pixel, column.advance()) {
            int32_t index = 0;
            if (pass_pixel(grid, column.at, index))
                write_row_clipped(state.output, position, steps.pixel, state.outputFormat, load, index, 1);
        }
    }
}

// With a frame every sample adds its share to its output pixel.
template <class Load>
void add_to_frame(const PngDecodeState &state, const PassGrid &grid, uint32_t y, uint32_t sample, const Load &load) {
    const PngSamplePoint &point = state.samplePoints[sample];
    const Span rows = showing(y, point.y, state.wholeHeight, state.scaledHeight);
    for (uint64_t m = rows.begin; m < rows.end; ++m) {
        uint32_t *const words = state.interlaceFrame + static_cast<size_t>(m * state.scaledWidth);
        SampleWalk column(point.x, static_cast<int32_t>(state.wholeWidth), static_cast<int32_t>(state.scaledWidth));
        for (uint32_t j = 0; j < state.scaledWidth; ++j, column.advance()) {
            int32_t index = 0;
            if (pass_pixel(grid, column.at, index)) words[j] += share(weighted_word(load(index)), sample);
        }
    }
}

} // namespace

void write_pass_row(PngDecodeState &state, uint32_t row, int64_t area) {
    const uint32_t pass = state.interlaceMethod;
    const bool framed = state.isOneToOne == 0 && state.interlaceFrameUsed != 0;
    // A frame is filled also while nothing can be seen: a later call may show it.
    if (pass > pass_count || (framed ? state.interlaceFrame == nullptr : state.output.size == 0)) return;
    const PassGrid grid = pass_grid(pass);
    const uint32_t y = row * grid.y_step + grid.y_start;
    if (framed)
        return visit_row(state, [&](const auto &load) {
            for (uint32_t sample = 0; sample < 4; ++sample)
                add_to_frame(state, grid, y, sample, load);
        });
    visit_written_row(state, [&](const auto &load) {
        if (state.isOneToOne != 0)
            write_in_place(state, grid, row, area, load);
        else
            write_centres(state, grid, y, load);
    });
}

} // namespace pelm

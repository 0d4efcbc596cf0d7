#include "png/pixels.h"

#include <limits>

#include "frame/write_row.h"
#include "png/finished_colours.h"

namespace pelm {

int64_t row_position(const PngDecodeState &state, int64_t area, int64_t row) {
    constexpr int64_t far_outside = int64_t{1} << 61;
    const int64_t row_bytes = int64_t{state.outputStride} * 4;
    if (row_bytes != 0 && (row > far_outside / row_bytes || row < -far_outside / row_bytes))
        return row > 0 ? far_outside : -far_outside;
    return area + row * int64_t{state.outputStride} * bytes_per_pixel(state.outputFormat);
}

namespace {

// Required: rows go straight down from the placed area's corner, also when a rotation is asked for (docs/oddities.md,
// "Rotation pixel for pixel").
void write_row_as_it_is(const PngDecodeState &state, int64_t area) {
    const int32_t step = bytes_per_pixel(state.outputFormat);
    const int64_t position = row_position(state, area, state.rowsWritten);
    visit_written_row(state, [&](const auto &load) {
        write_row_clipped(state.output, position, step, state.outputFormat, load, 0,
                          static_cast<int32_t>(state.imageWidth));
    });
}

bool is_grey_8(const PngDecodeState &state) {
    return state.colourType == 0 && state.bitDepth == 8;
}

} // namespace
} // namespace pelm

void __PELMI_PngWriteDataToOutputBuffer(PngDecodeState *state, uint32_t row, uint32_t imageWidth, uint32_t imageHeight,
                                        uint32_t outputWidth, uint32_t outputHeight, int64_t area) {
    const bool belongs_to_image = state->rowsWritten < state->imageHeight; // data may bring more rows than that
    if (state->interlaceMethod != 0) {
        pelm::write_pass_row(*state, row, area);
        ++state->rowsDone;
    } else if (state->isOneToOne != 0) {
        if (belongs_to_image) pelm::write_row_as_it_is(*state, area);
        ++state->rowsDone;
    } else if (pelm::is_grey_8(*state)) {
        pelm::write_scaled_grey_row(*state, imageWidth, imageHeight, outputWidth, outputHeight, area);
    } else if (belongs_to_image) {
        pelm::reduce_row(*state);
    }
    if (state->rowsWritten != std::numeric_limits<uint32_t>::max()) ++state->rowsWritten; // surplus rows have no end
}

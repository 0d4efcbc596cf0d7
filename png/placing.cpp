#include "png/placing.h"

#include <algorithm>
#include <cstdlib>
#include <limits>

#include "frame/formats.h"
#include "frame/placement.h"
#include "frame/single.h"
#include "frame/sizes.h"

namespace pelm {
namespace {

// Margins may be negative where the arithmetic of huge sizes has wrapped.
int64_t offset_x(const PngDecodeState &state) {
    return static_cast<int32_t>(state.outputOffsetX);
}

int64_t offset_y(const PngDecodeState &state) {
    return static_cast<int32_t>(state.outputOffsetY);
}

uint32_t margin(int32_t box, uint32_t placed) {
    return static_cast<uint32_t>((int64_t{box} - int64_t{placed}) >> 1);
}

int64_t pixel_position(const PngDecodeState &state, int64_t column, int64_t row) {
    return (row * int64_t{state.outputStride} + column) * bytes_per_pixel(state.outputFormat);
}

// Whether every position that rows and columns can lead to stays far within 64 bits. Boxes of impossible sizes, and the
// scaled sizes that follow from them, do not.
bool positions_fit(const PngDecodeState &state) {
    constexpr int64_t longest_side = std::numeric_limits<int32_t>::max();
    if (state.scaledWidth > longest_side || state.scaledHeight > longest_side) return false;
    constexpr int64_t farthest = int64_t{1} << 61;
    const int64_t row_bytes = int64_t{state.outputStride} * 4 + 1;
    const int64_t rows = std::abs(offset_y(state)) + state.scaledWidth + state.scaledHeight + 1;
    return rows < farthest / row_bytes;
}

// Rows of an exact buffer: those of the scaled image, which rounding may have made larger than the box.
uint32_t rows_within_box(const PngDecodeState &state, int32_t boxWidth, int32_t boxHeight) {
    if (boxWidth <= 0 || boxHeight <= 0) return 0;
    const uint64_t box = static_cast<uint64_t>(boxWidth) * static_cast<uint64_t>(boxHeight);
    return static_cast<uint32_t>(std::min<uint64_t>(state.scaledHeight, box / state.scaledWidth));
}

} // namespace

void scale_png(PngDecodeState &state, uint32_t flags, uint32_t zoom, int32_t boxWidth, int32_t boxHeight) {
    const bool sideways = turns_sideways(static_cast<int32_t>(state.rotationDegrees));
    const auto box_x = static_cast<uint32_t>(sideways ? boxHeight : boxWidth);
    const auto box_y = static_cast<uint32_t>(sideways ? boxWidth : boxHeight);
    const uint32_t width = state.imageWidth;
    const uint32_t height = state.imageHeight;
    state.isOneToOne = 0;
    if (placement_mode(flags) == PELM_PLACE_STRETCH) {
        state.scaledWidth = box_x;
        state.scaledHeight = box_y;
        return;
    }
    if (width * zoom <= box_x && height * zoom <= box_y) {
        state.scaledWidth = width * zoom;
        state.scaledHeight = height * zoom;
        state.isOneToOne = zoom == 1 ? 1 : 0;
        return;
    }
    const float across = single_quotient(width, box_x);
    const float down = single_quotient(height, box_y);
    // Required: the products wrap at 32 bits (docs/oddities.md, "Huge PNG sizes").
    if (across < down) {
        state.scaledHeight = box_y;
        state.scaledWidth = width * box_y / height;
    } else {
        state.scaledWidth = box_x;
        state.scaledHeight = height * box_x / width;
    }
}

void place_png(PngDecodeState &state, uint32_t flags, int32_t boxWidth, int32_t boxHeight) {
    const bool sideways = turns_sideways(static_cast<int32_t>(state.rotationDegrees));
    state.exactPlacement = placement_mode(flags) == PELM_PLACE_EXACT ? 1 : 0;
    if (state.exactPlacement != 0) {
        state.outputStride = state.scaledWidth;
        state.exactRows = rows_within_box(state, boxWidth, boxHeight);
    } else {
        state.outputStride = static_cast<uint32_t>(boxWidth);
        state.outputOffsetX = margin(boxWidth, sideways ? state.scaledHeight : state.scaledWidth);
        state.outputOffsetY = margin(boxHeight, sideways ? state.scaledWidth : state.scaledHeight);
    }
    if (bytes_per_pixel(state.outputFormat) == 0) return;
    const OutputSteps steps = output_steps(state);
    state.outputRowStep = static_cast<int32_t>(steps.row);
    state.outputPixelStep = static_cast<int32_t>(steps.pixel / pixel_step_unit(state.outputFormat));
    state.outputCursor = positions_fit(state) ? static_cast<intptr_t>(first_pixel_position(state)) : 0;
}

OutputSteps output_steps(const PngDecodeState &state) {
    const int64_t pixel = bytes_per_pixel(state.outputFormat);
    const int64_t row = int64_t{state.outputStride} * pixel;
    switch (state.rotationDegrees) {
    case 90: return {row, -pixel};
    case 180: return {-pixel, -row};
    case 270: return {-row, pixel};
    default: return {pixel, row};
    }
}

void use_output(PngDecodeState &state, void *output, int32_t boxWidth, int32_t boxHeight) {
    state.output = {static_cast<uint8_t *>(output), 0};
    if (output == nullptr || boxWidth < 0 || boxHeight < 0 || !positions_fit(state)) return;
    const bool exact = state.exactPlacement != 0;
    size_t bytes = 0;
    if (buffer_bytes(exact ? static_cast<int32_t>(state.scaledWidth) : boxWidth,
                     exact ? static_cast<int32_t>(state.exactRows) : boxHeight, bytes_per_pixel(state.outputFormat),
                     bytes))
        state.output.size = bytes;
}

int64_t first_pixel_position(const PngDecodeState &state) {
    const int64_t x = offset_x(state);
    const int64_t y = offset_y(state);
    const int64_t right = x - 1;
    switch (state.rotationDegrees) {
    case 90: return pixel_position(state, right + state.scaledHeight, y);
    case 180: return pixel_position(state, right + state.scaledWidth, y + state.scaledHeight - 1);
    case 270:
        // Required: RGB565 starts by the height where the other formats start by the width (docs/oddities.md, "RGB565
        // turned by 270 degrees").
        return pixel_position(
            state, x, y - 1 + (state.outputFormat == PELM_FORMAT_RGB565 ? state.scaledHeight : state.scaledWidth));
    default: return pixel_position(state, x, y);
    }
}

int64_t area_position(const PngDecodeState &state) {
    return positions_fit(state) ? pixel_position(state, offset_x(state), offset_y(state)) : 0;
}

} // namespace pelm

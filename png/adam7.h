// The geometry of Adam7 passes (PNG specification, chapter 8.2): pure functions of size and pass.
#pragma once

#include "png/state.h"

// Bytes of a row of pass `*passNumber`, or of the next one that is not empty, without its filter byte. The pass found
// goes to *passNumber and interlaceMethod, its size to imageWidth and imageHeight. 8 and above stand for the whole
// image.
PELM_EXPORT uint32_t getPassRowBytes(PngDecodeState *state, uint32_t imageWidth, uint32_t imageHeight,
                                     uint32_t *passNumber);

namespace pelm {

constexpr uint32_t pass_count = 7;

// Where the pixels of a pass lie: every step-th column and row from the start on. Steps are powers of two.
struct PassGrid {
    uint32_t x_start, y_start, x_step, y_step;
};

constexpr PassGrid pass_grid(uint32_t pass) { // 1 to 7
    constexpr PassGrid grids[pass_count] = {{0, 0, 8, 8}, {4, 0, 8, 8}, {0, 4, 4, 8}, {2, 0, 4, 4},
                                            {0, 2, 2, 4}, {1, 0, 2, 2}, {0, 1, 1, 2}};
    return grids[pass - 1];
}

struct PassSize {
    uint32_t width, height;
};

constexpr uint32_t positions_on_grid(uint32_t size, uint32_t start, uint32_t step) {
    return size > start ? (size - start - 1) / step + 1 : 0;
}

constexpr PassSize pass_size(uint32_t width, uint32_t height, uint32_t pass) {
    if (pass < 1 || pass > pass_count) return {width, height};
    const PassGrid grid = pass_grid(pass);
    return {positions_on_grid(width, grid.x_start, grid.x_step), positions_on_grid(height, grid.y_start, grid.y_step)};
}

} // namespace pelm

#include "png/unfilter.h"

#include "frame/lanes.h"
#include "frame/processor.h"
#include "png/unfilter_lanes.h"
#include "png/unfilter_plain.h"

void __PELMI_PngReadFilterRow(const PngDecodeState *state, uint8_t *row, const uint8_t *previousRow,
                              uint32_t rowLength) {
    using namespace pelm;
    const uint8_t filter = row[-1];
    const uint32_t distance = state->bytesPerPixel;
    if (filter == FILTER_NONE) return;
    const bool has_lanes = (distance <= 4 || distance == 6 || distance == 8) && filter <= FILTER_PAETH;
    if (lanes_are_fast && has_lanes && kernels() >= Kernels::lanes)
        return unfilter_lanes(filter, row, previousRow, rowLength, distance);
    if (filter == FILTER_PAETH && kernels() >= Kernels::plain)
        return unfilter_paeth_by_runs(row, previousRow, rowLength, distance);
    unfilter_plain(filter, row, previousRow, rowLength, distance);
}

#include "png/finished_colours.h"

#include <algorithm>

#include "frame/processor.h"

namespace pelm {
namespace {

// Of an opaque palette, nothing is left of what was in the buffer.
bool is_opaque(const PngDecodeState &state) {
    if ((state.ancillaryFlags & PNG_HAS_TRNS) == 0 || state.paletteAlpha == nullptr) return true;
    return std::all_of(state.paletteAlpha, state.paletteAlpha + 3 * size_t{state.paletteCount},
                       [](uint16_t alpha) { return static_cast<uint8_t>(alpha) == 255; });
}

bool can_finish(const PngDecodeState &state) {
    constexpr uint32_t grey = 0;
    constexpr uint32_t indexed = 3;
    const uint64_t pixels = uint64_t{state.wholeWidth} * state.wholeHeight;
    if (kernels() == Kernels::careful || pixels < uint64_t{pixels_per_finished_colour} << state.bitDepth) return false;
    if (state.colourType != indexed) return state.colourType == grey && state.bitDepth < 8;
    const bool has_alpha = state.outputFormat != PELM_FORMAT_RGB565 && state.outputFormat != PELM_FORMAT_RGB888;
    return has_alpha || is_opaque(state);
}

} // namespace

void finish_colours(PngDecodeState &state) {
    state.finished = nullptr;
    const int32_t size = bytes_per_pixel(state.outputFormat);
    if (size == 0 || !can_finish(state)) return;
    const uint32_t depth = state.bitDepth;
    RowOfSamples row = row_of_samples(depth);
    uint8_t pixels[sizeof FinishedColours::pixels] = {};
    state.currentRow = row.bytes;
    visit_row_of_few_colours(
        state, [&](const auto &load) { write_row_as(state.outputFormat, load, 0, 1 << depth, pixels, 4); });
    state.currentRow = nullptr;

    auto *const colours = reinterpret_cast<FinishedColours *>(state.rowBuffers);
    fill_finished_colours(*colours, pixels, depth, static_cast<uint32_t>(size));
    state.finished = colours;
}

} // namespace pelm

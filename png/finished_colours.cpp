#include "png/finished_colours.h"

#include <algorithm>

#include "frame/processor.h"

namespace pelm {
namespace {

constexpr uint64_t pixels_per_colour = 8; // an image of fewer does not repay the table

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
    if (kernels() == Kernels::careful || pixels < pixels_per_colour << state.bitDepth) return false;
    if (state.colourType != indexed) return state.colourType == grey && state.bitDepth < 8;
    const bool has_alpha = state.outputFormat != PELM_FORMAT_RGB565 && state.outputFormat != PELM_FORMAT_RGB888;
    return has_alpha || is_opaque(state);
}

void make_groups(FinishedColours &colours, uint32_t depth, uint32_t size) {
    const uint32_t in_group = 4 / depth;
    for (uint32_t group = 0; group < 16; ++group)
        for (uint32_t i = 0; i < in_group; ++i) {
            const uint32_t sample = group >> (4 - depth * (i + 1)) & ((1u << depth) - 1);
            std::memcpy(colours.groups[group] + i * size, &colours.pixels[sample], size);
        }
}

} // namespace

void finish_colours(PngDecodeState &state) {
    state.finished = nullptr;
    const int32_t size = bytes_per_pixel(state.outputFormat);
    if (size == 0 || !can_finish(state)) return;
    // A row of every sample in turn, written as any other row is.
    const uint32_t depth = state.bitDepth;
    const int32_t samples = 1 << depth;
    uint8_t row[256] = {};
    for (int32_t sample = 0; sample < samples; ++sample) {
        const uint32_t bit = static_cast<uint32_t>(sample) * depth;
        row[bit / 8] = static_cast<uint8_t>(row[bit / 8] | static_cast<uint32_t>(sample) << (8 - depth - bit % 8));
    }
    uint8_t pixels[sizeof FinishedColours::pixels] = {};
    state.currentRow = row;
    visit_row(state, [&](const auto &load) { write_row_as(state.outputFormat, load, 0, samples, pixels, 4); });
    state.currentRow = nullptr;

    auto *const colours = reinterpret_cast<FinishedColours *>(state.rowBuffers);
    std::memcpy(colours->pixels, pixels, sizeof pixels);
    if (depth <= 2) make_groups(*colours, depth, static_cast<uint32_t>(size));
    state.finished = colours;
}

} // namespace pelm

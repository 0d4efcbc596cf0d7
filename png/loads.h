// One pixel out of a reconstructed PNG row, for each colour type and depth, and the choice among them.
//
// Samples of 16 bits count by their first byte; only colour keys look at both.
#pragma once

#include <cstddef>

#include "frame/packed.h"
#include "png/blend.h"
#include "png/state.h"

namespace pelm {

constexpr Rgb grey(uint32_t value) {
    const auto v = static_cast<uint8_t>(value);
    return {v, v, v};
}

// 1, 2 and 4 bits.
// Required: the missing low bits are ones, so that black is not 0 at 2 and 4 bits (docs/oddities.md, "Narrow grey").
template <int32_t depth>
struct NarrowGreyRow {
    const uint8_t *row;
    Rgb operator()(int32_t x) const {
        const uint32_t sample = packed_sample<depth>(row, x);
        if constexpr (depth == 1) return grey(sample * 255);
        return grey(sample << (8 - depth) | 0xFFu >> depth);
    }
};

template <int32_t sample_bytes>
struct GreyRow {
    static constexpr ChannelBytes channels = {sample_bytes, 0, 0, 0, ChannelBytes::none};
    const uint8_t *row;
    Rgb operator()(int32_t x) const { return grey(row[ptrdiff_t{x} * sample_bytes]); }
};

template <int32_t sample_bytes>
struct GreyAlphaRow {
    static constexpr ChannelBytes channels = {2 * sample_bytes, 0, 0, 0, sample_bytes};
    const uint8_t *row;
    Rgba operator()(int32_t x) const {
        const uint8_t *const at = row + 2 * sample_bytes * ptrdiff_t{x};
        return {at[0], at[0], at[0], at[sample_bytes]};
    }
};

template <int32_t sample_bytes>
struct RgbRow {
    static constexpr ChannelBytes channels = {3 * sample_bytes, 0, sample_bytes, 2 * sample_bytes, ChannelBytes::none};
    const uint8_t *row;
    Rgb operator()(int32_t x) const {
        const uint8_t *const at = row + 3 * sample_bytes * ptrdiff_t{x};
        return {at[0], at[sample_bytes], at[2 * sample_bytes]};
    }
};

template <int32_t sample_bytes>
struct RgbaRow {
    static constexpr ChannelBytes channels = {4 * sample_bytes, 0, sample_bytes, 2 * sample_bytes, 3 * sample_bytes};
    const uint8_t *row;
    Rgba operator()(int32_t x) const {
        const uint8_t *const at = row + 4 * sample_bytes * ptrdiff_t{x};
        return {at[0], at[sample_bytes], at[2 * sample_bytes], at[3 * sample_bytes]};
    }
};

// A transparent colour, in samples of the row's own width.
struct ColourKey {
    uint16_t red, green, blue;
};

template <int32_t sample_bytes>
inline uint16_t whole_sample(const uint8_t *at) {
    return sample_bytes == 1 ? uint16_t{*at} : read_u16be(at);
}

template <int32_t sample_bytes>
struct KeyedGreyRow {
    const uint8_t *row;
    ColourKey key;
    KeyedRgb operator()(int32_t x) const {
        const uint8_t *const at = row + ptrdiff_t{x} * sample_bytes;
        const uint16_t sample = whole_sample<sample_bytes>(at);
        return {grey(*at), sample == key.red && sample == key.green && sample == key.blue};
    }
};

template <int32_t sample_bytes>
struct KeyedRgbRow {
    const uint8_t *row;
    ColourKey key;
    KeyedRgb operator()(int32_t x) const {
        const uint8_t *const at = row + 3 * sample_bytes * ptrdiff_t{x};
        const bool matches = whole_sample<sample_bytes>(at) == key.red &&
                             whole_sample<sample_bytes>(at + sample_bytes) == key.green &&
                             whole_sample<sample_bytes>(at + 2 * sample_bytes) == key.blue;
        return {{at[0], at[sample_bytes], at[2 * sample_bytes]}, matches};
    }
};

template <int32_t depth>
struct PaletteRow {
    const uint8_t *row;
    const uint8_t *palette; // 256 RGB triplets
    Rgb operator()(int32_t x) const {
        const uint8_t *const entry = palette + 3 * packed_sample<depth>(row, x);
        return {entry[0], entry[1], entry[2]};
    }
};

template <int32_t depth>
struct PaletteAlphaRow {
    const uint8_t *row;
    const uint8_t *palette;
    const uint16_t *alphas; // the low byte counts
    uint32_t alpha_count;   // entries behind them are opaque
    Rgba operator()(int32_t x) const {
        const uint32_t index = packed_sample<depth>(row, x);
        const uint8_t *const entry = palette + 3 * index;
        const auto alpha = static_cast<uint8_t>(index < alpha_count ? alphas[index] : 255);
        return {entry[0], entry[1], entry[2], alpha};
    }
};

// An image without a palette chunk is black.
inline constexpr uint8_t black_palette[768] = {};

template <int32_t depth, class Visit>
void visit_palette_row(const PngDecodeState &state, Visit &&visit) {
    const uint8_t *const palette = state.palette != nullptr ? state.palette : black_palette;
    if ((state.ancillaryFlags & PNG_HAS_TRNS) != 0 && state.paletteAlpha != nullptr)
        visit(PaletteAlphaRow<depth>{state.currentRow, palette, state.paletteAlpha, 3 * state.paletteCount});
    else
        visit(PaletteRow<depth>{state.currentRow, palette});
}

template <int32_t sample_bytes, class Visit>
void visit_grey_row(const PngDecodeState &state, const ColourKey &key, Visit &&visit) {
    if ((state.ancillaryFlags & PNG_HAS_TRNS) != 0)
        visit(KeyedGreyRow<sample_bytes>{state.currentRow, key});
    else
        visit(GreyRow<sample_bytes>{state.currentRow});
}

template <int32_t sample_bytes, class Visit>
void visit_rgb_row(const PngDecodeState &state, const ColourKey &key, Visit &&visit) {
    if ((state.ancillaryFlags & PNG_HAS_TRNS) != 0)
        visit(KeyedRgbRow<sample_bytes>{state.currentRow, key});
    else
        visit(RgbRow<sample_bytes>{state.currentRow});
}

constexpr int32_t row_kind(uint32_t colour_type, uint32_t depth) {
    return static_cast<int32_t>(colour_type * 32 + depth);
}

// The key as rows of 8 bits are compared with it.
inline ColourKey narrow_key(const PngDecodeState &state) {
    return {state.transparentKeyRed, state.transparentKeyGreen, state.transparentKeyBlue};
}

// Calls `visit` with the load for the state's current row, whose samples each stand for one of at most 256 colours. For
// any other row it is not called.
template <class Visit>
void visit_row_of_few_colours(const PngDecodeState &state, Visit &&visit) {
    const uint8_t *const row = state.currentRow;
    switch (row_kind(state.colourType, state.bitDepth)) {
    case row_kind(0, 1): return visit(NarrowGreyRow<1>{row});
    case row_kind(0, 2): return visit(NarrowGreyRow<2>{row});
    case row_kind(0, 4): return visit(NarrowGreyRow<4>{row});
    case row_kind(3, 1): return visit_palette_row<1>(state, visit);
    case row_kind(3, 2): return visit_palette_row<2>(state, visit);
    case row_kind(3, 4): return visit_palette_row<4>(state, visit);
    case row_kind(3, 8): return visit_palette_row<8>(state, visit);
    default: return;
    }
}

// The same for all the layouts that a PNG can have.
template <class Visit>
void visit_row(const PngDecodeState &state, Visit &&visit) {
    const uint8_t *const row = state.currentRow;
    const ColourKey key = narrow_key(state);
    const ColourKey whole_key = {state.transparentSamples[0], state.transparentSamples[1], state.transparentSamples[2]};
    switch (row_kind(state.colourType, state.bitDepth)) {
    case row_kind(0, 8): return visit_grey_row<1>(state, key, visit);
    case row_kind(0, 16): return visit_grey_row<2>(state, whole_key, visit);
    case row_kind(2, 8): return visit_rgb_row<1>(state, key, visit);
    case row_kind(2, 16): return visit_rgb_row<2>(state, whole_key, visit);
    case row_kind(4, 8): return visit(GreyAlphaRow<1>{row});
    case row_kind(4, 16): return visit(GreyAlphaRow<2>{row});
    case row_kind(6, 8): return visit(RgbaRow<1>{row});
    case row_kind(6, 16): return visit(RgbaRow<2>{row});
    default: return visit_row_of_few_colours(state, visit);
    }
}

} // namespace pelm

#include "png/frame_buffer.h"

#include <limits>

#include "frame/host.h"
#include "frame/write_row.h"
#include "png/weighted.h"

namespace pelm {
namespace {

// Carries its alpha where the format has one. Where it has none, it hides what is there, or blends over it.
template <bool blends>
struct FramePixel {
    Rgba c;
};

template <bool blends>
constexpr Rgb channels_of(FramePixel<blends> pixel) {
    return channels_of(pixel.c);
}

template <bool blends>
constexpr uint8_t alpha_of(FramePixel<blends> pixel) {
    return pixel.c.a;
}

template <bool blends>
constexpr uint16_t rgb565_of(FramePixel<blends> pixel) {
    return rgb565_of(pixel.c);
}

// Required: the weights sum to 255, so that a pixel of alpha 255 comes out a little darker (docs/oddities.md, "The
// frame buffer").
constexpr uint8_t frame_blend(uint32_t over, uint32_t alpha, uint32_t under) {
    return static_cast<uint8_t>(((under * (255 - alpha)) >> 8) + ((over * alpha) >> 8));
}

inline void put_rgb565(uint8_t *at, FramePixel<true> pixel) {
    const Rgb under = widened_rgb565(load_u16(at));
    const Rgba over = pixel.c;
    store_u16(at, rgb565_of(Rgb{frame_blend(over.r, over.a, under.r), frame_blend(over.g, over.a, under.g),
                                frame_blend(over.b, over.a, under.b)}));
}

inline void put_rgb888(uint8_t *at, FramePixel<true> pixel) {
    const Rgba over = pixel.c;
    at[0] = frame_blend(over.r, over.a, at[0]);
    at[1] = frame_blend(over.g, over.a, at[1]);
    at[2] = frame_blend(over.b, over.a, at[2]);
}

template <class Pixel>
struct FrameRow {
    const uint32_t *words;
    Pixel operator()(int32_t x) const { return {unpacked(words[x])}; }
};

uint64_t frame_words(const PngDecodeState &state) {
    return uint64_t{state.scaledWidth} * state.scaledHeight;
}

template <class Pixel>
int64_t write_frame_as(const PngDecodeState &state, int64_t position, const OutputSteps &steps) {
    const uint32_t *words = state.interlaceFrame;
    for (uint32_t row = 0; row < state.scaledHeight; ++row, words += state.scaledWidth) {
        write_row_clipped(state.output, position, steps.pixel, state.outputFormat, FrameRow<Pixel>{words}, 0,
                          static_cast<int32_t>(state.scaledWidth));
        position += steps.row;
    }
    return position;
}

} // namespace

void clear_frame(const PngDecodeState &state) {
    if (state.interlaceFrame != nullptr)
        ZOTARPELM_OsMemset(state.interlaceFrame, 0, static_cast<uint32_t>(frame_words(state) * 4));
}

void divide_frame_by_alpha(const PngDecodeState &state) {
    if (state.interlaceFrame == nullptr) return;
    const WeightedRow weighted = {state.interlaceFrame};
    const uint64_t count = frame_words(state);
    for (uint64_t i = 0; i < count; ++i)
        state.interlaceFrame[i] = packed(weighted.at(static_cast<size_t>(i)));
}

int64_t write_frame(const PngDecodeState &state, int64_t position, const OutputSteps &steps) {
    if (state.interlaceFrame == nullptr || state.output.size == 0 || steps.pixel == 0) return position;
    return (state.ancillaryFlags & PNG_HAS_TRNS) != 0 ? write_frame_as<FramePixel<true>>(state, position, steps)
                                                      : write_frame_as<FramePixel<false>>(state, position, steps);
}

} // namespace pelm

void __PELMI_WriteOutputDataFromINTBuffer(PngDecodeState *state) {
    const pelm::OutputSteps steps = {pelm::pixel_step_bytes(state->outputPixelStep, state->outputFormat),
                                     state->outputRowStep};
    state->outputCursor = static_cast<intptr_t>(pelm::write_frame(*state, state->outputCursor, steps));
}

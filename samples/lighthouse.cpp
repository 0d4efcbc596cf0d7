#include "samples/lighthouse.h"

#include <algorithm>

#include "samples/quantise.h"
#include "samples/scene.h"

namespace pelm_samples {
namespace {

constexpr int frame_count = 8;
constexpr size_t colour_count = 127; // one more index is transparent
constexpr int delay = 12;            // hundredths of a second

Colour mean_of_four(const Drawing &drawing, int x, int y) {
    Colour sum = {2, 2, 2};
    for (int i = 0; i < 4; ++i) {
        const Colour &c = drawing.at(2 * x + i % 2, 2 * y + i / 2);
        sum = {sum.r + c.r, sum.g + c.g, sum.b + c.b};
    }
    return {sum.r / 4, sum.g / 4, sum.b / 4};
}

Drawing halved(const Drawing &drawing) {
    Drawing half{drawing.width / 2, drawing.height / 2, {}};
    for (int y = 0; y < half.height; ++y) {
        for (int x = 0; x < half.width; ++x)
            half.pixels.push_back(mean_of_four(drawing, x, y));
    }
    return half;
}

Drawing draw_frame(int number) {
    return halved(draw_scene({.beam_rise = 60 - 14 * number, .sailed = 2 * number}));
}

// Not dithered: what does not move stays the same.
std::vector<uint8_t> indices_of(const Drawing &drawing, const std::vector<Colour> &palette) {
    std::vector<uint8_t> indices;
    for (const Colour &c : drawing.pixels)
        indices.push_back(static_cast<uint8_t>(nearest_in(palette, c)));
    return indices;
}

GifFrame whole_frame(const Drawing &drawing, const std::vector<Colour> &palette) {
    GifFrame frame{0, 0, drawing.width, drawing.height, indices_of(drawing, palette)};
    frame.delay = delay;
    frame.disposal = GifDisposal::keep;
    return frame;
}

// What differs from the first frame, over which it is laid and taken away again.
GifFrame overlay(const GifFrame &base, const std::vector<uint8_t> &indices) {
    int left = base.width, top = base.height, right = 0, bottom = 0;
    const auto at = [&](int x, int y) {
        return static_cast<size_t>(y) * static_cast<size_t>(base.width) + static_cast<size_t>(x);
    };
    for (int y = 0; y < base.height; ++y) {
        for (int x = 0; x < base.width; ++x) {
            if (indices[at(x, y)] == base.indices[at(x, y)]) continue;
            left = std::min(left, x), right = std::max(right, x + 1);
            top = std::min(top, y), bottom = std::max(bottom, y + 1);
        }
    }
    GifFrame frame{left, top, right - left, bottom - top, {}, delay, GifDisposal::restore, colour_count};
    for (int y = top; y < bottom; ++y) {
        for (int x = left; x < right; ++x) {
            const bool is_same = indices[at(x, y)] == base.indices[at(x, y)];
            frame.indices.push_back(is_same ? uint8_t{colour_count} : indices[at(x, y)]);
        }
    }
    return frame;
}

} // namespace

GifContents draw_lighthouse() {
    const Drawing first = draw_frame(0);
    GifContents contents{first.width, first.height, suitable_palette(first, colour_count), {}, 0};
    const GifFrame base = whole_frame(first, contents.palette);
    contents.frames = {base};
    for (int number = 1; number < frame_count; ++number)
        contents.frames.push_back(overlay(base, indices_of(draw_frame(number), contents.palette)));
    return contents;
}

} // namespace pelm_samples

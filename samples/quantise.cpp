#include "samples/quantise.h"

#include <algorithm>
#include <span>

namespace pelm_samples {
namespace {

using Channel = int Colour::*;
constexpr Channel channels[] = {&Colour::r, &Colour::g, &Colour::b};

struct Extent {
    Channel channel;
    int length;
};

Extent extent_of(std::span<const Colour> colours, Channel channel) {
    const auto [low, high] = std::minmax_element(
        colours.begin(), colours.end(), [=](const Colour &a, const Colour &b) { return a.*channel < b.*channel; });
    return {channel, (*high).*channel - (*low).*channel};
}

Extent longest_extent(std::span<const Colour> colours) {
    Extent longest = extent_of(colours, channels[0]);
    for (const Channel channel : channels) {
        const Extent extent = extent_of(colours, channel);
        if (extent.length > longest.length) longest = extent;
    }
    return longest;
}

Colour mean_of(std::span<const Colour> colours) {
    Colour sum = {0, 0, 0};
    for (const Colour &c : colours)
        sum = {sum.r + c.r, sum.g + c.g, sum.b + c.b};
    const int count = static_cast<int>(colours.size());
    return {sum.r / count, sum.g / count, sum.b / count};
}

using Boxes = std::vector<std::span<Colour>>;

// Long boxes first; among equally long ones the first.
Boxes::iterator box_to_cut(Boxes &boxes) {
    return std::max_element(boxes.begin(), boxes.end(), [](const auto &a, const auto &b) {
        return longest_extent(a).length < longest_extent(b).length;
    });
}

// Cuts between two values, at the mean, so that order among equals does not matter.
std::span<Colour> split(std::span<Colour> &box) {
    const Channel channel = longest_extent(box).channel;
    const int middle = mean_of(box).*channel;
    const auto cut =
        std::stable_partition(box.begin(), box.end(), [=](const Colour &c) { return c.*channel <= middle; });
    const auto kept = static_cast<size_t>(cut - box.begin());
    const std::span<Colour> rest = box.subspan(kept);
    box = box.first(kept);
    return rest;
}

int square(int n) {
    return n * n;
}

void add_error(Colour &to, Colour error, int sixteenths) {
    to = {to.r + error.r * sixteenths / 16, to.g + error.g * sixteenths / 16, to.b + error.b * sixteenths / 16};
}

Colour clamped(Colour c) {
    return {std::clamp(c.r, 0, 255), std::clamp(c.g, 0, 255), std::clamp(c.b, 0, 255)};
}

} // namespace

std::vector<Colour> suitable_palette(const Drawing &drawing, size_t count) {
    std::vector<Colour> colours = drawing.pixels;
    Boxes boxes = {colours};
    while (boxes.size() < count) {
        const auto box = box_to_cut(boxes);
        if (longest_extent(*box).length == 0) break;
        const std::span<Colour> rest = split(*box);
        boxes.push_back(rest);
    }
    std::vector<Colour> palette;
    for (const auto &box : boxes)
        palette.push_back(mean_of(box));
    return palette;
}

size_t nearest_in(const std::vector<Colour> &palette, Colour wanted) {
    const auto distance = [&](const Colour &c) {
        return 3 * square(c.r - wanted.r) + 6 * square(c.g - wanted.g) + square(c.b - wanted.b);
    };
    const auto nearest = std::min_element(palette.begin(), palette.end(),
                                          [&](const Colour &a, const Colour &b) { return distance(a) < distance(b); });
    return static_cast<size_t>(nearest - palette.begin());
}

std::vector<uint32_t> dither(const Drawing &drawing, const std::function<Stored(Colour)> &store) {
    const size_t width = static_cast<size_t>(drawing.width);
    // One column more at each side and one row more below take the errors that fall off the picture.
    std::vector<Colour> errors((width + 2) * (static_cast<size_t>(drawing.height) + 1), Colour{0, 0, 0});
    std::vector<uint32_t> values;
    for (size_t i = 0; i < drawing.pixels.size(); ++i) {
        Colour *const here = &errors[i / width * (width + 2) + i % width + 1];
        const Colour source = drawing.pixels[i];
        const Colour wanted = clamped({source.r + here->r, source.g + here->g, source.b + here->b});
        const Stored stored = store(wanted);
        values.push_back(stored.value);
        const Colour error = {wanted.r - stored.meaning.r, wanted.g - stored.meaning.g, wanted.b - stored.meaning.b};
        Colour *const below = here + width + 2;
        add_error(here[1], error, 7);
        add_error(below[-1], error, 3);
        add_error(below[0], error, 5);
        add_error(below[1], error, 1);
    }
    return values;
}

} // namespace pelm_samples

// Fewer colours: a palette that suits a drawing, and the spreading of what each pixel loses to its neighbours.
#pragma once

#include <functional>

#include "samples/picture.h"

namespace pelm_samples {

// At most `count` colours: the drawing's colours are cut into that many boxes, each where it is longest.
std::vector<Colour> suitable_palette(const Drawing &drawing, size_t count);

size_t nearest_in(const std::vector<Colour> &palette, Colour wanted);

// What is stored for a wanted colour, and the colour that it means.
struct Stored {
    uint32_t value;
    Colour meaning;
};

// The stored values from the top left, with the error of each spread to the right and below (Floyd and Steinberg's
// weights).
std::vector<uint32_t> dither(const Drawing &drawing, const std::function<Stored(Colour)> &store);

} // namespace pelm_samples

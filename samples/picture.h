// The drawn picture in memory.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace pelm_samples {

struct Colour {
    int r, g, b; // 0 to 255
};

struct Drawing {
    int width;
    int height;
    std::vector<Colour> pixels; // from the top left

    const Colour &at(int x, int y) const {
        return pixels[static_cast<size_t>(y) * static_cast<size_t>(width) + static_cast<size_t>(x)];
    }
};

} // namespace pelm_samples

// Stored images as the tests describe them, and what each of their pixels is: an independent model of the loads.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "tests/support/bytes.h"

namespace pelm::test {

enum ColourType : uint8_t { grey = 0, rgb = 2, indexed = 3, grey_alpha = 4, rgb_alpha = 6 };

// How a pixel meets what lies below it.
enum class Coverage {
    opaque,
    keyed,  // the transparent colour: not written where there is no alpha
    blended // has an alpha of its own, whatever its value
};

struct Pixel {
    uint8_t r, g, b, a;
    Coverage coverage;
};

struct Picture {
    uint32_t width = 0;
    uint32_t height = 0;
    uint8_t colour_type = grey;
    uint8_t depth = 8;
    Bytes rows;    // packed as PNG packs them, unfiltered, without filter bytes
    Bytes palette; // RGB triplets
    std::optional<Bytes> transparency;

    unsigned channels() const;
    size_t row_bytes() const;
    uint32_t sample(uint32_t x, uint32_t y, unsigned channel) const;
    void set_sample(uint32_t x, uint32_t y, unsigned channel, uint32_t value);
    Pixel pixel(uint32_t x, uint32_t y) const;
    bool is_plain_grey() const { return colour_type == grey && depth == 8; }
    std::string described() const;
};

// Noise, repeatable for equal arguments. Indexed pictures get a full palette of noise.
Picture noise_picture(uint8_t colour_type, uint8_t depth, uint32_t width, uint32_t height, uint32_t seed = 1);

// With a tRNS of noise (indexed: for half of the palette) or of the colour of the picture's first pixel, which every
// third pixel is then given; types 4 and 6 stay as they are.
Picture with_transparency(Picture picture, uint32_t seed = 1);

struct Layout {
    uint8_t colour_type;
    uint8_t depth;
};
inline constexpr Layout all_layouts[] = {{grey, 1},        {grey, 2},      {grey, 4},      {grey, 8},
                                         {grey, 16},       {rgb, 8},       {rgb, 16},      {indexed, 1},
                                         {indexed, 2},     {indexed, 4},   {indexed, 8},   {grey_alpha, 8},
                                         {grey_alpha, 16}, {rgb_alpha, 8}, {rgb_alpha, 16}};

} // namespace pelm::test

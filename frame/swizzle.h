// Rows of pixels whose channels are whole bytes, four pixels at a time: from any order of channels into any other.
#pragma once

#include <cstddef>
#include <cstdint>

namespace pelm {

// Where the channels of a pixel of `size` bytes lie.
struct ChannelBytes {
    static constexpr uint8_t none = 0xFF;
    uint8_t size, red, green, blue, alpha; // alpha may be `none`
};

// What becomes of the shuffled pixels.
enum class SwizzleTo : uint8_t {
    words,   // four bytes each, as shuffled
    triples, // the first three bytes of each
    rgb565   // red, green, blue, from the first byte on, in 16 bits
};

struct Swizzle {
    uint8_t source_size; // 1, 2, 3, 4, 6 or 8
    SwizzleTo to;
    bool stops_at_alpha; // the last byte of a word is an alpha that only 255 leaves nothing to do for
    uint8_t places[16];  // for each byte of four words its place in the source; those of two words for sizes above 4
    uint8_t ones[16];    // bits that are set behind the shuffle: the alpha of sources without one
};

// Into pixels with their channels at these bytes; an alpha that the target lacks is what `stops_at_alpha` looks at.
constexpr Swizzle make_swizzle(ChannelBytes from, ChannelBytes to, SwizzleTo kind) {
    Swizzle made{from.size, kind, from.alpha != ChannelBytes::none && to.alpha == ChannelBytes::none, {}, {}};
    const uint8_t pixels = from.size > 4 ? 2 : 4;
    for (uint8_t i = 0; i < 16; ++i)
        made.places[i] = 0x80; // no place: zero
    for (uint8_t i = 0; i < pixels; ++i) {
        const auto source = static_cast<uint8_t>(i * from.size);
        uint8_t *const word = made.places + 4 * i;
        word[to.red] = static_cast<uint8_t>(source + from.red);
        word[to.green] = static_cast<uint8_t>(source + from.green);
        word[to.blue] = static_cast<uint8_t>(source + from.blue);
        const uint8_t alpha = to.alpha == ChannelBytes::none ? 3 : to.alpha;
        if (from.alpha != ChannelBytes::none) word[alpha] = static_cast<uint8_t>(source + from.alpha);
    }
    if (from.alpha == ChannelBytes::none && to.alpha != ChannelBytes::none)
        for (uint8_t i = 0; i < 4; ++i)
            made.ones[4 * i + to.alpha] = 0xFF;
    return made;
}

// Whether this processor can.
bool can_swizzle();

// Writes as many of `count` pixels, one behind the other, as it can in groups of four, and returns how many: up to the
// first group that is too near the end of either row, or that has an alpha that `how` stops at. Where can_swizzle.
int32_t swizzle(const Swizzle &how, const uint8_t *row, int32_t count, uint8_t *out);

} // namespace pelm

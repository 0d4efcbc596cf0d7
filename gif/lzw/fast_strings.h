// A second form of the string table, from which strings are written eight pixels at a time.
//
// A string is cut into groups of eight pixels from its start on. An entry holds the pixels of its last group, and the
// code whose string is all that comes before. It is only good for strings whose every part is in the table, which is so
// for the data of any encoder; what else damaged data can bring is left to the tables of gif/lzw/table.h, which
// `to_careful_tables` makes from these.
#pragma once

#include "gif/state.h"

namespace pelm {

// The last group's pixels, the first of them lowest and zeros above the last one.
using PixelGroup = uint64_t;

constexpr int32_t group_pixels = 8;

struct FastEntry {
    PixelGroup group;
    uint32_t link; // length - 1 below, and above it the code of the groups before
};

constexpr uint32_t last_pixel_of(uint32_t link) {
    return link & 0xFFFF;
}

constexpr uint32_t groups_before(uint32_t link) {
    return link >> 16;
}

inline FastEntry fast_entry(const GifFastStrings &strings, uint32_t code) {
    return {strings.group[code], strings.link[code]};
}

// The string of `prefix`, whose code is `prefix_code`, and one more pixel.
constexpr FastEntry extended(FastEntry prefix, uint32_t prefix_code, uint8_t pixel) {
    const uint32_t at = last_pixel_of(prefix.link) + 1;
    const uint32_t place = at % group_pixels;
    if (place == 0) return {pixel, at | prefix_code << 16};
    return {prefix.group | static_cast<uint64_t>(pixel) << (8 * place), at | (prefix.link & 0xFFFF0000)};
}

// The roots of an image whose clear code is `clear_code`.
void begin_fast_strings(GifFastStrings &strings, uint32_t clear_code);

// Makes the careful tables what they would be had they been used from the image's start on. `prefix` is filled already,
// for the entries from behind the end code to `filled`.
void to_careful_tables(const GifFastStrings &strings, uint32_t clear_code, uint32_t filled, GifLzwTables &tables);

} // namespace pelm

// The output pixel formats as the tool knows them: names, sizes, and the way to and from 8 bits per channel.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>
#include <vector>

namespace pelm_tool {

struct Rgba {
    uint8_t r, g, b, a;
};

struct PixelFormat {
    const char *name; // as --format takes it
    uint32_t code;    // PELM_FORMAT_
    size_t bytes;     // per pixel
    bool has_alpha;
    Rgba (*load)(const uint8_t *pixel);
    void (*store)(uint8_t *pixel, Rgba colour);
};

std::span<const PixelFormat> pixel_formats();
const PixelFormat *find_pixel_format(std::string_view name); // nullptr: there is none

// A decoded image: rows from top to bottom without padding, as the library wrote them.
struct Picture {
    const PixelFormat *format = nullptr;
    size_t width = 0;
    size_t height = 0;
    std::vector<uint8_t> bytes;

    const uint8_t *row(size_t y) const { return bytes.data() + y * width * format->bytes; }
};

void fill(Picture &picture, Rgba colour);

// How many bytes per pixel a PNG or PAM of this picture has: 4 with alpha, 3 without.
inline size_t channels_of(const Picture &picture) {
    return picture.format->has_alpha ? 4 : 3;
}

// One row as R, G, B or R, G, B, alpha; `to` has room for `channels` bytes per pixel.
void unpack_row(const Picture &picture, size_t y, size_t channels, uint8_t *to);

} // namespace pelm_tool

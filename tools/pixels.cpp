#include "tools/pixels.h"

#include <cstring>

#include "PelmImageDecoder.h"

namespace pelm_tool {
namespace {

// The high bits come again as the low ones, so that black stays 0 and white becomes 255.
uint8_t widen5(unsigned value) {
    return static_cast<uint8_t>(value << 3 | value >> 2);
}

uint8_t widen6(unsigned value) {
    return static_cast<uint8_t>(value << 2 | value >> 4);
}

uint16_t pack565(unsigned high, unsigned middle, unsigned low) {
    return static_cast<uint16_t>(high >> 3 << 11 | middle >> 2 << 5 | low >> 3);
}

// The fields of a 565 value from the high to the low one, as the r, g and b of an opaque colour.
Rgba unpack565(unsigned value) {
    return {widen5(value >> 11 & 31), widen6(value >> 5 & 63), widen5(value & 31), 255};
}

uint16_t load_native16(const uint8_t *pixel) {
    uint16_t value;
    std::memcpy(&value, pixel, sizeof value);
    return value;
}

void store_native16(uint8_t *pixel, uint16_t value) {
    std::memcpy(pixel, &value, sizeof value);
}

Rgba load_rgb565(const uint8_t *pixel) {
    return unpack565(load_native16(pixel));
}
void store_rgb565(uint8_t *pixel, Rgba c) {
    store_native16(pixel, pack565(c.r, c.g, c.b));
}

Rgba load_rgb(const uint8_t *pixel) {
    return {pixel[0], pixel[1], pixel[2], 255};
}
void store_rgb(uint8_t *pixel, Rgba c) {
    pixel[0] = c.r;
    pixel[1] = c.g;
    pixel[2] = c.b;
}

Rgba load_argb(const uint8_t *pixel) {
    return {pixel[1], pixel[2], pixel[3], pixel[0]};
}
void store_argb(uint8_t *pixel, Rgba c) {
    pixel[0] = c.a;
    store_rgb(pixel + 1, c);
}

Rgba load_rgb565a(const uint8_t *pixel) {
    Rgba colour = unpack565(pixel[0] | unsigned{pixel[1]} << 8);
    colour.a = pixel[2];
    return colour;
}
void store_rgb565a(uint8_t *pixel, Rgba c) {
    const uint16_t value = pack565(c.r, c.g, c.b);
    pixel[0] = static_cast<uint8_t>(value & 0xFF);
    pixel[1] = static_cast<uint8_t>(value >> 8);
    pixel[2] = c.a;
}

Rgba load_rgba(const uint8_t *pixel) {
    return {pixel[0], pixel[1], pixel[2], pixel[3]};
}
void store_rgba(uint8_t *pixel, Rgba c) {
    store_rgb(pixel, c);
    pixel[3] = c.a;
}

Rgba load_bgra(const uint8_t *pixel) {
    return {pixel[2], pixel[1], pixel[0], pixel[3]};
}
void store_bgra(uint8_t *pixel, Rgba c) {
    store_rgba(pixel, {c.b, c.g, c.r, c.a});
}

Rgba load_bgr565(const uint8_t *pixel) {
    const Rgba swapped = load_rgb565(pixel);
    return {swapped.b, swapped.g, swapped.r, 255};
}
void store_bgr565(uint8_t *pixel, Rgba c) {
    store_native16(pixel, pack565(c.b, c.g, c.r));
}

Rgba load_bgr(const uint8_t *pixel) {
    return {pixel[2], pixel[1], pixel[0], 255};
}
void store_bgr(uint8_t *pixel, Rgba c) {
    store_rgb(pixel, {c.b, c.g, c.r, c.a});
}

void store_bgrx(uint8_t *pixel, Rgba c) {
    store_bgra(pixel, {c.r, c.g, c.b, 255});
}

constexpr PixelFormat formats[] = {
    {"rgb565", PELM_FORMAT_RGB565, 2, false, load_rgb565, store_rgb565},
    {"rgb", PELM_FORMAT_RGB888, 3, false, load_rgb, store_rgb},
    {"argb", PELM_FORMAT_ARGB8888, 4, true, load_argb, store_argb},
    {"rgb565a", PELM_FORMAT_RGB565_A8, 3, true, load_rgb565a, store_rgb565a},
    {"rgba", PELM_FORMAT_RGBA8888, 4, true, load_rgba, store_rgba},
    {"bgra", PELM_FORMAT_BGRA8888, 4, true, load_bgra, store_bgra},
    {"bgr565", PELM_FORMAT_BGR565, 2, false, load_bgr565, store_bgr565},
    {"bgr", PELM_FORMAT_BGR888, 3, false, load_bgr, store_bgr},
    {"bgrx", PELM_FORMAT_BGRX8888, 4, false, load_bgr, store_bgrx},
};

} // namespace

std::span<const PixelFormat> pixel_formats() {
    return formats;
}

const PixelFormat *find_pixel_format(std::string_view name) {
    for (const PixelFormat &format : formats) {
        if (name == format.name) return &format;
    }
    return nullptr;
}

void fill(Picture &picture, Rgba colour) {
    for (size_t at = 0; at < picture.bytes.size(); at += picture.format->bytes) {
        picture.format->store(picture.bytes.data() + at, colour);
    }
}

void unpack_row(const Picture &picture, size_t y, size_t channels, uint8_t *to) {
    const uint8_t *pixel = picture.row(y);
    for (size_t x = 0; x < picture.width; ++x, pixel += picture.format->bytes, to += channels) {
        const Rgba colour = picture.format->load(pixel);
        store_rgb(to, colour);
        if (channels == 4) to[3] = colour.a;
    }
}

} // namespace pelm_tool

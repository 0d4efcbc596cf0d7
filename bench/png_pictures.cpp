#include "bench/png_pictures.h"

#include <algorithm>
#include <cmath>
#include <string_view>

#include "bench/png_writer.h"
#include "tools/tiny_font.h"

namespace bench {
namespace {

struct Pixel {
    int r, g, b, a; // 0 to 255
};

int clamped(int value) {
    return std::clamp(value, 0, 255);
}

uint32_t scrambled(uint32_t seed) {
    seed = (seed ^ seed >> 15) * 2246822519u;
    seed = (seed ^ seed >> 13) * 3266489917u;
    return seed ^ seed >> 16;
}

// A slow sine with the given period, from -100 to 100.
int wave(uint32_t at, uint32_t period) {
    static const std::vector<int8_t> sine = [] {
        std::vector<int8_t> values(1024);
        for (size_t i = 0; i < values.size(); ++i)
            values[i] = static_cast<int8_t>(std::lround(100 * std::sin(static_cast<double>(i) * 6.283185307 / 1024)));
        return values;
    }();
    return sine[at * 1024 / period & 1023];
}

Pixel photo_at(uint32_t x, uint32_t y) {
    const int light =
        (wave(x + y / 3, 2900) + wave(y, 1700) + wave(2 * x + static_cast<uint32_t>(100 + wave(y, 400)), 900)) / 4;
    const int leaves = wave(x, 61) * wave(y + x / 7, 47) / 400;
    const uint32_t noise = scrambled(x * 73856093u ^ y * 19349663u);
    const auto grain = [&](uint32_t shift) {
        return static_cast<int>((noise >> shift & 3) + (noise >> (shift + 2) & 3)) - 3;
    };
    return {clamped(140 + light + leaves + grain(0)), clamped(120 + light * 3 / 4 + leaves + grain(8)),
            clamped(90 + light / 2 - leaves + grain(16)), clamped(400 + 3 * wave(x + y, 3000))};
}

bool letter_at(uint32_t x, uint32_t y, uint32_t scale) {
    static constexpr std::string_view lines[] = {"The quick brown fox jumps over the lazy dog, then rests a while.",
                                                 "Pack my box with five dozen jugs of liquid; count 0123456789.",
                                                 "Sphinx of black quartz, judge my vow. How vexingly quick daft"};
    const uint32_t line_height = 12 * scale;
    const uint32_t line = y / line_height;
    const std::string_view words = lines[scrambled(line) % 3];
    const auto column = static_cast<int>((x / scale + scrambled(line + 9) % 90) % 400);
    return pelm_tool::dot_of_text(words, column, static_cast<int>(y % line_height / scale) - 2);
}

Pixel screenshot_at(uint32_t x, uint32_t y) {
    const uint32_t window = x / 700 + y / 500 * 7;
    const uint32_t in_x = x % 700, in_y = y % 500;
    if (in_x < 12 || in_y < 12) return {44, 62, 80, 255};
    if (in_y < 40) return {52 + static_cast<int>(window * 29 % 120), 110, 190, 255};
    if (in_x < 160) return letter_at(x, y / 2, 2) && in_x > 24 ? Pixel{70, 70, 80, 255} : Pixel{232, 234, 238, 255};
    return letter_at(x, y, 1) ? Pixel{30, 30, 36, 255} : Pixel{255, 255, 255, 255};
}

Pixel illustration_at(uint32_t x, uint32_t y) {
    Pixel colour = {0, 0, 0, 0};
    for (uint32_t i = 0; i < 3; ++i) {
        const uint32_t cell = 320u << i;
        const uint32_t seed = scrambled(x / cell * 31 + y / cell * 57 + i);
        const int radius = static_cast<int>(cell) * (30 + static_cast<int>(seed % 18)) / 100;
        const int from_x = static_cast<int>(x % cell) - static_cast<int>(cell / 2);
        const int from_y = static_cast<int>(y % cell) - static_cast<int>(cell / 2);
        const int inside = radius - static_cast<int>(std::sqrt(static_cast<double>(from_x * from_x + from_y * from_y)));
        if (inside < -2) continue;
        const auto part = [&](uint32_t shift) { return static_cast<int>(seed >> shift & 127) + 64 + from_y / 16; };
        colour = {clamped(part(3)), clamped(part(11)), clamped(part(19)), clamped(128 + 64 * inside)};
    }
    return colour;
}

Pixel text_at(uint32_t x, uint32_t y) {
    return letter_at(x, y, 2) ? Pixel{0, 0, 0, 255} : Pixel{255, 255, 255, 255};
}

Pixel pixel_of(Motif motif, uint32_t x, uint32_t y) {
    switch (motif) {
    case Motif::photo: return photo_at(x, y);
    case Motif::screenshot: return screenshot_at(x, y);
    case Motif::illustration: return illustration_at(x, y);
    case Motif::text: break;
    }
    return text_at(x, y);
}

int grey_of(Pixel p) {
    return (2 * p.r + 5 * p.g + p.b) / 8;
}

void append(std::vector<uint8_t> &row, std::initializer_list<int> values) {
    for (const int value : values)
        row.push_back(static_cast<uint8_t>(value));
}

// 3, 3 and 2 bits.
int index_of(Pixel p) {
    return p.r >> 5 << 5 | p.g >> 5 << 2 | p.b >> 6;
}

// Samples of 16 bits get low bytes that hold noise, as those of cameras do.
void append_wide(std::vector<uint8_t> &row, Pixel p, uint32_t x) {
    for (const int high : {p.r, p.g, p.b})
        append(row, {high, static_cast<int>(scrambled(x + static_cast<uint32_t>(high)) & 0xFC)});
}

void append_bit(std::vector<uint8_t> &row, bool white, uint32_t x) {
    if (x % 8 == 0) row.push_back(0);
    if (white) row.back() = static_cast<uint8_t>(row.back() | 0x80 >> x % 8);
}

void append_pixel(std::vector<uint8_t> &row, Stored stored, Pixel p, uint32_t x) {
    switch (stored) {
    case Stored::rgb: append(row, {p.r, p.g, p.b}); break;
    case Stored::rgba: append(row, {p.r, p.g, p.b, p.a}); break;
    case Stored::grey: append(row, {grey_of(p)}); break;
    case Stored::palette: append(row, {index_of(p)}); break;
    case Stored::rgb16: append_wide(row, p, x); break;
    case Stored::grey1: append_bit(row, grey_of(p) >= 128, x); break;
    }
}

PngLayout layout_of(Stored stored) {
    switch (stored) {
    case Stored::rgb: return {2, 8};
    case Stored::rgba: return {6, 8};
    case Stored::grey: return {0, 8};
    case Stored::palette: return {3, 8};
    case Stored::rgb16: return {2, 16};
    case Stored::grey1: break;
    }
    return {0, 1};
}

} // namespace

std::vector<uint8_t> rgb_row(Motif motif, uint32_t y, uint32_t first_x, uint32_t width) {
    std::vector<uint8_t> row;
    for (uint32_t x = first_x; x < first_x + width; ++x) {
        const Pixel p = pixel_of(motif, x, y);
        append(row, {p.r, p.g, p.b});
    }
    return row;
}

std::vector<uint8_t> png_picture(Motif motif, Stored stored, uint32_t width, uint32_t height) {
    return write_png(width, height, layout_of(stored), [&](uint32_t y, std::vector<uint8_t> &row) {
        for (uint32_t x = 0; x < width; ++x)
            append_pixel(row, stored, pixel_of(motif, x, y), x);
    });
}

} // namespace bench

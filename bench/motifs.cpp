#include "bench/motifs.h"

#include <algorithm>
#include <cmath>
#include <string_view>
#include <vector>

#include "tools/tiny_font.h"

namespace bench {

uint32_t scrambled(uint32_t seed) {
    seed = (seed ^ seed >> 15) * 2246822519u;
    seed = (seed ^ seed >> 13) * 3266489917u;
    return seed ^ seed >> 16;
}

namespace {

int clamped(int value) {
    return std::clamp(value, 0, 255);
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

// At 300 dots per inch: a centimetre of margin, paragraphs of five lines of twelve-point letters, the last one short.
bool print_at(uint32_t x, uint32_t y) {
    constexpr uint32_t margin = 120, scale = 5, line_height = 12 * scale, line_width = 72 * 6 * scale;
    if (x < margin || y < margin) return false;
    const uint32_t line = (y - margin) / line_height, in_paragraph = line % 6;
    const uint32_t width = in_paragraph == 5 ? 0 : in_paragraph == 4 ? line_width * (line % 7 + 2) / 10 : line_width;
    return x - margin < width && letter_at(x - margin, y - margin, scale);
}

// Edges are soft, as those of print are.
Pixel text_at(uint32_t x, uint32_t y) {
    const int dots =
        int{print_at(x, y)} + int{print_at(x + 1, y)} + int{print_at(x, y + 1)} + int{print_at(x + 1, y + 1)};
    const int light = 255 - dots * 255 / 4;
    return {light, light, light, 255};
}

} // namespace

Pixel pixel_of(Motif motif, uint32_t x, uint32_t y) {
    switch (motif) {
    case Motif::photo: return photo_at(x, y);
    case Motif::screenshot: return screenshot_at(x, y);
    case Motif::illustration: return illustration_at(x, y);
    case Motif::text: break;
    }
    return text_at(x, y);
}

} // namespace bench

// Integers only, so that every compiler and processor draws the same bytes. Each pixel is the mean of 4 x 4 points;
// all coordinates are quarters of a pixel.
#include "samples/scene.h"

#include <algorithm>
#include <cstdlib>

#include "tools/tiny_font.h"

namespace pelm_samples {
namespace {

constexpr int width = 320;
constexpr int height = 240;
constexpr int q = 4; // points per pixel and direction
constexpr int horizon = 150 * q;

struct Point {
    int x, y;
};

constexpr Point sun = {104 * q, 122 * q};
constexpr int sun_radius = 25 * q;

// `weight` of 256 parts of `b`.
Colour mix(Colour a, Colour b, int weight) {
    const int w = std::clamp(weight, 0, 256);
    return {a.r + (b.r - a.r) * w / 256, a.g + (b.g - a.g) * w / 256, a.b + (b.b - a.b) * w / 256};
}

int square_distance(Point a, Point b) {
    return (a.x - b.x) * (a.x - b.x) + (a.y - b.y) * (a.y - b.y);
}

// A number from 0 to 255 that looks random.
int noise(int seed) {
    uint32_t n = static_cast<uint32_t>(seed) * 2654435761u;
    n = (n ^ n >> 15) * 2246822519u;
    return static_cast<int>((n ^ n >> 13) & 255);
}

// Noise that runs smoothly through its values at multiples of `step`.
int smooth_noise(int at, int step, int seed) {
    const int cell = at / step;
    const int part = at % step * 256 / step;
    const int eased = part * part / 256 * (768 - 2 * part) / 256;
    return (noise(cell + seed) * (256 - eased) + noise(cell + 1 + seed) * eased) / 256;
}

// A colour on a scale of stops; `at` from 0 to the last stop's place.
struct Stop {
    int at;
    Colour colour;
};

template <size_t count>
Colour on_scale(const Stop (&stops)[count], int at) {
    for (size_t i = 1; i < count; ++i) {
        if (at > stops[i].at) continue;
        const int span = stops[i].at - stops[i - 1].at;
        return mix(stops[i - 1].colour, stops[i].colour, (at - stops[i - 1].at) * 256 / span);
    }
    return stops[count - 1].colour;
}

constexpr Stop sky_scale[] = {{0, {22, 24, 66}},         {45 * q, {58, 44, 112}},   {85 * q, {148, 68, 128}},
                              {118 * q, {230, 108, 98}}, {138 * q, {250, 160, 92}}, {horizon, {255, 204, 120}}};

Colour with_stars(Colour sky, Point p) {
    constexpr int cell = 20 * q;
    const int seed = p.x / cell * 37 + p.y / cell * 101;
    const Point star = {p.x / cell * cell + noise(seed) * cell / 256, p.y / cell * cell + noise(seed + 7) * cell / 256};
    const int size = 2 + noise(seed + 3) / 90;
    const int light = 230 - star.y * 230 / (75 * q);
    if (noise(seed + 11) < 110 || light <= 0 || square_distance(p, star) > size * size) return sky;
    return mix(sky, {255, 250, 235}, light);
}

Colour with_moon(Colour sky, Point p) {
    constexpr Point moon = {272 * q, 34 * q};
    constexpr Point shadow = {265 * q, 30 * q};
    constexpr int radius = 13 * q;
    if (square_distance(p, moon) > radius * radius || square_distance(p, shadow) < radius * radius) return sky;
    return {250, 242, 214};
}

// Bands of cloud, lit from below.
Colour with_clouds(Colour sky, Point p) {
    const int drift = smooth_noise(p.x + p.y * 3, 70 * q, 900) / 3;
    const int band = smooth_noise(p.y + drift, 11 * q, 400);
    const int patch = smooth_noise(p.x + p.y * 2, 46 * q, 70) + smooth_noise(p.x, 17 * q, 30 + p.y / (9 * q) * 50) / 3;
    const int thickness = band * patch / 256 - 118;
    const int fade = std::clamp((p.y - 38 * q) * 256 / (24 * q), 0, 256); // none high up
    if (thickness <= 0) return sky;
    const Colour lit = mix({176, 84, 132}, {255, 176, 120}, (p.y - 50 * q) * 256 / (90 * q));
    return mix(sky, lit, std::min(thickness * 3, 150) * fade / 256);
}

Colour with_sun(Colour sky, Point p) {
    const int distance = square_distance(p, sun);
    constexpr int radius = sun_radius * sun_radius;
    if (distance <= radius)
        return mix({255, 250, 214}, {255, 208, 104}, (p.y - sun.y + sun_radius) * 256 / (2 * sun_radius));
    const int glow = static_cast<int>(int64_t{200} * radius / (distance - radius / 4));
    return mix(sky, {255, 220, 150}, glow);
}

// Two ranges of hills on the right, the nearer one darker.
Colour with_hills(Colour sky, Point p) {
    const int far_top = horizon - std::max(0, (p.x - 130 * q) / 4 - 4 * q) * smooth_noise(p.x, 34 * q, 12) / 150;
    const int near_top = horizon - std::max(0, (p.x - 205 * q) / 2) * (60 + smooth_noise(p.x, 27 * q, 51)) / 330;
    if (p.y > near_top) return mix({58, 36, 84}, {92, 48, 92}, (p.y - near_top) * 256 / (40 * q));
    if (p.y > far_top) return mix({128, 66, 116}, {190, 96, 110}, (p.y - far_top) * 256 / (36 * q));
    return sky;
}

Colour sky_at(Point p) {
    Colour colour = with_stars(on_scale(sky_scale, p.y), p);
    colour = with_moon(colour, p);
    colour = with_sun(colour, p);
    colour = with_clouds(colour, p);
    return with_hills(colour, p);
}

constexpr Stop sea_scale[] = {
    {0, {236, 150, 108}}, {12 * q, {166, 88, 116}}, {40 * q, {74, 50, 104}}, {90 * q, {22, 22, 58}}};

// Waves are short near the horizon and long in front.
int wave_at(Point p, int depth) {
    const int line = depth * 220 / (depth + 30 * q); // rows of waves, closer together far away
    const int length = 5 * q + depth / 5;
    return smooth_noise(p.x + noise(line * 13) * q, length, line * 57);
}

Colour sea_at(Point p) {
    const int depth = p.y - horizon;
    const int wave = wave_at(p, depth);
    const Colour water = mix(on_scale(sea_scale, depth), {255, 170, 130}, std::max(0, wave - 150) * 2 / 3);
    const int half_path = sun_radius * 3 / 4 + depth / 5;
    const int off_path = std::abs(p.x - sun.x) * 150 / half_path;
    return wave > off_path ? mix(water, {255, 222, 140}, 235 - depth / 5) : water;
}

// Whether p lies in the triangle, whichever way round it is given.
bool in_triangle(Point p, Point a, Point b, Point c) {
    const auto side = [](Point from, Point to, Point at) {
        return int64_t{to.x - from.x} * (at.y - from.y) - int64_t{to.y - from.y} * (at.x - from.x);
    };
    const int64_t first = side(a, b, p), second = side(b, c, p), third = side(c, a, p);
    return (first >= 0 && second >= 0 && third >= 0) || (first <= 0 && second <= 0 && third <= 0);
}

bool in_box(Point p, Point from, Point to) {
    return p.x >= from.x && p.x < to.x && p.y >= from.y && p.y < to.y;
}

constexpr Point dots(int x, int y) {
    return {x * q, y * q};
}

// A sailing boat left of the middle, heading left.
Colour with_boat(Colour behind, Point p) {
    const bool hull =
        p.y >= 183 * q && p.y < 193 * q && p.x > 30 * q + (p.y - 183 * q) && p.x < 92 * q - (p.y - 183 * q) / 2;
    if (hull) return p.y < 186 * q ? Colour{236, 226, 206} : Colour{120, 30, 44};
    if (in_box(p, dots(62, 112), dots(64, 183))) return {70, 46, 40};
    if (in_triangle(p, dots(60, 116), dots(60, 179), dots(33, 179))) {
        return mix({255, 244, 222}, {232, 170, 140}, (p.y - 116 * q) * 256 / (80 * q));
    }
    if (in_triangle(p, dots(66, 124), dots(66, 179), dots(92, 179))) {
        return p.y / (11 * q) % 2 == 0 ? Colour{206, 52, 52} : Colour{250, 232, 206};
    }
    if (in_triangle(p, dots(64, 106), dots(64, 114), dots(78, 110))) return {58, 170, 150};
    return behind;
}

// Its dark image in the water.
Colour with_boat_shadow(Colour behind, Point p) {
    const int depth = p.y - 193 * q;
    if (depth < 0 || depth > 22 * q) return behind;
    const int sway = noise(p.y / (2 * q)) * q / 40;
    if (std::abs(p.x - 61 * q + sway - 3 * q) > 24 * q - depth) return behind;
    return mix(behind, {40, 16, 44}, 170 - depth);
}

// The lighthouse on its rock at the right.
Colour with_lighthouse(Colour behind, Point p) {
    const int half = 7 * q + (p.y - 78 * q) / 16;
    const int off = p.x - 266 * q;
    if (in_box(p, dots(254, 74), dots(278, 78))) return {52, 34, 58};
    if (in_box(p, dots(260, 62), dots(272, 74))) return {255, 236, 150};
    if (in_triangle(p, dots(257, 62), dots(275, 62), dots(266, 52))) return {150, 36, 48};
    if (p.y < 78 * q || p.y >= 167 * q || std::abs(off) > half) return behind;
    const Colour paint = (p.y - 78 * q) / (15 * q) % 2 == 0 ? Colour{240, 228, 214} : Colour{192, 54, 56};
    return mix(paint, {60, 30, 70}, (off + half) * 150 / (2 * half));
}

Colour with_rock(Colour behind, Point p) {
    const int rise = 26 * q - std::abs(p.x - 274 * q) * 26 / 58 - smooth_noise(p.x, 6 * q, 800) / 12;
    const int top = 186 * q - rise;
    if (p.y < top || p.y > 190 * q + smooth_noise(p.x, 5 * q, 200) / 40) return behind;
    const int light = smooth_noise(p.x + p.y * 2, 5 * q, 640) / 4;
    return mix({34, 24, 44}, {130, 78, 92}, light + std::max(0, 60 - (p.y - top) * 2));
}

// The lamp's beam points to the upper left.
Colour with_beam(Colour behind, Point p, int rise) {
    const int left = 262 * q - p.x;
    const int off = std::abs(p.y - (68 * q - left * rise / 100));
    const int spread = 2 * q + left / 12;
    if (left <= 0 || off > spread) return behind;
    return mix(behind, {255, 246, 190}, (spread - off) * std::max(0, 150 - left / 8) / spread);
}

constexpr Point birds[] = {dots(158, 62), dots(174, 52), dots(182, 70), dots(204, 58)};

Colour with_birds(Colour behind, Point p) {
    for (const Point bird : birds) {
        const int off = std::abs(p.x - bird.x);
        const int wing = bird.y - off * (9 * q - off) / (8 * q);
        if (off < 7 * q && std::abs(p.y - wing) <= 3) return {34, 22, 50};
    }
    return behind;
}

// A signature in the lower right corner: small detail, and readable one way only.
Colour with_lettering(Colour behind, Point p) {
    constexpr std::string_view text = "PELM 320X240";
    constexpr int left = width - pelm_tool::text_width(text) - 8;
    constexpr int top = height - pelm_tool::glyph_height - 8;
    const int x = p.x / q - left;
    const int y = p.y / q - top;
    if (x < 0 || y < 0) return behind;
    return pelm_tool::dot_of_text(text, x, y) ? Colour{255, 226, 170} : behind;
}

Colour scene_at(Point p, Moment moment) {
    Colour colour = p.y < horizon ? sky_at(p) : sea_at(p);
    if (p.y < horizon) colour = with_birds(with_beam(colour, p, moment.beam_rise), p);
    colour = with_lighthouse(colour, p);
    colour = with_rock(colour, p);
    const Point from_boat = {p.x + moment.sailed * q, p.y};
    colour = with_boat_shadow(colour, from_boat);
    return with_lettering(with_boat(colour, from_boat), p);
}

Colour pixel_at(int x, int y, Moment moment) {
    Colour sum = {0, 0, 0};
    for (int i = 0; i < q * q; ++i) {
        const Colour point = scene_at({x * q + i % q, y * q + i / q}, moment);
        sum = {sum.r + point.r, sum.g + point.g, sum.b + point.b};
    }
    return {sum.r / (q * q), sum.g / (q * q), sum.b / (q * q)};
}

} // namespace

Drawing draw_scene(Moment moment) {
    Drawing drawing{width, height, {}};
    for (int y = 0; y < height; ++y) {
        for (int x = 0; x < width; ++x)
            drawing.pixels.push_back(pixel_at(x, y, moment));
    }
    return drawing;
}

} // namespace pelm_samples

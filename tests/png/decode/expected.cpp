#include "tests/png/decode/expected.h"

#include <algorithm>
#include <cstdio>

namespace pelm::test {

size_t pixel_size(uint32_t format) {
    switch (format) {
    case 0: return 2;
    case 1:
    case 6: return 3;
    default: return 4;
    }
}

std::string Request::described() const {
    return "format " + std::to_string(format) + ", turned " + std::to_string(quarter_turns() * 90) + ", placement " +
           std::to_string(flags & 0x700) + ", box " + std::to_string(box_width) + "x" + std::to_string(box_height);
}

namespace {

void fit(const Picture &picture, uint32_t box_x, uint32_t box_y, Geometry &geometry) {
    if (picture.width <= box_x && picture.height <= box_y) {
        geometry.width = picture.width;
        geometry.height = picture.height;
        geometry.one_to_one = true;
        return;
    }
    const volatile float across = static_cast<float>(picture.width) / static_cast<float>(box_x);
    const volatile float down = static_cast<float>(picture.height) / static_cast<float>(box_y);
    if (across < down) {
        geometry.height = box_y;
        geometry.width = picture.width * box_y / picture.height;
    } else {
        geometry.width = box_x;
        geometry.height = picture.height * box_x / picture.width;
    }
}

} // namespace

// For boxes without negative sides.
Geometry geometry_of(const Picture &picture, const Request &request) {
    const bool sideways = request.quarter_turns() % 2 == 1;
    const uint32_t box_x = static_cast<uint32_t>(sideways ? request.box_height : request.box_width);
    const uint32_t box_y = static_cast<uint32_t>(sideways ? request.box_width : request.box_height);
    Geometry geometry;
    if ((request.flags & 0x700) == 0x700) {
        geometry.width = box_x;
        geometry.height = box_y;
    } else {
        fit(picture, box_x, box_y, geometry);
    }
    if (request.exact()) {
        geometry.stride = geometry.width;
        return geometry;
    }
    const int64_t placed_width = sideways ? geometry.height : geometry.width;
    const int64_t placed_height = sideways ? geometry.width : geometry.height;
    geometry.stride = request.box_width;
    geometry.left = (request.box_width - placed_width) >> 1;
    geometry.top = (request.box_height - placed_height) >> 1;
    return geometry;
}

int64_t buffer_pixels(const Geometry &geometry, const Request &request) {
    if (request.exact()) return int64_t{geometry.width} * geometry.height;
    return int64_t{std::max(request.box_width, 0)} * std::max(request.box_height, 0);
}

namespace {

unsigned rgb565(unsigned r, unsigned g, unsigned b) {
    return (r >> 3) << 11 | (g >> 2) << 5 | b >> 3;
}

unsigned over_565_channel(unsigned colour, unsigned alpha, unsigned old) {
    return ((colour * (alpha + 1)) >> 8) + (((256 - alpha) * old) >> 8);
}

unsigned over_565(const Pixel &p, unsigned old) {
    return rgb565(over_565_channel(p.r, p.a, (old >> 11) << 3) & 0xFF,
                  over_565_channel(p.g, p.a, ((old >> 5) & 63) << 2) & 0xFF,
                  over_565_channel(p.b, p.a, (old & 31) << 3) & 0xFF);
}

uint8_t over_byte(unsigned colour, unsigned alpha, unsigned old) {
    return static_cast<uint8_t>(((colour * alpha + colour) >> 8) + ((old * (256 - alpha)) >> 8));
}

void put_bytes(uint8_t *at, std::initializer_list<unsigned> values) {
    for (const unsigned value : values)
        *at++ = static_cast<uint8_t>(value);
}

void put_over(uint32_t format, uint8_t *at, const Pixel &p) {
    if (format == 0) {
        const unsigned value = over_565(p, static_cast<unsigned>(at[0] | at[1] << 8));
        put_bytes(at, {value & 0xFF, value >> 8});
    } else {
        put_bytes(at, {over_byte(p.r, p.a, at[0]), over_byte(p.g, p.a, at[1]), over_byte(p.b, p.a, at[2])});
    }
}

void put_pixel(uint32_t format, uint8_t *at, const Pixel &p) {
    const unsigned packed = rgb565(p.r, p.g, p.b);
    const bool has_alpha = format != 0 && format != 1;
    if (!has_alpha && p.coverage == Coverage::keyed) return;
    if (!has_alpha && p.coverage == Coverage::blended) return put_over(format, at, p);
    switch (format) {
    case 0: return put_bytes(at, {packed & 0xFF, packed >> 8});
    case 1: return put_bytes(at, {p.r, p.g, p.b});
    case 5: return put_bytes(at, {p.a, p.r, p.g, p.b});
    case 6: return put_bytes(at, {packed & 0xFF, packed >> 8, p.a});
    case 7: return put_bytes(at, {p.r, p.g, p.b, p.a});
    case 8: return put_bytes(at, {p.b, p.g, p.r, p.a});
    default: return;
    }
}

} // namespace

void Canvas::put(int64_t index, const Pixel &pixel) {
    const int64_t size = static_cast<int64_t>(pixel_size(format_));
    if (index < 0 || (index + 1) * size > static_cast<int64_t>(bytes_.size())) return;
    put_pixel(format_, bytes_.data() + index * size, pixel);
}

void draw_one_to_one(const Picture &picture, const Geometry &geometry, const Request &request, uint32_t first_row,
                     uint32_t end_row, Bytes &bytes) {
    Canvas canvas(request.format, bytes);
    for (uint32_t y = first_row; y < end_row; ++y)
        for (uint32_t x = 0; x < picture.width; ++x)
            canvas.put((geometry.top + y) * geometry.stride + geometry.left + x, picture.pixel(x, y));
}

std::vector<GreyRow> used_grey_rows(const Picture &picture, const Geometry &geometry) {
    std::vector<GreyRow> used;
    uint32_t x_start = picture.width >> 2;
    uint32_t y_accumulator = picture.height >> 2;
    uint32_t source_y = 0;
    for (uint32_t row = 0; row < picture.height; ++row) {
        const int64_t d = int64_t{y_accumulator} - source_y;
        if (!(d >= 0 && d < geometry.height)) {
            source_y += geometry.height;
            continue;
        }
        used.push_back({row, y_accumulator / picture.height, x_start});
        x_start = picture.width >> 1;
        y_accumulator += picture.height;
    }
    return used;
}

void draw_scaled_grey(const Picture &picture, const Geometry &geometry, const Request &request, size_t first_used,
                      size_t end_used, uint32_t base, Bytes &bytes) {
    Canvas canvas(request.format, bytes);
    const std::vector<GreyRow> used = used_grey_rows(picture, geometry);
    for (size_t n = first_used; n < std::min(end_used, used.size()); ++n) {
        const GreyRow &row = used[n];
        const int64_t line = (geometry.top + (int64_t{row.output_row} - base)) * geometry.stride + geometry.left;
        uint32_t accumulator = row.first_sample;
        for (uint32_t i = 0; i < picture.width; ++i)
            while (int64_t{accumulator} - int64_t{i} * geometry.width >= 0 &&
                   int64_t{accumulator} - int64_t{i} * geometry.width < geometry.width) {
                canvas.put(line + accumulator / picture.width, picture.pixel(i, row.source_row));
                accumulator += picture.width;
            }
    }
}

namespace {

struct SamplePoint {
    uint64_t x, y;
};

SamplePoint sample_point(const Picture &picture, unsigned k) {
    const uint64_t w = picture.width, h = picture.height;
    return {k % 2 == 0 ? w / 4 : 3 * w / 4, k < 2 ? h / 4 : 3 * h / 4};
}

unsigned times_alpha(unsigned colour, unsigned alpha) {
    return (colour * alpha * 2 + 255) / 510;
}

unsigned without_alpha(unsigned colour, unsigned alpha) {
    if (alpha == 0) return 0;
    return std::min(255u, (colour * 255 * 2 + alpha) / (alpha * 2));
}

} // namespace

Pixel reduced_pixel(const Picture &picture, const Geometry &geometry, uint32_t column, uint32_t row) {
    unsigned r = 0, g = 0, b = 0, a = 0;
    for (unsigned k = 0; k < 4; ++k) {
        const SamplePoint at = sample_point(picture, k);
        const uint64_t x = (uint64_t{column} * picture.width + at.x) / geometry.width;
        const uint64_t y = (uint64_t{row} * picture.height + at.y) / geometry.height;
        const Pixel p = picture.pixel(static_cast<uint32_t>(x), static_cast<uint32_t>(y));
        r += (times_alpha(p.r, p.a) + k) >> 2;
        g += (times_alpha(p.g, p.a) + k) >> 2;
        b += (times_alpha(p.b, p.a) + k) >> 2;
        a += (p.a + k) >> 2;
    }
    const auto channel = [a](unsigned c) { return static_cast<uint8_t>(without_alpha(c, a)); };
    return {channel(r), channel(g), channel(b), static_cast<uint8_t>(a), Coverage::blended};
}

uint32_t reduced_rows_after(const Picture &picture, const Geometry &geometry, uint32_t source_rows) {
    const uint64_t last_line = sample_point(picture, 3).y;
    uint32_t complete = 0;
    while (complete < geometry.height &&
           (uint64_t{complete} * picture.height + last_line) / geometry.height < source_rows)
        ++complete;
    return complete;
}

namespace {

// The buffer pixel that shows image pixel (0, 0), and the steps along a row and from row to row.
struct Walk {
    int64_t first, along, down;
};

Walk walk_of(const Geometry &geometry, const Request &request) {
    const int64_t s = geometry.stride, w = geometry.width, h = geometry.height;
    const int64_t left = geometry.left, top = geometry.top;
    switch (request.quarter_turns()) {
    case 0: return {top * s + left, 1, s};
    case 1: return {top * s + left + h - 1, s, -1};
    case 2: return {(top + h - 1) * s + left + w - 1, -1, -s};
    default: return {(top + (request.format == 0 ? h : w) - 1) * s + left, -s, 1};
    }
}

} // namespace

void draw_reduced(const Picture &picture, const Geometry &geometry, const Request &request, uint32_t first_row,
                  uint32_t end_row, uint32_t base, Bytes &bytes) {
    Canvas canvas(request.format, bytes);
    const Walk walk = walk_of(geometry, request);
    for (uint32_t row = first_row; row < end_row; ++row)
        for (uint32_t column = 0; column < geometry.width; ++column)
            canvas.put(walk.first + (int64_t{row} - base) * walk.down + column * walk.along,
                       reduced_pixel(picture, geometry, column, row));
}

void draw_rows(const Picture &picture, const Request &request, uint32_t source_rows, Bytes &bytes) {
    const Geometry geometry = geometry_of(picture, request);
    if (geometry.empty()) return;
    if (geometry.one_to_one) return draw_one_to_one(picture, geometry, request, 0, source_rows, bytes);
    if (!picture.is_plain_grey())
        return draw_reduced(picture, geometry, request, 0, reduced_rows_after(picture, geometry, source_rows), 0,
                            bytes);
    const std::vector<GreyRow> used = used_grey_rows(picture, geometry);
    const auto seen = std::find_if(used.begin(), used.end(),
                                   [source_rows](const GreyRow &row) { return row.source_row >= source_rows; });
    draw_scaled_grey(picture, geometry, request, 0, static_cast<size_t>(seen - used.begin()), 0, bytes);
}

void draw(const Picture &picture, const Request &request, Bytes &bytes) {
    draw_rows(picture, request, picture.height, bytes);
}

Bytes background(size_t size) {
    Bytes bytes(size);
    for (size_t i = 0; i < size; ++i)
        bytes[i] = static_cast<uint8_t>(i * 37 + (i >> 8) * 13 + 11);
    return bytes;
}

size_t buffer_size(const Picture &picture, const Request &request) {
    const Geometry geometry = geometry_of(picture, request);
    return static_cast<size_t>(buffer_pixels(geometry, request)) * pixel_size(request.format);
}

Request own_size(const Picture &picture, uint32_t format) {
    return {format, 0, static_cast<int32_t>(picture.width), static_cast<int32_t>(picture.height)};
}

Bytes after_rows(const Picture &picture, uint32_t rows) {
    const Request request = own_size(picture);
    Bytes expected = background(buffer_size(picture, request));
    draw_rows(picture, request, rows, expected);
    return expected;
}

namespace {

std::string listed(const Bytes &bytes, size_t from, size_t count) {
    std::string text;
    for (size_t i = from; i < std::min(from + count, bytes.size()); ++i)
        text += (text.empty() ? "" : " ") + std::to_string(bytes[i]);
    return text;
}

} // namespace

std::string difference(const Bytes &expected, const Bytes &got, const Picture &picture, const Request &request) {
    if (expected == got) return {};
    const size_t size = pixel_size(request.format);
    const auto [wanted, came] = std::mismatch(expected.begin(), expected.end(), got.begin(), got.end());
    const size_t pixel = static_cast<size_t>(wanted - expected.begin()) / size;
    const Geometry geometry = geometry_of(picture, request);
    const size_t stride = static_cast<size_t>(std::max<int64_t>(geometry.stride, 1));
    return picture.described() + ", " + request.described() + ": buffer pixel (" + std::to_string(pixel % stride) +
           ", " + std::to_string(pixel / stride) + ") should be " + listed(expected, pixel * size, size) + " and is " +
           listed(got, pixel * size, size) + "; below it was " +
           listed(background(expected.size()), pixel * size, size);
}

} // namespace pelm::test

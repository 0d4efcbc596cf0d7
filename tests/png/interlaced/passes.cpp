#include "tests/png/interlaced/passes.h"

#include <algorithm>

namespace pelm::test {

uint32_t pass_of(uint32_t x, uint32_t y) {
    static constexpr uint8_t square[8][8] = {
        {1, 6, 4, 6, 2, 6, 4, 6}, {7, 7, 7, 7, 7, 7, 7, 7}, {5, 6, 5, 6, 5, 6, 5, 6}, {7, 7, 7, 7, 7, 7, 7, 7},
        {3, 6, 4, 6, 3, 6, 4, 6}, {7, 7, 7, 7, 7, 7, 7, 7}, {5, 6, 5, 6, 5, 6, 5, 6}, {7, 7, 7, 7, 7, 7, 7, 7}};
    return square[y % 8][x % 8];
}

std::vector<PassRow> pass_rows_of(const Picture &picture) {
    std::vector<PassRow> rows;
    const size_t pixel_bits = size_t{picture.depth} * picture.channels();
    for (uint32_t pass = 1; pass <= 7; ++pass)
        for (uint32_t y = 0; y < picture.height; ++y) {
            PassRow row{pass, y, {}, 0};
            for (uint32_t x = 0; x < picture.width; ++x)
                if (pass_of(x, y) == pass) row.columns.push_back(x);
            row.bytes = 1 + (row.columns.size() * pixel_bits + 7) / 8;
            if (!row.columns.empty()) rows.push_back(row);
        }
    return rows;
}

namespace {

// The buffer pixel that shows image pixel (0, 0), and the steps along a row and from row to row.
struct Steps {
    int64_t first, along, down;
    int64_t at(uint32_t column, uint32_t row) const { return first + column * along + row * down; }
};

Steps steps_of(const Geometry &geometry, const Request &request) {
    const int64_t stride = geometry.stride, w = geometry.width, h = geometry.height;
    const auto pixel = [&](int64_t column, int64_t row) {
        return (geometry.top + row) * stride + geometry.left + column;
    };
    switch (request.quarter_turns()) {
    case 0: return {pixel(0, 0), 1, stride};
    case 1: return {pixel(h - 1, 0), stride, -1};
    case 2: return {pixel(w - 1, h - 1), -1, -stride};
    default: return {pixel(0, request.format == 0 ? h - 1 : w - 1), -stride, 1};
    }
}

void draw_in_place(const Picture &picture, const Geometry &geometry, const PassRow &row, Canvas &canvas) {
    for (const uint32_t x : row.columns)
        canvas.put((geometry.top + row.y) * geometry.stride + geometry.left + x, picture.pixel(x, row.y));
}

// Every output pixel whose centre lies on a pixel of the row.
void draw_centres(const Picture &picture, const Geometry &geometry, const Request &request, const PassRow &row,
                  Canvas &canvas) {
    const uint64_t w = geometry.width, h = geometry.height;
    const Steps steps = steps_of(geometry, request);
    for (uint32_t m = 0; m < h; ++m) {
        if ((uint64_t{m} * picture.height + picture.height / 2) / h != row.y) continue;
        for (uint32_t j = 0; j < w; ++j) {
            const auto x = static_cast<uint32_t>((uint64_t{j} * picture.width + picture.width / 2) / w);
            if (pass_of(x, row.y) == row.pass) canvas.put(steps.at(j, m), picture.pixel(x, row.y));
        }
    }
}

unsigned mixed(unsigned over, unsigned alpha, unsigned old) {
    return (((old * (255 - alpha)) >> 8) + ((over * alpha) >> 8)) & 255;
}

unsigned packed_565(unsigned r, unsigned g, unsigned b) {
    return (r >> 3) << 11 | (g >> 2) << 5 | b >> 3;
}

// Over what is there, with weights that sum to 255. Formats 0 and 1.
void mix_into(uint32_t format, const Pixel &p, int64_t index, Bytes &bytes) {
    const auto size = static_cast<int64_t>(pixel_size(format));
    if (index < 0 || (index + 1) * size > static_cast<int64_t>(bytes.size())) return;
    uint8_t *const at = bytes.data() + index * size;
    if (format == 1) {
        at[0] = static_cast<uint8_t>(mixed(p.r, p.a, at[0]));
        at[1] = static_cast<uint8_t>(mixed(p.g, p.a, at[1]));
        at[2] = static_cast<uint8_t>(mixed(p.b, p.a, at[2]));
        return;
    }
    const unsigned old = at[0] | static_cast<unsigned>(at[1]) << 8;
    const unsigned value = packed_565(mixed(p.r, p.a, (old >> 11) << 3), mixed(p.g, p.a, (old >> 5 & 63) << 2),
                                      mixed(p.b, p.a, (old & 31) << 3));
    at[0] = static_cast<uint8_t>(value);
    at[1] = static_cast<uint8_t>(value >> 8);
}

} // namespace

void draw_pass_rows(const Picture &picture, const Request &request, size_t first, size_t end, Bytes &bytes) {
    const Geometry geometry = geometry_of(picture, request);
    if (geometry.empty() || (!geometry.one_to_one && asks_for_frame(request))) return;
    Canvas canvas(request.format, bytes);
    const std::vector<PassRow> rows = pass_rows_of(picture);
    for (size_t i = first; i < std::min(end, rows.size()); ++i)
        if (geometry.one_to_one)
            draw_in_place(picture, geometry, rows[i], canvas);
        else
            draw_centres(picture, geometry, request, rows[i], canvas);
}

void draw_frame(const Picture &picture, const Request &request, Bytes &bytes) {
    const Geometry geometry = geometry_of(picture, request);
    if (geometry.empty() || geometry.one_to_one || !asks_for_frame(request)) return;
    const Steps steps = steps_of(geometry, request);
    Canvas canvas(request.format, bytes);
    for (uint32_t row = 0; row < geometry.height; ++row)
        for (uint32_t column = 0; column < geometry.width; ++column) {
            Pixel pixel = reduced_pixel(picture, geometry, column, row);
            pixel.coverage = Coverage::opaque;
            if (request.format <= 1 && picture.transparency)
                mix_into(request.format, pixel, steps.at(column, row), bytes);
            else
                canvas.put(steps.at(column, row), pixel);
        }
}

void draw_interlaced(const Picture &picture, const Request &request, Bytes &bytes) {
    draw_pass_rows(picture, request, 0, SIZE_MAX, bytes);
    draw_frame(picture, request, bytes);
}

Bytes expected_bytes(const Picture &picture, const Request &request) {
    Bytes bytes = background(buffer_size(picture, request));
    draw_interlaced(picture, request, bytes);
    return bytes;
}

Bytes expected_after(const Picture &picture, const Request &request, size_t pass_rows) {
    Bytes bytes = background(buffer_size(picture, request));
    draw_pass_rows(picture, request, 0, pass_rows, bytes);
    return bytes;
}

Png interlaced_png_of(const Picture &picture) {
    Png png = png_of(picture);
    png.interlace = 1;
    return png;
}

Bytes interlaced_file_of(const Picture &picture) {
    return build(interlaced_png_of(picture));
}

Bytes interlaced_file_of_blocks(const Picture &picture, Blocks blocks, size_t block_size) {
    Png png = interlaced_png_of(picture);
    const auto row = static_cast<uint32_t>(picture.row_bytes() + 1);
    png.stream = stream_of_blocks(scanlines_of(png), blocks, block_size, row);
    return build(png);
}

std::vector<Bytes> scanlines_by_pass_row(const Picture &picture) {
    const Bytes whole = scanlines_of(interlaced_png_of(picture));
    std::vector<Bytes> parts;
    auto at = whole.begin();
    for (const PassRow &row : pass_rows_of(picture)) {
        parts.emplace_back(at, at + static_cast<ptrdiff_t>(row.bytes));
        at += static_cast<ptrdiff_t>(row.bytes);
    }
    EXPECT_EQ(at, whole.end());
    return parts;
}

std::vector<Bytes> scanlines_by_pass(const Picture &picture) {
    const std::vector<Bytes> by_row = scanlines_by_pass_row(picture);
    const std::vector<PassRow> rows = pass_rows_of(picture);
    std::vector<Bytes> parts;
    for (size_t i = 0; i < rows.size(); ++i) {
        if (i == 0 || rows[i].pass != rows[i - 1].pass) parts.emplace_back();
        parts.back().insert(parts.back().end(), by_row[i].begin(), by_row[i].end());
    }
    return parts;
}

Bytes stream_of_parts(const std::vector<Bytes> &parts, Blocks blocks) {
    Deflate deflate;
    Bytes data;
    for (size_t i = 0; i < parts.size(); ++i) {
        const Last last = i + 1 == parts.size() ? Last::yes : Last::no;
        const Tokens tokens = tokens_of(parts[i], {1, 2, 3, 4});
        if (blocks == Blocks::stored || (blocks == Blocks::mixed && i % 3 == 2))
            deflate.stored(parts[i], last);
        else if (blocks == Blocks::fixed || (blocks == Blocks::mixed && i % 3 == 0))
            deflate.fixed(tokens, last);
        else
            deflate.dynamic(tokens, last);
        data.insert(data.end(), parts[i].begin(), parts[i].end());
    }
    return zlib_stream(deflate.bytes(), data);
}

Bytes interlaced_file_of_parts(const Picture &picture, const std::vector<Bytes> &parts, Blocks blocks) {
    Png png = interlaced_png_of(picture);
    png.stream = stream_of_parts(parts, blocks);
    return build(png);
}

std::string interlaced_difference(const Picture &picture, const Bytes &file, uint32_t kind, const Request &request,
                                  Call call, size_t bytes_behind) {
    const Bytes expected = expected_bytes(picture, request);
    const Outcome outcome = run(file, kind, request, expected.size(), call, 0, 100000, bytes_behind);
    const std::string wrong = flaws(outcome);
    if (!wrong.empty())
        return "interlaced, kind " + std::to_string(kind) + ", " + name_of(call) + ", " + picture.described() + ", " +
               request.described() + ": " + wrong;
    const std::string found = difference(expected, outcome.output, picture, request);
    return found.empty() ? found
                         : "interlaced, kind " + std::to_string(kind) + ", " + name_of(call) +
                               (asks_for_frame(request) ? ", with frame: " : ": ") + found;
}

Picture interlaced_noise(Layout layout, bool transparent, uint32_t width, uint32_t height, uint32_t seed) {
    const Picture picture = noise_picture(layout.colour_type, layout.depth, width, height, seed);
    return transparent ? with_transparency(picture, seed) : picture;
}

std::string reduced_noise_difference(uint32_t flags) {
    for (const Layout layout : all_layouts)
        for (const bool transparent : {false, true}) {
            const Picture picture = interlaced_noise(layout, transparent, 37, 23);
            const Bytes file = interlaced_file_of(picture);
            for (const auto &[width, height] :
                 {std::pair(36, 36), std::pair(18, 40), std::pair(9, 9), std::pair(40, 5), std::pair(2, 3)})
                for (const uint32_t format : written_formats)
                    for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM}) {
                        TestHost::get().reset();
                        Polling::get().reset();
                        const std::string found =
                            interlaced_difference(picture, file, kind, {format, flags, width, height});
                        if (!found.empty()) return found;
                    }
        }
    return {};
}

} // namespace pelm::test

// pelm-contact-sheet INPUT OUTPUT.png: one image in every output format (rows) and in every rotation and placement
// (columns), on one sheet.
#include <algorithm>
#include <cstdio>
#include <exception>

#include "tools/decode.h"
#include "tools/failure.h"
#include "tools/output_file.h"
#include "tools/tiny_font.h"
#include "tools/writers.h"

namespace pelm_tool {
namespace {

constexpr int box_size = 132;
constexpr int gap = 8;
constexpr int group_gap = 18; // more between two placements
constexpr int left_margin = 76;
constexpr int top_margin = 44;
constexpr int edge = 16;

constexpr Rgba paper = {24, 25, 34, 255};
constexpr Rgba box_colour = {49, 48, 66, 255}; // the same in 5, 6 and 5 bits
constexpr Rgba ink = {232, 228, 216, 255};
constexpr Rgba faint_ink = {150, 150, 164, 255};

constexpr const char *row_formats[] = {"rgb565", "rgb", "argb", "rgb565a", "rgba", "bgra"};
constexpr uint32_t turns[] = {PELM_ROTATE_0, PELM_ROTATE_90, PELM_ROTATE_180, PELM_ROTATE_270};
constexpr const char *turn_names[] = {"0", "90", "180", "270"};
constexpr uint32_t placements[] = {PELM_PLACE_FIT, PELM_PLACE_STRETCH, PELM_PLACE_EXACT};
constexpr const char *placement_names[] = {"fit", "stretch", "exact"};

constexpr int rows = static_cast<int>(std::size(row_formats));
constexpr int turn_count = static_cast<int>(std::size(turns));
constexpr int columns = turn_count * static_cast<int>(std::size(placements));

int column_left(int column) {
    return left_margin + column * (box_size + gap) + column / turn_count * group_gap;
}

int row_top(int row) {
    return top_margin + row * (box_size + gap);
}

class Sheet {
public:
    Sheet();
    void put(int x, int y, Rgba colour);
    void fill_box(int left, int top);
    void text(int left, int top, const std::string &words, int scale, Rgba colour);
    void picture(int box_left, int box_top, const Picture &picture);
    const Picture &as_picture() const { return picture_; }

private:
    Picture picture_;
};

Sheet::Sheet() {
    picture_.format = find_pixel_format("rgb");
    picture_.width = static_cast<size_t>(column_left(columns - 1) + box_size + edge);
    picture_.height = static_cast<size_t>(row_top(rows - 1) + box_size + edge);
    picture_.bytes.resize(picture_.width * picture_.height * picture_.format->bytes);
    fill(picture_, paper);
}

void Sheet::put(int x, int y, Rgba colour) {
    const size_t pixel = static_cast<size_t>(y) * picture_.width + static_cast<size_t>(x);
    picture_.format->store(&picture_.bytes[pixel * picture_.format->bytes], colour);
}

void Sheet::fill_box(int left, int top) {
    for (int i = 0; i < box_size * box_size; ++i)
        put(left + i % box_size, top + i / box_size, box_colour);
}

void Sheet::text(int left, int top, const std::string &words, int scale, Rgba colour) {
    for (int y = 0; y < glyph_height * scale; ++y) {
        for (int x = 0; x < text_width(words) * scale; ++x) {
            if (dot_of_text(words, x / scale, y / scale)) put(left + x, top + y, colour);
        }
    }
}

Rgba over_box(Rgba colour) {
    const auto mix = [&](int over, int under) {
        return static_cast<uint8_t>((over * colour.a + under * (255 - colour.a) + 127) / 255);
    };
    return {mix(colour.r, box_colour.r), mix(colour.g, box_colour.g), mix(colour.b, box_colour.b), 255};
}

// Centred in its box, which it never exceeds, and which shows where the picture is transparent.
void Sheet::picture(int box_left, int box_top, const Picture &picture) {
    const int left = box_left + (box_size - static_cast<int>(picture.width)) / 2;
    const int top = box_top + (box_size - static_cast<int>(picture.height)) / 2;
    const uint8_t *pixel = picture.bytes.data();
    for (size_t y = 0; y < picture.height; ++y) {
        for (size_t x = 0; x < picture.width; ++x, pixel += picture.format->bytes) {
            const Rgba colour = picture.format->load(pixel);
            put(left + static_cast<int>(x), top + static_cast<int>(y), over_box(colour));
        }
    }
}

Picture decode_cell(const std::string &name, const char *format, uint32_t turn, uint32_t placement) {
    Options options;
    options.format = find_pixel_format(format);
    options.box = Box{box_size, box_size};
    options.rotation = turn;
    options.placement = placement;
    Progress progress(false, 1);
    Session session(options, progress);
    Input input(name, SourceChoice::memory);
    const ImageFormat &image = recognise(input.head());
    // Formats without alpha show what is not covered as a background of the box's colour.
    if (!options.format->has_alpha)
        options.background = uint32_t{box_colour.r} << 16 | box_colour.g << 8 | box_colour.b;
    return decode(input, image, describe(image, input, options.mode), options, session).picture;
}

void draw_captions(Sheet &sheet) {
    for (int column = 0; column < columns; ++column) {
        const int turn = column % turn_count;
        const int left = column_left(column);
        if (turn == 0) sheet.text(left, 10, placement_names[column / turn_count], 2, ink);
        sheet.text(left, top_margin - 14, turn_names[turn], 1, faint_ink);
    }
    for (int row = 0; row < rows; ++row)
        sheet.text(edge, row_top(row) + box_size / 2 - 4, row_formats[row], 1, ink);
}

void draw_cells(Sheet &sheet, const std::string &name) {
    for (int row = 0; row < rows; ++row) {
        for (int column = 0; column < columns; ++column) {
            sheet.fill_box(column_left(column), row_top(row));
            const Picture cell =
                decode_cell(name, row_formats[row], turns[column % turn_count], placements[column / turn_count]);
            sheet.picture(column_left(column), row_top(row), cell);
        }
    }
}

void run(const std::string &input, const std::string &output) {
    Sheet sheet;
    draw_captions(sheet);
    draw_cells(sheet, input);
    OutputFile file(output);
    write_png(file, sheet.as_picture());
    file.commit();
}

} // namespace
} // namespace pelm_tool

int main(int argc, char **argv) {
    if (argc != 3) {
        std::fputs("usage: pelm-contact-sheet INPUT OUTPUT.png\n", stderr);
        return 1;
    }
    try {
        pelm_tool::run(argv[1], argv[2]);
        return 0;
    } catch (const std::exception &error) {
        std::fprintf(stderr, "pelm-contact-sheet: %s: %s\n", argv[1], error.what());
        return 1;
    }
}

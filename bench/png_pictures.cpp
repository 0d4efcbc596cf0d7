#include "bench/png_pictures.h"

#include "bench/dither.h"

namespace bench {
namespace {

int grey_of(Pixel p) {
    return (2 * p.r + 5 * p.g + p.b) / 8;
}

// Appends samples of one row at their depth.
struct RowWriter {
    std::vector<uint8_t> &row;
    int depth;
    uint32_t bits = 0; // written so far

    // Samples of 16 bits get low bytes that hold noise, as those of cameras do.
    void add(int value) {
        if (depth == 16) {
            row.push_back(static_cast<uint8_t>(value));
            row.push_back(static_cast<uint8_t>(scrambled(bits + static_cast<uint32_t>(value)) & 0xFC));
        } else {
            if (bits % 8 == 0) row.push_back(0);
            row.back() =
                static_cast<uint8_t>(row.back() | value >> (8 - depth) << (8 - depth - static_cast<int>(bits % 8)));
        }
        bits += static_cast<uint32_t>(depth);
    }
};

void add_pixel(RowWriter &writer, PngLayout layout, Pixel p) {
    if (layout.has_colour()) {
        writer.add(p.r);
        writer.add(p.g);
        writer.add(p.b);
    } else {
        writer.add(grey_of(p));
    }
    if (layout.has_alpha()) writer.add(p.a);
}

constexpr int palette_type = 3;

// Moves each icon to another part of its motif.
std::vector<uint8_t> picture_from(Motif motif, PngLayout layout, uint32_t width, uint32_t height, uint32_t first_x) {
    Dither dither(width);
    return write_png(width, height, layout, [&](uint32_t y, std::vector<uint8_t> &row) {
        RowWriter writer{row, layout.depth};
        for (uint32_t x = 0; x < width; ++x) {
            const Pixel p = pixel_of(motif, first_x + x, y);
            if (layout.colour_type != palette_type)
                add_pixel(writer, layout, p);
            else if (layout.depth < 8)
                writer.add(grey_of(p));
            else
                writer.add(motif == Motif::photo ? dither.index_of(x, p) : nearest_index(p));
        }
    });
}

} // namespace

std::vector<uint8_t> png_picture(Motif motif, PngLayout layout, uint32_t width, uint32_t height) {
    return picture_from(motif, layout, width, height, 0);
}

std::vector<std::vector<uint8_t>> png_icons() {
    static constexpr struct {
        int colour_type, depth;
    } types[] = {{0, 1}, {0, 2}, {0, 4}, {0, 8}, {0, 16}, {2, 8}, {2, 16}, {3, 1},
                 {3, 2}, {3, 4}, {3, 8}, {4, 8}, {4, 16}, {6, 8}, {6, 16}};
    std::vector<std::vector<uint8_t>> icons;
    for (const auto &[colour_type, depth] : types)
        for (const bool interlaced : {false, true})
            for (const Motif motif : {Motif::photo, Motif::screenshot, Motif::illustration}) {
                const auto first_x = static_cast<uint32_t>(160 + 8 * icons.size());
                icons.push_back(picture_from(motif, {colour_type, depth, interlaced}, 32, 32, first_x));
            }
    return icons;
}

} // namespace bench

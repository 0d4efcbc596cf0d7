#include "tests/sweeps/inputs.h"

#include <cstdio>
#include <stdexcept>

#include "tests/gif/support/gif_builder.h"
#include "tests/png/support/png_builder.h"
#include "tests/support/run_length_codes.h"
#include "tests/support/wbmp_builder.h"

namespace pelm::sweeps {
namespace {

using fuzz::Format;
using test::GifFile;
using test::GraphicControl;
using test::ImagePlace;

struct Sides {
    int32_t width, height;
};

void add(std::vector<Input> &inputs, const std::string &name, Format format, Sides sides, const Bytes &bytes) {
    inputs.push_back({name, format, sides.width, sides.height, bytes});
}

void add_bmps(std::vector<Input> &inputs, Sides sides) {
    const auto [width, height] = sides;
    bool top_down = false;
    for (const test::BmpVariant &variant : test::bmp_variants) {
        const test::BmpFile file = test::noise_bmp(variant, width, height, top_down);
        add(inputs, std::string("bmp_").append(variant.name), Format::bmp, sides, file_bytes(file));
        top_down = !top_down;
    }
    for (const int bits : {8, 4}) {
        test::Noise noise(1);
        const auto rows = test::noise_picture(width, height, static_cast<uint16_t>(bits), 1);
        const Bytes codes = test::run_length_codes(rows, bits, noise, {true, true, true, true, true});
        const auto file = test::run_length_bmp(bits, width, height, codes, test::noise_palette(1u << bits, 1));
        add(inputs, "bmp_run_lengths_" + std::to_string(bits), Format::bmp, sides, file_bytes(file));
    }
    test::BmpFile core = test::noise_bmp(test::variant_named("twenty_four_bits"), width, height, false);
    core.header_size = 12;
    add(inputs, "bmp_core_header", Format::bmp, sides, file_bytes(core));
    test::BmpFile few_colours = test::noise_bmp(test::variant_named("eight_bits"), width, height, false);
    few_colours.palette.resize(4 * 7);
    add(inputs, "bmp_indices_without_entries", Format::bmp, sides, file_bytes(few_colours));
}

test::Png png_of(Sides sides, uint8_t colour_type, uint8_t depth, uint8_t interlace) {
    test::Png png{.width = static_cast<uint32_t>(sides.width), .height = static_cast<uint32_t>(sides.height)};
    png.colour_type = colour_type;
    png.depth = depth;
    png.interlace = interlace;
    png.rows = test::noise_rows(png, 1);
    png.filters = {4, 3, 2, 1, 0}; // from the first row of each pass on: what is above it counts
    if (colour_type == 3) {
        png.plte = test::noise_palette(12, 1); // 16 triplets
        png.trns = Bytes{0, 128, 255};
    }
    return png;
}

void add_pngs(std::vector<Input> &inputs, Sides sides) {
    static constexpr uint8_t types[][2] = {{0, 1}, {0, 2}, {0, 4}, {0, 8}, {0, 16}, {2, 8}, {2, 16}, {3, 1},
                                           {3, 2}, {3, 4}, {3, 8}, {4, 8}, {4, 16}, {6, 8}, {6, 16}};
    for (const auto &type : types) {
        for (uint8_t interlace = 0; interlace < 2; ++interlace) {
            test::Png png = png_of(sides, type[0], type[1], interlace);
            png.idat_size = interlace == 1 ? 100 : 0;
            const std::string name = "png_type_" + std::to_string(type[0]) + "_depth_" + std::to_string(type[1]);
            add(inputs, name + (interlace == 1 ? "_interlaced" : ""), Format::png, sides, build(png));
        }
    }
    for (const uint8_t colour_type : {uint8_t{0}, uint8_t{2}}) {
        test::Png keyed = png_of(sides, colour_type, 8, 0);
        keyed.rows = test::smooth_rows(keyed);
        const Bytes &row = keyed.rows[3]; // one of its pixels is the transparent one
        keyed.trns = colour_type == 0 ? Bytes{0, row[4]} : Bytes{0, row[12], 0, row[13], 0, row[14]};
        keyed.level = 0;
        add(inputs, "png_transparent_colour_" + std::to_string(colour_type), Format::png, sides, build(keyed));
    }
    test::Png blocks = png_of(sides, 2, 8, 0);
    test::Deflate deflate;
    const Bytes scanlines = scanlines_of(blocks);
    deflate.stored_blocks(scanlines, 150, test::Last::no);
    deflate.fixed({}, test::Last::yes);
    blocks.stream = test::zlib_stream(deflate.bytes(), scanlines);
    add(inputs, "png_many_blocks", Format::png, sides, build(blocks));
}

Bytes gif_of(Sides sides, const std::vector<ImagePlace> &places) {
    GifFile gif;
    gif.screen(static_cast<uint16_t>(sides.width), static_cast<uint16_t>(sides.height), test::distinct_table(16), 1);
    uint8_t frame = 0;
    for (const ImagePlace &place : places) {
        gif.control({.disposal = static_cast<uint8_t>(frame % 4), .transparent = frame % 2 == 0 ? 3 : -1, .delay = 7});
        gif.image(place, test::noise_pixels(size_t{place.width} * place.height, 16, frame + 1u), 4,
                  frame % 2 == 1 ? test::distinct_table(256, frame) : test::ColourTable{});
        ++frame;
    }
    return gif.trailer().bytes;
}

void add_gifs(std::vector<Input> &inputs, Sides sides) {
    const auto width = static_cast<uint16_t>(sides.width), height = static_cast<uint16_t>(sides.height);
    const ImagePlace whole{0, 0, width, height};
    const ImagePlace interlaced{0, 0, width, height, true};
    const ImagePlace narrow{3, 4, 9, 11};
    const ImagePlace small{2, 9, 5, 3, true};
    const ImagePlace wide{2, 5, 31, 9};
    const struct {
        const char *name;
        std::vector<ImagePlace> places;
    } files[] = {{"whole", {whole}},
                 {"interlaced", {interlaced}},
                 {"narrow", {narrow}},
                 {"wide", {wide}},
                 {"empty", {}},
                 {"frames", {whole, small, wide, narrow, interlaced, small}},
                 {"frames_that_do_not_cover", {narrow, small, narrow}}};
    for (const auto &file : files)
        add(inputs, std::string("gif_").append(file.name), Format::gif, sides, gif_of(sides, file.places));
    Bytes damaged = gif_of(sides, {whole, interlaced});
    for (size_t i = damaged.size() / 4; i < damaged.size(); i += 29)
        damaged[i] = static_cast<uint8_t>(damaged[i] ^ 0x5A);
    add(inputs, "gif_damaged", Format::gif, sides, damaged);
}

Format format_of(const std::string &file) {
    return file.ends_with(".bmp")   ? Format::bmp
           : file.ends_with(".png") ? Format::png
           : file.ends_with(".gif") ? Format::gif
                                    : Format::wbmp;
}

// By the C library, which MemorySanitizer knows.
Bytes content_of_sample(const std::string &name) {
    FILE *const file = fopen((std::string(PELM_SAMPLES "/") + name).c_str(), "rb");
    if (file == nullptr) throw std::runtime_error("cannot read " + name);
    Bytes bytes;
    uint8_t part[4096];
    for (size_t count = fread(part, 1, sizeof part, file); count > 0; count = fread(part, 1, sizeof part, file))
        bytes.insert(bytes.end(), part, part + count);
    fclose(file);
    return bytes;
}

} // namespace

std::vector<Input> small_inputs(int32_t width, int32_t height) {
    const Sides sides{width, height};
    std::vector<Input> inputs;
    add_bmps(inputs, sides);
    add(inputs, "wbmp", Format::wbmp, sides, file_bytes(test::noise_wbmp(width, height)));
    add_pngs(inputs, sides);
    add_gifs(inputs, sides);
    return inputs;
}

std::vector<Input> cut_short(std::vector<Input> inputs) {
    for (Input &input : inputs) {
        input.name += "_cut_short";
        input.bytes.resize(input.bytes.size() * 2 / 3);
    }
    return inputs;
}

std::vector<Input> sample_inputs() {
    std::vector<Input> inputs;
    for (const char *const name :
         {"sunset-1.bmp", "sunset-32.bmp", "sunset-4.bmp", "sunset-444.bmp", "sunset-555.bmp", "sunset-565.bmp",
          "sunset-8.bmp", "sunset-topdown.bmp", "sunset.bmp", "sunset.wbmp", "sunset-alpha.png", "sunset-grey.png",
          "sunset-palette.png", "sunset.png", "sunset-interlaced.gif", "sunset.gif"}) {
        inputs.push_back({name, format_of(name), 320, 240, content_of_sample(name)});
    }
    inputs.push_back({"lighthouse.gif", Format::gif, 160, 120, content_of_sample("lighthouse.gif")});
    return inputs;
}

} // namespace pelm::sweeps

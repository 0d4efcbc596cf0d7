// The smallest files that have one of everything: short enough to change each of their bytes to everything.
#include "tests/gif/support/gif_builder.h"
#include "tests/png/support/png_builder.h"
#include "tests/support/run_length_codes.h"
#include "tests/support/wbmp_builder.h"
#include "tests/sweeps/inputs.h"

namespace pelm::sweeps {
namespace {

using fuzz::Format;
using test::GifFile;
using test::ImagePlace;

void add_bmps(std::vector<Input> &inputs) {
    bool top_down = false;
    const auto add = [&inputs](const std::string &name, const test::BmpFile &file) {
        inputs.push_back({"bmp_" + name + "_tiny", Format::bmp, 5, 3, file_bytes(file)});
    };
    for (const test::BmpVariant &variant : test::bmp_variants) {
        test::BmpFile file = test::noise_bmp(variant, 5, 3, top_down);
        if (file.palette.size() > 64) file.palette.resize(24);
        add(variant.name, file);
        top_down = !top_down;
    }
    for (const int bits : {8, 4}) {
        test::Noise noise(1);
        const auto rows = test::noise_picture(5, 3, static_cast<uint16_t>(bits), 1);
        const Bytes codes = test::run_length_codes(rows, bits, noise, {true, true, true, true, true});
        add("run_lengths_" + std::to_string(bits), test::run_length_bmp(bits, 5, 3, codes, test::noise_palette(4, 1)));
    }
    test::BmpFile core = test::noise_bmp(test::variant_named("twenty_four_bits"), 5, 3, false);
    core.header_size = 12;
    add("core_header", core);
}

void add_wbmps(std::vector<Input> &inputs) {
    for (const auto &size : {std::pair(1, 1), std::pair(9, 4), std::pair(130, 2)}) {
        const test::WbmpFile file = test::noise_wbmp(size.first, size.second);
        inputs.push_back(
            {"wbmp_" + std::to_string(size.first) + "_tiny", Format::wbmp, size.first, size.second, file_bytes(file)});
    }
}

void add_pngs(std::vector<Input> &inputs) {
    static constexpr uint8_t types[][2] = {{0, 1}, {0, 2}, {0, 4}, {0, 8}, {0, 16}, {2, 8}, {2, 16}, {3, 1},
                                           {3, 2}, {3, 4}, {3, 8}, {4, 8}, {4, 16}, {6, 8}, {6, 16}};
    const auto add = [&inputs](const std::string &name, const test::Png &png) {
        inputs.push_back({"png_" + name + "_tiny", Format::png, 5, 4, build(png)});
    };
    uint8_t interlace = 0;
    for (const auto &type : types) {
        test::Png png{.width = 5, .height = 4, .colour_type = type[0], .depth = type[1], .interlace = interlace};
        png.rows = test::smooth_rows(png);
        png.filters = {4, 3, 2, 1};
        if (type[0] == 3) png.plte = test::noise_palette(3, 1); // 4 triplets
        if (type[0] == 3) png.trns = Bytes{0, 128};
        const std::string kind = interlace == 1 ? "_interlaced" : "";
        add("type_" + std::to_string(type[0]) + "_depth_" + std::to_string(type[1]) + kind, png);
        interlace ^= 1;
    }
    test::Png grey{.width = 5, .height = 4, .depth = 16, .trns = Bytes{0, 7}};
    grey.rows = test::noise_rows(grey, 2);
    add("transparent_grey", grey);
    test::Png keyed{.width = 5, .height = 4, .colour_type = 2, .trns = Bytes{0, 1, 0, 2, 0, 3}};
    keyed.rows = test::smooth_rows(keyed);
    keyed.level = 0;
    keyed.idat_size = 30;
    add("stored_in_pieces", keyed);
    test::Png blocks{.width = 5, .height = 4};
    blocks.rows = test::noise_rows(blocks, 1);
    const Bytes scanlines = scanlines_of(blocks);
    test::Deflate deflate;
    deflate.stored_blocks(scanlines, 12, test::Last::no);
    deflate.fixed({}, test::Last::yes);
    blocks.stream = test::zlib_stream(deflate.bytes(), scanlines);
    blocks.before_idat = {{"tEXt", {'a', 0, 'b'}}};
    add("blocks", blocks);
}

void add_gifs(std::vector<Input> &inputs) {
    const ImagePlace whole{0, 0, 7, 6};
    const ImagePlace interlaced{0, 0, 7, 6, true};
    const ImagePlace narrow{2, 1, 3, 4};
    const ImagePlace wide{1, 2, 12, 3};
    const struct {
        const char *name;
        std::vector<ImagePlace> places;
        bool has_local_tables;
    } files[] = {{"whole", {whole}, false},
                 {"interlaced", {interlaced}, true},
                 {"narrow", {narrow}, false},
                 {"wide", {wide}, false},
                 {"empty", {}, false},
                 {"frames", {whole, narrow, wide}, false},
                 {"other_frames", {narrow, interlaced, narrow}, true}};
    const auto add = [&inputs](const char *name, const GifFile &gif) {
        inputs.push_back({std::string("gif_").append(name).append("_tiny"), Format::gif, 7, 6, gif.bytes});
    };
    for (const auto &file : files) {
        GifFile gif;
        gif.screen(7, 6, test::distinct_table(4), 1);
        uint8_t frame = 1;
        for (const ImagePlace &place : file.places) {
            gif.control({.disposal = frame, .transparent = frame % 2 == 0 ? 3 : -1, .delay = 7});
            gif.image(place, test::noise_pixels(size_t{place.width} * place.height, 4, frame), 2,
                      file.has_local_tables ? test::distinct_table(4, frame) : test::ColourTable{});
            ++frame;
        }
        gif.extension(0xFE, {{'.', ','}}).trailer();
        add(file.name, gif);
    }
    GifFile gif;
    gif.screen(7, 6, {})
        .extension(0xFF, {{'N', 'E', 'T'}, {1, 0, 0}})
        .extension(0x01, {{1, 2, 3}})
        .raw({0, 0x21, 0x77, 2});
    gif.image(whole, test::noise_pixels(42, 2, 5), 2, test::distinct_table(2)).trailer();
    add("extensions", gif);
}

} // namespace

std::vector<Input> tiny_inputs() {
    std::vector<Input> inputs;
    add_bmps(inputs);
    add_wbmps(inputs);
    add_pngs(inputs);
    add_gifs(inputs);
    return inputs;
}

} // namespace pelm::sweeps

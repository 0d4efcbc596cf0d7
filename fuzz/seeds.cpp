// Writes the seeds again: make-fuzz-seeds FOLDER. The files in fuzz/corpus are its output: one small file of each kind
// there is, each decoded in a way of its own.
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>

#include "fuzz/plan.h"
#include "tests/gif/support/gif_builder.h"
#include "tests/png/support/png_builder.h"
#include "tests/support/bmp_builder.h"
#include "tests/support/run_length_codes.h"

using namespace pelm::fuzz;
using pelm::test::Bytes;

namespace {

std::filesystem::path folder;
uint32_t written = 0;

// Heads that go through the ways to decode, formats, rotations, placements and sources, one after the other.
Head next_head(uint8_t width, uint8_t height) {
    const uint32_t n = written++;
    Head head{};
    head.call = static_cast<uint8_t>(n);
    head.format = static_cast<uint8_t>(n % 9);
    head.flags = static_cast<uint8_t>((n & 3) | n / 3 % 3 << 2);
    head.kind = static_cast<uint8_t>(n % 4);
    head.width[0] = n % 2 == 0 ? width : static_cast<uint8_t>(width / 2 + 1);
    head.height[0] = n % 2 == 0 ? height : static_cast<uint8_t>(height / 2 + 1);
    head.rows = 3;
    head.buffer_size = 4;
    head.options = n % 3 == 0 ? Options::other_filling : 0;
    return head;
}

void write(const std::string &target, const std::string &name, const Head &head, const Bytes &steps,
           const Bytes &file) {
    std::filesystem::create_directories(folder / target);
    Bytes input(sizeof head);
    memcpy(input.data(), &head, sizeof head);
    input.insert(input.end(), steps.begin(), steps.end());
    input.insert(input.end(), file.begin(), file.end());
    std::ofstream(folder / target / name, std::ios::binary)
        .write(reinterpret_cast<const char *>(input.data()), static_cast<std::streamsize>(input.size()));
}

// Two calls of each kind, with other boxes and rows, and a last one from the beginning.
Bytes some_calls(Format format, uint8_t calls) {
    Bytes bytes = {static_cast<uint8_t>(format), 0};
    for (uint8_t call = 0; call < calls; ++call) {
        const uint8_t box = static_cast<uint8_t>(call + 2);
        bytes.insert(bytes.end(), {call, box, 2, 0, call, box, 5, 0});
    }
    bytes.insert(bytes.end(), {0, 0, 0, 0});
    bytes[1] = static_cast<uint8_t>((bytes.size() - 2) / 4);
    return bytes;
}

void write_bmps() {
    for (const auto &variant : pelm::test::bmp_variants) {
        for (const bool top_down : {false, true}) {
            const Bytes file = file_bytes(pelm::test::noise_bmp(variant, 9, 7, top_down));
            const std::string name = std::string(variant.name) + (top_down ? "_top_down" : "");
            write("bmp", name, next_head(9, 7), {}, file);
        }
    }
    for (const int bits : {8, 4}) {
        pelm::test::Noise noise(1);
        const auto picture = pelm::test::noise_picture(9, 7, static_cast<uint16_t>(bits), 1);
        const Bytes codes = run_length_codes(picture, bits, noise, {true, true, true, true, true});
        const Bytes palette = pelm::test::noise_palette(1u << bits, 1);
        Head head = next_head(9, 7);
        head.call = 4;
        head.rows = 1;
        write("bmp", "run_lengths_" + std::to_string(bits), head, {},
              file_bytes(pelm::test::run_length_bmp(bits, 9, 7, codes, palette)));
    }
    pelm::test::BmpFile core = pelm::test::noise_bmp(pelm::test::variant_named("twenty_four_bits"), 5, 4, false);
    core.header_size = 12;
    write("bmp", "core_header", next_head(5, 4), {}, file_bytes(core));
    write("callseq", "bmp", next_head(9, 7), some_calls(Format::bmp, 8), file_bytes(core));
}

Bytes wbmp_of(uint8_t width, uint8_t height) {
    Bytes file = {0, 0, width, height};
    for (int i = 0; i < (width + 7) / 8 * height; ++i)
        file.push_back(static_cast<uint8_t>(i * 73 + 90));
    return file;
}

void write_wbmps() {
    for (uint8_t i = 0; i < 8; ++i) {
        Head head = next_head(23, 17);
        head.kind %= 2;
        head.format = i % 4 == 2 ? 4 : i % 4 == 3 ? 5 : i % 4;
        head.flags = i % 3 == 2 ? 2 << 2 : 0;
        write("wbmp", "picture_" + std::to_string(i), head, {}, wbmp_of(23, 17));
    }
    Bytes longer = wbmp_of(23, 17);
    longer.insert(longer.begin() + 2, {0x80, 0x80, 0x80});
    write("wbmp", "four_groups", next_head(23, 17), {}, longer);
    write("callseq", "wbmp", next_head(23, 17), some_calls(Format::wbmp, 3), wbmp_of(23, 17));
}

pelm::test::Png png_of(uint8_t colour_type, uint8_t depth, uint8_t interlace) {
    pelm::test::Png png{.width = 11, .height = 9, .colour_type = colour_type, .depth = depth, .interlace = interlace};
    png.rows = pelm::test::smooth_rows(png);
    png.filters = {0, 1, 2, 3, 4};
    if (colour_type == 3) {
        png.plte = pelm::test::noise_palette(12, 1); // 48 bytes
        png.trns = Bytes{0, 128, 255};
    }
    return png;
}

void write_pngs() {
    static constexpr uint8_t types[][2] = {{0, 1}, {0, 2}, {0, 4}, {0, 8}, {0, 16}, {2, 8}, {2, 16}, {3, 1},
                                           {3, 2}, {3, 4}, {3, 8}, {4, 8}, {4, 16}, {6, 8}, {6, 16}};
    for (const auto &type : types) {
        for (uint8_t interlace = 0; interlace < 2; ++interlace) {
            pelm::test::Png png = png_of(type[0], type[1], interlace);
            if (interlace == 1) png.idat_size = 20;
            const std::string name = "type_" + std::to_string(type[0]) + "_depth_" + std::to_string(type[1]) +
                                     (interlace == 1 ? "_interlaced" : "");
            write("png", name, next_head(11, 9), {}, build(png));
        }
    }
    pelm::test::Png keyed = png_of(2, 8, 0);
    keyed.trns = Bytes{0, 1, 0, 2, 0, 3};
    keyed.level = 0;
    write("png", "transparent_colour", next_head(11, 9), {}, build(keyed));
    write("callseq", "png", next_head(11, 9), some_calls(Format::png, 6), build(png_of(6, 8, 0)));
    write("callseq", "png_interlaced", next_head(11, 9), some_calls(Format::png, 6), build(png_of(2, 8, 1)));
}

using pelm::test::GifFile;
using pelm::test::GraphicControl;
using pelm::test::ImagePlace;

constexpr uint16_t screen_width = 13;
constexpr uint16_t screen_height = 20;

void add_frame(GifFile &gif, const GraphicControl &control, const ImagePlace &place, uint32_t seed, bool own_table) {
    const size_t count = size_t{place.width} * place.height;
    gif.control(control);
    gif.image(place, pelm::test::noise_pixels(count, 16, seed), 4,
              own_table ? pelm::test::distinct_table(256, seed) : pelm::test::ColourTable{});
}

struct GifSeed {
    const char *name;
    GifFile gif;
};

std::vector<GifSeed> gif_seeds() {
    const ImagePlace whole{0, 0, screen_width, screen_height};
    const ImagePlace interlaced{0, 0, screen_width, screen_height, true};
    const ImagePlace small{3, 4, 5, 3, true};
    const ImagePlace wide{2, 15, 19, 9};
    const struct {
        const char *name;
        std::vector<ImagePlace> places;
    } files[] = {{"whole", {whole}}, {"interlaced", {interlaced}},
                 {"small", {small}}, {"wide", {wide}},
                 {"empty", {}},      {"frames", {whole, small, wide, interlaced, small}}};
    std::vector<GifSeed> seeds;
    for (const auto &file : files) {
        GifFile gif;
        gif.screen(screen_width, screen_height, pelm::test::distinct_table(16), 1);
        gif.extension(0xFF, {{'N', 'E', 'T', 'S', 'C', 'A', 'P', 'E', '2', '.', '0'}, {1, 0, 0}});
        uint8_t frame = 0;
        for (const ImagePlace &place : file.places) {
            add_frame(gif, {.disposal = frame, .transparent = frame % 2 == 0 ? 3 : -1, .delay = 7}, place, frame + 1u,
                      frame % 2 == 1 || file.places.size() == 1);
            ++frame;
        }
        gif.extension(0xFE, {{'.'}}).trailer();
        seeds.push_back({file.name, gif});
    }
    return seeds;
}

void write_gifs() {
    const std::vector<GifSeed> seeds = gif_seeds();
    for (const char *const target : {"gif", "agif"}) {
        for (const GifSeed &seed : seeds)
            for (int i = 0; i < 3; ++i)
                write(target, std::string(seed.name).append("_").append(std::to_string(i)),
                      next_head(screen_width, screen_height), {}, seed.gif.bytes);
    }
    const Bytes &frames = seeds.back().gif.bytes;
    write("callseq", "gif", next_head(screen_width, screen_height), some_calls(Format::gif, 7), frames);
    write("callseq", "agif", next_head(screen_width, screen_height), some_calls(Format::agif, 7), frames);
}

} // namespace

int main(int count, char **names) {
    if (count != 2) {
        fputs("usage: make-fuzz-seeds FOLDER\n", stderr);
        return 2;
    }
    folder = names[1];
    write_bmps();
    write_wbmps();
    write_pngs();
    write_gifs();
    printf("%u seeds\n", written);
    return 0;
}

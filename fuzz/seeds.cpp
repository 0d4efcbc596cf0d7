// Writes the seeds again: make-fuzz-seeds FOLDER. The files in fuzz/corpus are its output: one small file of each kind
// there is, each decoded in a way of its own.
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>

#include "fuzz/plan.h"
#include "tests/png/support/png_builder.h"
#include "tests/support/bmp_builder.h"

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

void append_word(Bytes &bytes, uint32_t value) {
    bytes.push_back(static_cast<uint8_t>(value));
    bytes.push_back(static_cast<uint8_t>(value >> 8));
}

struct Frame {
    uint32_t left, top, width, height;
    bool interlaced;
    uint8_t disposal;
    int transparent; // -1: none
    bool own_table;
};

void append_table(Bytes &bytes, uint8_t entries) {
    for (uint8_t i = 0; i < entries; ++i)
        bytes.insert(bytes.end(), {static_cast<uint8_t>(i * 60), static_cast<uint8_t>(255 - i * 50), i});
}

// Codes of 3 bits, with a clear code before every third pixel, so that they never grow.
void append_pixels(Bytes &bytes, uint32_t count) {
    Bytes data;
    uint32_t bits = 0;
    uint32_t held = 0;
    const auto put = [&](uint32_t code) {
        bits |= code << held;
        for (held += 3; held >= 8; held -= 8, bits >>= 8)
            data.push_back(static_cast<uint8_t>(bits));
    };
    for (uint32_t i = 0; i < count; ++i) {
        if (i % 3 == 0) put(4);
        put(i * 7 / 5 % 4);
    }
    put(5);
    if (held > 0) data.push_back(static_cast<uint8_t>(bits));
    bytes.push_back(2);
    for (size_t at = 0; at < data.size(); at += 50) {
        const size_t size = std::min<size_t>(50, data.size() - at);
        bytes.push_back(static_cast<uint8_t>(size));
        const auto from = data.begin() + static_cast<ptrdiff_t>(at);
        bytes.insert(bytes.end(), from, from + static_cast<ptrdiff_t>(size));
    }
    bytes.push_back(0);
}

Bytes gif_of(uint32_t width, uint32_t height, const std::vector<Frame> &frames) {
    Bytes file = {'G', 'I', 'F', '8', '9', 'a'};
    append_word(file, width);
    append_word(file, height);
    file.insert(file.end(), {0x81, 1, 0});
    append_table(file, 4);
    const std::string loops = "NETSCAPE2.0";
    file.insert(file.end(), {0x21, 0xFF, 11});
    file.insert(file.end(), loops.begin(), loops.end());
    file.insert(file.end(), {3, 1, 0, 0, 0});
    for (const Frame &frame : frames) {
        const uint8_t transparency = frame.transparent >= 0 ? 1 : 0;
        file.insert(file.end(), {0x21, 0xF9, 4, static_cast<uint8_t>(frame.disposal << 2 | transparency), 10, 0,
                                 static_cast<uint8_t>(frame.transparent), 0, 0x2C});
        for (const uint32_t word : {frame.left, frame.top, frame.width, frame.height})
            append_word(file, word);
        file.push_back(static_cast<uint8_t>((frame.interlaced ? 0x40 : 0) | (frame.own_table ? 0x81 : 0)));
        if (frame.own_table) append_table(file, 4);
        append_pixels(file, frame.width * frame.height);
    }
    file.push_back(0x3B);
    return file;
}

void write_gifs() {
    const Frame whole = {0, 0, 13, 20, false, 0, -1, false};
    Frame interlaced = whole;
    interlaced.interlaced = true;
    Frame small = {3, 4, 5, 3, true, 1, 2, true};
    Frame wide = {2, 15, 19, 9, false, 2, -1, false};
    const struct {
        const char *name;
        std::vector<Frame> frames;
    } files[] = {{"whole", {whole}},
                 {"interlaced", {interlaced}},
                 {"small", {small}},
                 {"wide", {wide}},
                 {"empty", {}},
                 {"frames", {whole, small, wide, interlaced}},
                 {"disposals", {small, {1, 1, 6, 6, false, 3, 0, false}, {0, 0, 4, 4, false, 2, 1, true}, wide}}};
    for (const char *const target : {"gif", "agif"}) {
        for (const auto &file : files) {
            for (int i = 0; i < 3; ++i) {
                const std::string name = std::string(file.name) + "_" + std::to_string(i);
                write(target, name, next_head(13, 20), {}, gif_of(13, 20, file.frames));
            }
        }
    }
    write("callseq", "gif", next_head(13, 20), some_calls(Format::gif, 7), gif_of(13, 20, files[5].frames));
    write("callseq", "agif", next_head(13, 20), some_calls(Format::agif, 7), gif_of(13, 20, files[6].frames));
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

// Pixels at their own size against libpng, for the PNG suite, the shared pictures and generated files.
#include <png.h>

#include <csetjmp>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iostream>

#include "tests/png/decode/decoding.h"

namespace pelm::test {
namespace {

namespace fs = std::filesystem;

struct Header {
    uint32_t width, height;
    uint8_t depth, colour_type;
};

struct Reading {
    const Bytes &file;
    size_t at;
};

void read_bytes(png_structp png, png_bytep to, size_t count) {
    Reading &reading = *static_cast<Reading *>(png_get_io_ptr(png));
    if (count > reading.file.size() - reading.at) png_error(png, "end of data");
    memcpy(to, reading.file.data() + reading.at, count);
    reading.at += count;
}

void ignore_message(png_structp, png_const_charp) {}

// libpng's RGBA: 16 bits cut, everything expanded. Nothing that needs destruction lives where it may jump from.
bool read_all(png_structp png, png_infop info, Bytes &rgba, Header &header) {
    if (setjmp(png_jmpbuf(png))) return false;
    png_read_info(png, info);
    header = {png_get_image_width(png, info), png_get_image_height(png, info), png_get_bit_depth(png, info),
              png_get_color_type(png, info)};
    png_set_strip_16(png);
    png_set_expand(png);
    png_set_gray_to_rgb(png);
    png_set_add_alpha(png, 255, PNG_FILLER_AFTER);
    png_read_update_info(png, info);
    rgba.resize(size_t{header.width} * header.height * 4);
    for (uint32_t y = 0; y < header.height; ++y)
        png_read_row(png, rgba.data() + size_t{y} * header.width * 4, nullptr);
    png_read_end(png, nullptr);
    return true;
}

bool libpng_rgba(const Bytes &file, Bytes &rgba, Header &header) {
    png_structp png = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, ignore_message);
    png_infop info = png_create_info_struct(png);
    Reading reading{file, 0};
    png_set_error_fn(png, nullptr, nullptr, ignore_message);
    png_set_read_fn(png, &reading, read_bytes);
    const bool good = read_all(png, info, rgba, header);
    png_destroy_read_struct(&png, &info, nullptr);
    return good;
}

// Grey of 2 and 4 bits is widened with ones here, and below 8 bits no transparent colour is looked for.
void as_this_library_widens(Bytes &rgba, const Header &header) {
    if (header.colour_type != PNG_COLOR_TYPE_GRAY || header.depth >= 8) return;
    const unsigned levels = (1u << header.depth) - 1;
    for (size_t i = 0; i < rgba.size(); i += 4) {
        const unsigned sample = rgba[i] / (255 / levels);
        const unsigned low = 8u - header.depth;
        const unsigned wide = header.depth == 1 ? sample * 255 : sample << low | ((1u << low) - 1);
        rgba[i] = rgba[i + 1] = rgba[i + 2] = static_cast<uint8_t>(wide);
        rgba[i + 3] = 255;
    }
}

class PngOracle : public PngDecoding {
protected:
    static fs::path images() {
        const char *const elsewhere = getenv("PELM_TEST_IMAGES");
        return elsewhere != nullptr ? elsewhere : PELM_SHARED_IMAGES;
    }
    static Bytes contents(const fs::path &path) {
        std::ifstream stream(path, std::ios::binary);
        return {std::istreambuf_iterator<char>(stream), {}};
    }
    static std::vector<fs::path> files(const fs::path &folder) {
        std::vector<fs::path> found;
        std::error_code absent;
        for (const auto &entry : fs::directory_iterator(folder, absent))
            if (entry.path().extension() == ".png") found.push_back(entry.path());
        if (found.empty()) std::cout << "not there, nothing compared: " << folder << "\n";
        std::sort(found.begin(), found.end());
        return found;
    }
    static bool interlaced(const Bytes &file) { return file.size() > 28 && file[28] == 1; }

    // Empty when both agree, in every way of calling.
    static std::string disagreement(const Bytes &file) {
        Bytes wanted;
        Header header;
        if (!libpng_rgba(file, wanted, header)) return "libpng refuses it";
        as_this_library_widens(wanted, header);
        const Request request{7, 0, static_cast<int32_t>(header.width), static_cast<int32_t>(header.height)};
        for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM})
            for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
                const Outcome outcome = run(file, kind, request, wanted.size(), call, 7, 1 << 20);
                const std::string way = name_of(call) + ", kind " + std::to_string(kind) + ": ";
                if (const std::string wrong = flaws(outcome); !wrong.empty()) return way + wrong;
                const auto [a, b] = std::mismatch(wanted.begin(), wanted.end(), outcome.output.begin());
                if (a != wanted.end())
                    return way + "byte " + std::to_string(a - wanted.begin()) + " should be " + std::to_string(*a) +
                           " and is " + std::to_string(*b);
            }
        return {};
    }
};

TEST_F(PngOracle, every_valid_image_of_the_suite_is_what_libpng_reads) {
    for (const fs::path &path : files(images() / "pngsuite")) {
        const Bytes file = contents(path);
        const std::string name = path.filename().string();
        if (interlaced(file) || name[0] == 'x') continue;
        EXPECT_EQ(disagreement(file), "") << name;
    }
}

TEST_F(PngOracle, every_corrupt_image_of_the_suite_fails) {
    for (const fs::path &path : files(images() / "pngsuite")) {
        if (path.filename().string()[0] != 'x') continue;
        const Bytes file = contents(path);
        for (const uint32_t kind : all_source_kinds)
            for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
                const Outcome outcome = run(file, kind, {7, 0, 32, 32}, 4096, call, 5);
                EXPECT_EQ(flaws(outcome, 0), "") << path.filename();
                EXPECT_EQ(outcome.output, background(4096)) << path.filename();
            }
    }
}

TEST_F(PngOracle, every_shared_picture_is_what_libpng_reads) {
    for (const fs::path &path : files(images())) {
        const Bytes file = contents(path);
        if (interlaced(file)) continue;
        EXPECT_EQ(disagreement(file), "") << path.filename();
    }
}

TEST_F(PngOracle, generated_images_of_every_layout_and_filter_are_what_libpng_reads) {
    for (const Layout layout : all_layouts)
        for (const bool transparent : {false, true})
            for (const uint32_t width : {1u, 2u, 3u, 7u, 8u, 9u, 33u})
                for (const std::vector<uint8_t> &filters :
                     {std::vector<uint8_t>{0}, {1}, {2}, {3}, {4}, {4, 3, 2, 1, 0, 1}}) {
                    Picture picture = noise_picture(layout.colour_type, layout.depth, width, 13, width);
                    if (transparent) picture = with_transparency(picture);
                    Png png = png_of(picture);
                    png.filters = filters;
                    EXPECT_EQ(disagreement(build(png)), "") << picture.described() << ", filter " << int{filters[0]};
                }
}

TEST_F(PngOracle, generated_streams_of_every_kind_of_block_are_what_libpng_reads) {
    for (const Blocks blocks : {Blocks::stored, Blocks::fixed, Blocks::dynamic, Blocks::mixed})
        for (const size_t block_size : {200u, 1000u, 40000u}) {
            const Picture picture = noise_picture(rgb, 8, 60, 50);
            EXPECT_EQ(disagreement(file_of_blocks(picture, blocks, block_size)), "") << name_of(blocks);
            Png smooth = png_of(picture);
            smooth.rows = smooth_rows(smooth);
            smooth.level = 9;
            EXPECT_EQ(disagreement(build(smooth)), "");
        }
}

} // namespace
} // namespace pelm::test

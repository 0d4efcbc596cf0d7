// Interlaced images of the PNG suite, at their own size, against libpng.
#include <png.h>

#include <csetjmp>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iostream>

#include "tests/png/interlaced/passes.h"

namespace pelm::test {
namespace {

namespace fs = std::filesystem;

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

struct Image {
    uint32_t width = 0, height = 0;
    uint8_t depth = 0, colour_type = 0;
    Bytes rgba;
    std::vector<png_bytep> rows;
};

// libpng's RGBA: 16 bits cut, everything expanded. Nothing that needs destruction lives where it may jump from.
bool read_all(png_structp png, png_infop info, Image &image) {
    if (setjmp(png_jmpbuf(png))) return false;
    png_read_info(png, info);
    image.width = png_get_image_width(png, info);
    image.height = png_get_image_height(png, info);
    image.depth = png_get_bit_depth(png, info);
    image.colour_type = png_get_color_type(png, info);
    png_set_strip_16(png);
    png_set_expand(png);
    png_set_gray_to_rgb(png);
    png_set_add_alpha(png, 255, PNG_FILLER_AFTER);
    png_set_interlace_handling(png);
    png_read_update_info(png, info);
    image.rgba.resize(size_t{image.width} * image.height * 4);
    for (size_t y = 0; y < image.height; ++y)
        image.rows.push_back(image.rgba.data() + y * image.width * 4);
    png_read_image(png, image.rows.data());
    png_read_end(png, nullptr);
    return true;
}

bool libpng_image(const Bytes &file, Image &image) {
    png_structp png = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, ignore_message);
    png_infop info = png_create_info_struct(png);
    Reading reading{file, 0};
    png_set_error_fn(png, nullptr, nullptr, ignore_message);
    png_set_read_fn(png, &reading, read_bytes);
    const bool good = read_all(png, info, image);
    png_destroy_read_struct(&png, &info, nullptr);
    return good;
}

// Grey of 2 and 4 bits is widened with ones here, and below 8 bits no transparent colour is looked for.
void widen_as_here(Image &image) {
    if (image.colour_type != PNG_COLOR_TYPE_GRAY || image.depth >= 8) return;
    const unsigned levels = (1u << image.depth) - 1;
    const unsigned low = 8u - image.depth;
    for (size_t i = 0; i < image.rgba.size(); i += 4) {
        const unsigned sample = image.rgba[i] / (255 / levels);
        const unsigned wide = image.depth == 1 ? sample * 255 : sample << low | ((1u << low) - 1);
        image.rgba[i] = image.rgba[i + 1] = image.rgba[i + 2] = static_cast<uint8_t>(wide);
        image.rgba[i + 3] = 255;
    }
}

std::string disagreement(const Bytes &file) {
    Image image;
    if (!libpng_image(file, image)) return "libpng refuses it";
    widen_as_here(image);
    const Request request{7, 0, static_cast<int32_t>(image.width), static_cast<int32_t>(image.height)};
    for (const uint32_t kind : all_source_kinds)
        for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
            const Outcome outcome = run(file, kind, request, image.rgba.size(), call, 0, 1 << 16);
            const std::string way = name_of(call) + ", kind " + std::to_string(kind) + ": ";
            if (const std::string wrong = flaws(outcome); !wrong.empty()) return way + wrong;
            const auto [a, b] = std::mismatch(image.rgba.begin(), image.rgba.end(), outcome.output.begin());
            if (a != image.rgba.end())
                return way + "byte " + std::to_string(a - image.rgba.begin()) + " should be " + std::to_string(*a) +
                       " and is " + std::to_string(*b);
        }
    return {};
}

class PngInterlacedOracle : public PngDecoding {};

TEST_F(PngInterlacedOracle, every_interlaced_image_of_the_suite_is_what_libpng_reads) {
    const char *const elsewhere = getenv("PELM_TEST_IMAGES");
    const fs::path folder = fs::path(elsewhere != nullptr ? elsewhere : PELM_SHARED_IMAGES) / "pngsuite";
    std::error_code absent;
    int compared = 0;
    for (const auto &entry : fs::directory_iterator(folder, absent)) {
        const std::string name = entry.path().filename().string();
        if (entry.path().extension() != ".png" || name[0] == 'x') continue;
        std::ifstream stream(entry.path(), std::ios::binary);
        const Bytes file{std::istreambuf_iterator<char>(stream), {}};
        if (file.size() <= 28 || file[28] != 1) continue;
        ++compared;
        EXPECT_EQ(disagreement(file), "") << name;
    }
    if (compared == 0) std::cout << "not there, nothing compared: " << folder << "\n";
}

TEST_F(PngInterlacedOracle, generated_pictures_of_every_layout_are_what_libpng_reads) {
    for (const Layout layout : all_layouts)
        for (const bool transparent : {false, true})
            for (const uint32_t width : {1u, 2u, 3u, 5u, 8u, 17u, 33u})
                for (const uint32_t height : {1u, 4u, 5u, 13u}) {
                    reset();
                    const Picture picture = interlaced_noise(layout, transparent, width, height);
                    EXPECT_EQ(disagreement(interlaced_file_of(picture)), "") << picture.described();
                }
}

} // namespace
} // namespace pelm::test

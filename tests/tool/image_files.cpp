#include "tests/tool/image_files.h"

#include <cstdio>
#include <sstream>

#include <png.h>

namespace pelm::test {
namespace {

uint32_t packed(const uint8_t *bytes, size_t channels) {
    const uint32_t rgb = uint32_t{bytes[0]} << 24 | uint32_t{bytes[1]} << 16 | uint32_t{bytes[2]} << 8;
    return rgb | (channels == 4 ? bytes[3] : 255u);
}

// A file whose pixels begin after `header_size` bytes.
Image unpacked(const Bytes &file, size_t header_size, size_t width, size_t height, size_t channels) {
    Image image{width, height, {}, channels == 4};
    if (file.size() != header_size + width * height * channels) return {};
    for (size_t at = header_size; at < file.size(); at += channels)
        image.pixels.push_back(packed(file.data() + at, channels));
    return image;
}

std::string words(uint32_t pixel) {
    char text[12];
    std::snprintf(text, sizeof text, "%08X", pixel);
    return text;
}

void on_warning(png_structp, png_const_charp) {}

// libpng reports errors by a jump back into this function, which therefore holds nothing with a destructor.
bool read_rgba(png_structp png, png_infop info, std::FILE *file) {
    if (setjmp(png_jmpbuf(png))) return false;
    png_init_io(png, file);
    png_set_add_alpha(png, 255, PNG_FILLER_AFTER);
    png_read_png(png, info, PNG_TRANSFORM_STRIP_16 | PNG_TRANSFORM_EXPAND | PNG_TRANSFORM_GRAY_TO_RGB, nullptr);
    return true;
}

} // namespace

Image read_png(const std::filesystem::path &path) {
    png_image png = {};
    png.version = PNG_IMAGE_VERSION;
    if (!png_image_begin_read_from_file(&png, path.c_str())) return {};
    const bool has_alpha = (png.format & PNG_FORMAT_FLAG_ALPHA) != 0;
    png.format = PNG_FORMAT_RGBA;
    Bytes bytes(PNG_IMAGE_SIZE(png));
    if (!png_image_finish_read(&png, nullptr, bytes.data(), 0, nullptr)) return {};
    Image image = unpacked(bytes, 0, png.width, png.height, 4);
    image.has_alpha = has_alpha;
    return image;
}

Image read_png_samples(const std::filesystem::path &path) {
    Image image;
    std::FILE *const file = std::fopen(path.c_str(), "rb");
    png_structp png = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, on_warning);
    png_infop info = png_create_info_struct(png);
    if (file != nullptr && read_rgba(png, info, file)) {
        image.width = png_get_image_width(png, info);
        image.height = png_get_image_height(png, info);
        for (size_t i = 0; i < image.width * image.height; ++i)
            image.pixels.push_back(packed(png_get_rows(png, info)[i / image.width] + i % image.width * 4, 4));
    }
    png_destroy_read_struct(&png, &info, nullptr);
    if (file != nullptr) std::fclose(file);
    return image;
}

Image read_ppm(const Bytes &file) {
    std::istringstream header(std::string(file.begin(), file.end()));
    std::string magic;
    size_t width = 0, height = 0, most = 0;
    header >> magic >> width >> height >> most;
    if (magic != "P6" || most != 255) return {};
    return unpacked(file, static_cast<size_t>(header.tellg()) + 1, width, height, 3);
}

Image read_pam(const Bytes &file) {
    std::istringstream header(std::string(file.begin(), file.end()));
    std::string word, magic, type;
    size_t width = 0, height = 0, depth = 0, most = 0;
    header >> magic >> word >> width >> word >> height >> word >> depth >> word >> most >> word >> type >> word;
    if (magic != "P7" || most != 255 || word != "ENDHDR" || type != (depth == 4 ? "RGB_ALPHA" : "RGB")) return {};
    return unpacked(file, static_cast<size_t>(header.tellg()) + 1, width, height, depth);
}

Image turned(const Image &image, int quarter_turns) {
    if (quarter_turns == 0) return image;
    Image result{image.height, image.width, {}, image.has_alpha};
    for (size_t y = 0; y < result.height; ++y) {
        for (size_t x = 0; x < result.width; ++x)
            result.pixels.push_back(image.at(y, image.height - 1 - x));
    }
    return turned(result, quarter_turns - 1);
}

std::string difference(const Image &expected, const Image &got) {
    if (got.width != expected.width || got.height != expected.height) {
        return "expected " + std::to_string(expected.width) + "x" + std::to_string(expected.height) + " pixels, got " +
               std::to_string(got.width) + "x" + std::to_string(got.height);
    }
    for (size_t i = 0; i < expected.pixels.size(); ++i) {
        if (got.pixels[i] == expected.pixels[i]) continue;
        return "pixel (" + std::to_string(i % expected.width) + ", " + std::to_string(i / expected.width) +
               "): expected " + words(expected.pixels[i]) + ", got " + words(got.pixels[i]);
    }
    return "";
}

} // namespace pelm::test

#include "tests/png/support/libpng_reader.h"

#include <png.h>

#include <csetjmp>
#include <cstring>

namespace pelm::test {

namespace {

constexpr uint64_t most_pixels = 1u << 22;

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

void leave(png_structp png, png_const_charp) {
    png_longjmp(png, 1);
}

// Nothing that needs destruction lives where libpng may jump from.
bool read_all(png_structp png, png_infop info, LibpngPicture &picture) {
    if (setjmp(png_jmpbuf(png))) return false;
    png_read_info(png, info);
    picture.width = png_get_image_width(png, info);
    picture.height = png_get_image_height(png, info);
    picture.depth = png_get_bit_depth(png, info);
    picture.colour_type = png_get_color_type(png, info);
    picture.is_interlaced = png_get_interlace_type(png, info) != PNG_INTERLACE_NONE;
    if (uint64_t{picture.width} * picture.height > most_pixels) return false;
    png_set_strip_16(png);
    png_set_expand(png);
    png_set_gray_to_rgb(png);
    png_set_add_alpha(png, 255, PNG_FILLER_AFTER);
    const int passes = png_set_interlace_handling(png);
    png_read_update_info(png, info);
    picture.rgba.resize(size_t{picture.width} * picture.height * 4);
    for (int pass = 0; pass < passes; ++pass)
        for (uint32_t y = 0; y < picture.height; ++y)
            png_read_row(png, picture.rgba.data() + size_t{y} * picture.width * 4, nullptr);
    png_read_end(png, nullptr);
    return true;
}

} // namespace

std::optional<LibpngPicture> read_with_libpng(const Bytes &file) {
    png_structp png = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, leave, ignore_message);
    png_infop info = png_create_info_struct(png);
    Reading reading{file, 0};
    LibpngPicture picture{};
    png_set_read_fn(png, &reading, read_bytes);
    png_set_option(png, PNG_IGNORE_ADLER32, PNG_OPTION_ON);
    const bool good = read_all(png, info, picture);
    png_destroy_read_struct(&png, &info, nullptr);
    if (!good) return {};
    return picture;
}

void as_this_library_widens(LibpngPicture &picture) {
    if (picture.colour_type != PNG_COLOR_TYPE_GRAY || picture.depth >= 8) return;
    const unsigned levels = (1u << picture.depth) - 1;
    for (size_t i = 0; i < picture.rgba.size(); i += 4) {
        uint8_t *const pixel = &picture.rgba[i];
        const unsigned sample = pixel[0] / (255 / levels);
        const unsigned low = 8u - picture.depth;
        const unsigned wide = picture.depth == 1 ? sample * 255 : sample << low | ((1u << low) - 1);
        pixel[0] = pixel[1] = pixel[2] = static_cast<uint8_t>(wide);
        pixel[3] = 255;
    }
}

} // namespace pelm::test

#include "bench/png_writer.h"

#include <png.h>

namespace bench {
namespace {

struct Job {
    uint32_t width, height;
    PngLayout layout;
    const std::function<void(uint32_t y, std::vector<uint8_t> &row)> &fill_row;
    std::vector<uint8_t> row;
    std::vector<uint8_t> file;
};

void on_write(png_structp png, png_bytep bytes, size_t size) {
    std::vector<uint8_t> &file = static_cast<Job *>(png_get_io_ptr(png))->file;
    file.insert(file.end(), bytes, bytes + size);
}

void on_flush(png_structp) {}

void write_palette(png_structp png, png_infop info) {
    png_color colours[256];
    for (uint32_t i = 0; i < 256; ++i) {
        colours[i] = {static_cast<png_byte>((i >> 5) * 255 / 7), static_cast<png_byte>((i >> 2 & 7) * 255 / 7),
                      static_cast<png_byte>((i & 3) * 85)};
    }
    png_set_PLTE(png, info, colours, 256);
}

// libpng reports errors by a jump back into this function, which therefore holds nothing with a destructor.
// False: failed.
bool run(png_structp png, png_infop info, Job &job) {
    if (setjmp(png_jmpbuf(png))) return false;
    png_set_write_fn(png, &job, on_write, on_flush);
    png_set_IHDR(png, info, job.width, job.height, job.layout.depth, job.layout.colour_type, PNG_INTERLACE_NONE,
                 PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
    if (job.layout.colour_type == PNG_COLOR_TYPE_PALETTE) write_palette(png, info);
    png_write_info(png, info);
    for (uint32_t y = 0; y < job.height; ++y) {
        job.row.clear();
        job.fill_row(y, job.row);
        png_write_row(png, job.row.data());
    }
    png_write_end(png, info);
    return true;
}

} // namespace

std::vector<uint8_t> write_png(uint32_t width, uint32_t height, PngLayout layout,
                               const std::function<void(uint32_t y, std::vector<uint8_t> &row)> &fill_row) {
    Job job{width, height, layout, fill_row, {}, {}};
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    png_infop info = png != nullptr ? png_create_info_struct(png) : nullptr;
    const bool written = info != nullptr && run(png, info, job);
    png_destroy_write_struct(&png, &info);
    return written ? std::move(job.file) : std::vector<uint8_t>();
}

} // namespace bench

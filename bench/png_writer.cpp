#include "bench/png_writer.h"

#include <png.h>

#include "bench/dither.h"

namespace bench {
namespace {

struct Job {
    uint32_t width, height;
    PngLayout layout;
    std::vector<std::vector<uint8_t>> rows; // each pass of an interlaced picture wants them all
    std::vector<uint8_t> file;
};

void on_write(png_structp png, png_bytep bytes, size_t size) {
    std::vector<uint8_t> &file = static_cast<Job *>(png_get_io_ptr(png))->file;
    file.insert(file.end(), bytes, bytes + size);
}

void on_flush(png_structp) {}

void write_palette(png_structp png, png_infop info, int depth) {
    png_color colours[256];
    for (int i = 0; i < 1 << depth; ++i) {
        const Colour colour = colour_of(static_cast<uint8_t>(i << (8 - depth)));
        colours[i] = {colour.r, colour.g, colour.b};
    }
    png_set_PLTE(png, info, colours, 1 << depth);
}

// libpng reports errors by a jump back into this function, which therefore holds nothing with a destructor.
// False: failed.
bool run(png_structp png, png_infop info, Job &job) {
    if (setjmp(png_jmpbuf(png))) return false;
    png_set_write_fn(png, &job, on_write, on_flush);
    if (job.layout.small_blocks) png_set_compression_mem_level(png, 1);
    png_set_IHDR(png, info, job.width, job.height, job.layout.depth, job.layout.colour_type,
                 job.layout.interlaced ? PNG_INTERLACE_ADAM7 : PNG_INTERLACE_NONE, PNG_COMPRESSION_TYPE_DEFAULT,
                 PNG_FILTER_TYPE_DEFAULT);
    if (job.layout.colour_type == PNG_COLOR_TYPE_PALETTE) write_palette(png, info, job.layout.depth);
    png_write_info(png, info);
    const int passes = png_set_interlace_handling(png);
    for (int pass = 0; pass < passes; ++pass)
        for (const std::vector<uint8_t> &row : job.rows)
            png_write_row(png, row.data());
    png_write_end(png, info);
    return true;
}

} // namespace

std::vector<uint8_t> write_png(uint32_t width, uint32_t height, PngLayout layout,
                               const std::function<void(uint32_t y, std::vector<uint8_t> &row)> &fill_row) {
    Job job{width, height, layout, {}, {}};
    job.rows.resize(height);
    for (uint32_t y = 0; y < height; ++y)
        fill_row(y, job.rows[y]);
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    png_infop info = png != nullptr ? png_create_info_struct(png) : nullptr;
    const bool written = info != nullptr && run(png, info, job);
    png_destroy_write_struct(&png, &info);
    return written ? std::move(job.file) : std::vector<uint8_t>();
}

} // namespace bench

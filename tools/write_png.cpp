// PNG through libpng, row by row, with 8 bits per channel.
#include "tools/writers.h"

#include <exception>

#include <png.h>

#include "tools/failure.h"
#include "tools/interrupt.h"

namespace pelm_tool {
namespace {

// What libpng's callbacks work with. They may not throw through libpng: the exception waits here for write_png.
struct Job {
    Output &output;
    const Picture &picture;
    std::vector<uint8_t> row;
    std::exception_ptr failure;
    std::string message; // libpng's own words
};

void on_error(png_structp png, png_const_charp message) {
    static_cast<Job *>(png_get_error_ptr(png))->message = message;
    png_longjmp(png, 1);
}

void on_warning(png_structp, png_const_charp) {}

void on_write(png_structp png, png_bytep bytes, size_t size) {
    Job &job = *static_cast<Job *>(png_get_io_ptr(png));
    try {
        job.output.write(bytes, size);
        return;
    } catch (...) {
        job.failure = std::current_exception();
    }
    png_error(png, "write failed");
}

void on_flush(png_structp) {}

void write_header(png_structp png, png_infop info, const Job &job) {
    png_set_write_fn(png, const_cast<Job *>(&job), on_write, on_flush);
    png_set_user_limits(png, PNG_UINT_31_MAX, PNG_UINT_31_MAX);
    png_set_IHDR(png, info, static_cast<png_uint_32>(job.picture.width), static_cast<png_uint_32>(job.picture.height),
                 8, channels_of(job.picture) == 4 ? PNG_COLOR_TYPE_RGB_ALPHA : PNG_COLOR_TYPE_RGB, PNG_INTERLACE_NONE,
                 PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
    png_write_info(png, info);
}

void write_rows(png_structp png, Job &job) {
    for (size_t y = 0; y < job.picture.height; ++y) {
        if (interrupted()) png_error(png, "interrupted");
        unpack_row(job.picture, y, channels_of(job.picture), job.row.data());
        png_write_row(png, job.row.data());
    }
}

// libpng reports errors by a jump back into this function, which therefore holds nothing with a destructor.
// False: failed.
bool run(png_structp png, png_infop info, Job &job) {
    if (setjmp(png_jmpbuf(png))) return false;
    write_header(png, info, job);
    write_rows(png, job);
    png_write_end(png, info);
    return true;
}

} // namespace

void write_png(Output &output, const Picture &picture) {
    Job job{output, picture, std::vector<uint8_t>(picture.width * channels_of(picture)), nullptr, {}};
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, &job, on_error, on_warning);
    png_infop info = png != nullptr ? png_create_info_struct(png) : nullptr;
    const bool written = info != nullptr && run(png, info, job);
    png_destroy_write_struct(&png, &info);
    if (job.failure) std::rethrow_exception(job.failure);
    if (!written) throw Failure("cannot write the PNG: " + (job.message.empty() ? "not enough memory" : job.message));
}

} // namespace pelm_tool

#include "bench/peers.h"

#include <algorithm>
#include <cstring>
#include <optional>

#include <png.h>

#include "bench/row_reducer.h"

namespace bench {
namespace {

struct Job {
    const uint8_t *next;
    size_t left;
    bool reduces;
    Box box; // when it does
    uint8_t *output;
    std::vector<uint8_t> rows;
    std::optional<RowReducer> reducer;
};

void on_read(png_structp png, png_bytep to, size_t count) {
    Job &job = *static_cast<Job *>(png_get_io_ptr(png));
    if (count > job.left) png_error(png, "ended");
    std::memcpy(to, job.next, count);
    job.next += count;
    job.left -= count;
}

void on_warning(png_structp, png_const_charp) {}

void ask_for_bytes(png_structp png, bool with_alpha) {
    png_set_expand(png);
    png_set_strip_16(png);
    png_set_gray_to_rgb(png);
    with_alpha ? png_set_add_alpha(png, 255, PNG_FILLER_AFTER) : png_set_strip_alpha(png);
}

void read_whole(png_structp png, png_infop info, Job &job) {
    ask_for_bytes(png, true);
    const int passes = png_set_interlace_handling(png);
    png_read_update_info(png, info);
    const size_t row_bytes = png_get_rowbytes(png, info);
    const png_uint_32 height = png_get_image_height(png, info);
    for (int pass = 0; pass < passes; ++pass)
        for (png_uint_32 y = 0; y < height; ++y)
            png_read_row(png, job.output + row_bytes * y, nullptr);
}

// One row of memory; all of them where the picture is interlaced.
void read_reduced(png_structp png, png_infop info, Job &job) {
    ask_for_bytes(png, false);
    const int passes = png_set_interlace_handling(png);
    png_read_update_info(png, info);
    const size_t row_bytes = png_get_rowbytes(png, info);
    const png_uint_32 height = png_get_image_height(png, info);
    const size_t step = passes > 1 ? row_bytes : 0;
    job.rows.resize(std::max(row_bytes, step * height));
    job.reducer.emplace(png_get_image_width(png, info), height, job.box, job.output);
    for (int pass = 0; pass < passes; ++pass) {
        for (png_uint_32 y = 0; y < height; ++y) {
            png_read_row(png, job.rows.data() + step * y, nullptr);
            if (pass == passes - 1 && job.reducer->wants(y)) job.reducer->add_row(y, job.rows.data() + step * y);
        }
    }
}

// libpng reports errors by a jump back into this function, which therefore holds nothing with a destructor.
// False: failed.
bool run(png_structp png, png_infop info, Job &job) {
    if (setjmp(png_jmpbuf(png))) return false;
    png_set_read_fn(png, &job, on_read);
    png_read_info(png, info);
    job.reduces ? read_reduced(png, info, job) : read_whole(png, info, job);
    png_read_end(png, nullptr);
    return true;
}

bool decode(Job job) {
    png_structp png = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, on_warning);
    png_infop info = png != nullptr ? png_create_info_struct(png) : nullptr;
    const bool decoded = info != nullptr && run(png, info, job);
    png_destroy_read_struct(&png, &info, nullptr);
    return decoded;
}

} // namespace

bool libpng_decode(const std::vector<uint8_t> &file, uint8_t *output) {
    return decode({file.data(), file.size(), false, {}, output, {}, {}});
}

bool libpng_reduce(const std::vector<uint8_t> &file, Box box, uint8_t *output) {
    return decode({file.data(), file.size(), true, box, output, {}, {}});
}

} // namespace bench

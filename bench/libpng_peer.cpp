#include "bench/png_peers.h"

#include <cstring>

#include <png.h>

#include "bench/pack_565.h"

namespace bench {
namespace {

struct Job {
    const uint8_t *next;
    size_t left;
    Target target;
    uint8_t *output;
    std::vector<uint8_t> row; // RGB565: as libpng gives it
};

void on_read(png_structp png, png_bytep to, size_t count) {
    Job &job = *static_cast<Job *>(png_get_io_ptr(png));
    if (count > job.left) png_error(png, "ended");
    std::memcpy(to, job.next, count);
    job.next += count;
    job.left -= count;
}

void on_warning(png_structp, png_const_charp) {}

bool is_transparent(png_structp png, png_infop info) {
    return (png_get_color_type(png, info) & PNG_COLOR_MASK_ALPHA) != 0 || png_get_valid(png, info, PNG_INFO_tRNS) != 0;
}

void ask_for_bytes(png_structp png, png_infop info, bool with_alpha) {
    png_set_expand(png);
    png_set_strip_16(png);
    png_set_gray_to_rgb(png);
    if (with_alpha) png_set_add_alpha(png, 255, PNG_FILLER_AFTER);
    png_read_update_info(png, info);
}

// libpng reports errors by a jump back into this function, which therefore holds nothing with a destructor.
// False: failed.
bool run(png_structp png, png_infop info, Job &job) {
    if (setjmp(png_jmpbuf(png))) return false;
    png_set_read_fn(png, &job, on_read);
    png_read_info(png, info);
    const size_t width = png_get_image_width(png, info);
    const png_uint_32 height = png_get_image_height(png, info);
    const bool blends = is_transparent(png, info);
    ask_for_bytes(png, info, blends || job.target == Target::rgba);
    job.row.resize(4 * width);
    for (png_uint_32 y = 0; y < height; ++y) {
        if (job.target == Target::rgba) {
            png_read_row(png, job.output + 4 * width * y, nullptr);
            continue;
        }
        png_read_row(png, job.row.data(), nullptr);
        uint8_t *const to = job.output + 2 * width * y;
        blends ? blend_rgba_row(job.row.data(), width, to) : pack_rgb_row(job.row.data(), width, to);
    }
    png_read_end(png, nullptr);
    return true;
}

} // namespace

bool libpng_decode(const std::vector<uint8_t> &file, Target target, uint8_t *output) {
    Job job{file.data(), file.size(), target, output, {}};
    png_structp png = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, on_warning);
    png_infop info = png != nullptr ? png_create_info_struct(png) : nullptr;
    const bool decoded = info != nullptr && run(png, info, job);
    png_destroy_read_struct(&png, &info, nullptr);
    return decoded;
}

} // namespace bench

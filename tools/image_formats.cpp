#include "tools/image_formats.h"

#include <cstring>
#include <string>

#include "tools/bmp_codes.h"
#include "tools/bmp_decode.h"
#include "tools/bmp_description.h"
#include "tools/failure.h"
#include "tools/gif_decode.h"
#include "tools/gif_description.h"
#include "tools/png_decode.h"
#include "tools/png_description.h"
#include "tools/wbmp_description.h"

namespace pelm_tool {
namespace {

// What BMP and PNG write.
constexpr uint32_t common_formats = 1u << PELM_FORMAT_RGB565 | 1u << PELM_FORMAT_RGB888 | 1u << PELM_FORMAT_ARGB8888 |
                                    1u << PELM_FORMAT_RGB565_A8 | 1u << PELM_FORMAT_RGBA8888 |
                                    1u << PELM_FORMAT_BGRA8888;

constexpr uint32_t wbmp_formats =
    1u << PELM_FORMAT_RGB565 | 1u << PELM_FORMAT_RGB888 | 1u << PELM_FORMAT_RGBA8888 | 1u << PELM_FORMAT_BGRA8888;
constexpr uint32_t gif_formats = (common_formats & ~(1u << PELM_FORMAT_RGB565_A8)) | 1u << PELM_FORMAT_BGR565 |
                                 1u << PELM_FORMAT_BGR888 | 1u << PELM_FORMAT_BGRX8888;

bool begins_with(Bytes head, const char *magic) {
    const size_t length = std::strlen(magic);
    return head.size() >= length && std::memcmp(head.data(), magic, length) == 0;
}

bool is_bmp(Bytes head) {
    return begins_with(head, "BM");
}

ImageDescription describe_bmp_input(Input &input, Mode mode) {
    ImageDescription description = describe_bmp(input.head(), {input.size(), input.source()->kind}, mode);
    if (description.run_length_bits != 0) describe_codes(description, input.all_bytes());
    return description;
}

ImageDescription describe_png_input(Input &input, Mode) {
    return describe_png(*input.source());
}

ImageDescription describe_wbmp_input(Input &input, Mode) {
    return describe_wbmp(input.head(), {input.size(), input.source()->kind});
}

ImageDescription describe_gif_input(Input &input, Mode) {
    return describe_gif(*input.source(), input.head());
}

// The decoder knows no exact placement: the first run, without a picture, fits the image, and the second one gets a
// buffer of just that size.
int32_t decode_wbmp(DecodeJob &job) {
    Box box = job.box;
    job.info.flags &= PELM_PLACE_MASK; // any other bit keeps it from stretching
    if (job.info.flags == PELM_PLACE_EXACT && job.picture != nullptr) {
        box = {static_cast<int32_t>(job.picture->width), static_cast<int32_t>(job.picture->height)};
        const bool keeps_size = box.width == job.image.width && box.height == job.image.height;
        job.info.flags = keeps_size ? PELM_PLACE_FIT : PELM_PLACE_STRETCH;
    }
    return ZOTARPELMI_DecodeWBMP(&job.info, job.output(), box.width, box.height);
}

constexpr ImageFormat image_formats[] = {
    {.name = "BMP",
     .recognises = is_bmp,
     .describe = describe_bmp_input,
     .decode = decode_bmp,
     .written_formats = common_formats,
     .pipe_use = PipeUse::front_to_back_if_asked,
     .decodes_in_calls = true,
     .decodes_in_two_steps = true},
    {.name = "PNG",
     .recognises = begins_like_png,
     .describe = describe_png_input,
     .decode = decode_png,
     .written_formats = common_formats,
     .is_read_from_memory = true,
     .polls_rows = true,
     .decodes_in_calls = true,
     .turns_only_reduced = true},
    {.name = "GIF",
     .recognises = begins_like_gif,
     .describe = describe_gif_input,
     .decode = decode_gif,
     .written_formats = gif_formats,
     .decodes_in_calls = true,
     .has_frames = true,
     .notes = gif_notes},
    {.name = "WBMP",
     .recognises = begins_like_wbmp,
     .describe = describe_wbmp_input,
     .decode = decode_wbmp,
     .written_formats = wbmp_formats,
     .pipe_use = PipeUse::with_seeks,
     .never_turns = true,
     .black_is_clear = true},
};

std::string why_mode_is_refused(const ImageFormat &image, const ImageDescription &description, Calls calls) {
    if (calls == Calls::one_shot) return {};
    const std::string decoder = std::string("the ") + image.name + " decoder has ";
    if (calls == Calls::in_two_steps) return image.decodes_in_two_steps ? "" : decoder + "no --mode skia";
    if (!image.decodes_in_calls) return decoder + "only --mode oneshot";
    const bool is_in_passes = description.is_interlaced && calls == Calls::by_lines;
    return is_in_passes ? "an interlaced image cannot be decoded by lines" : "";
}

} // namespace

const ImageFormat &recognise(Bytes head) {
    if (head.empty()) throw Failure("the file is empty");
    for (const ImageFormat &format : image_formats) {
        if (format.recognises(head)) return format;
    }
    throw Failure("not a BMP, PNG, GIF or WBMP file (it begins like none of them)");
}

// What can be read front to back on request is so in one call only.
void settle(Input &input, const ImageFormat &image, Mode mode) {
    PipeUse use = image.pipe_use;
    if (use == PipeUse::front_to_back_if_asked && mode.calls != Calls::one_shot) use = PipeUse::with_seeks;
    input.settle(image.is_read_from_memory, use);
}

ImageDescription describe(const ImageFormat &image, Input &input, Mode mode) {
    ImageDescription description = image.describe(input, mode);
    input.throw_if_unreadable();
    if (description.refusal.empty()) description.refusal = why_mode_is_refused(image, description, mode.calls);
    return description;
}

bool writes(const ImageFormat &image, const PixelFormat &pixels) {
    return (image.written_formats >> pixels.code & 1) != 0;
}

} // namespace pelm_tool

#include "tools/gif_decode.h"

#include <algorithm>

#include "tools/failure.h"
#include "tools/line_buffer.h"

namespace pelm_tool {
namespace {

bool keeps_its_size(const ImageDescription &image, Box box, uint32_t flags) {
    const uint32_t rotation = flags & PELM_ROTATE_MASK;
    if (rotation == PELM_ROTATE_90 || rotation == PELM_ROTATE_270) std::swap(box.width, box.height);
    if ((flags & PELM_PLACE_MASK) == PELM_PLACE_STRETCH) return box.width == image.width && box.height == image.height;
    return box.width >= image.width && box.height >= image.height;
}

int32_t decode_in_slices(DecodeJob &job) {
    int32_t result = PELM_RESULT_MORE;
    while (result == PELM_RESULT_MORE)
        result = ZOTARPELMI_DecodeGIFIter(&job.info, job.output(), job.box.width, job.box.height);
    return result;
}

LinePlace place_of_lines(const DecodeJob &job) {
    LinePlace place = centred_lines(job);
    if (keeps_its_size(job.image, job.box, job.info.flags)) place.top += static_cast<int32_t>(job.image.frames[0].top);
    return place;
}

void refuse_what_lines_cannot_do(const DecodeJob &job) {
    if ((job.info.flags & PELM_ROTATE_MASK) != PELM_ROTATE_0)
        throw Failure("by lines the decoder does not turn a GIF; use --mode oneshot or iter");
    const bool is_reduced = !keeps_its_size(job.image, job.box, job.info.flags);
    if (is_reduced && job.image.frames[0].top > 0)
        throw Failure("by lines an image that begins below the top of its screen cannot be reduced");
}

// Where rows are missing, the call after the last row fails; the description tells of the shortage.
int32_t decode_by_lines(DecodeJob &job, int32_t lines) {
    refuse_what_lines_cannot_do(job);
    if (measure_gif(job.info, job.box) != PELM_RESULT_DONE) return PELM_RESULT_FAILED;
    const int32_t most_rows = std::max(job.image.stored_rows, job.info.outputHeight);
    const int32_t count = std::clamp(lines, 1, std::max(most_rows, 1));
    LineBuffer buffer(*job.picture, place_of_lines(job), count);
    const auto decode = [&](uint8_t *output) {
        return ZOTARPELMI_DecodeGIFLine(&job.info, output, job.box.width, job.box.height, count);
    };
    int64_t row = 0;
    int32_t result = buffer.fill(row, decode);
    while (result == PELM_RESULT_DONE && job.info.decoderState != nullptr && row <= most_rows)
        result = buffer.fill(row += count, decode);
    ZOTARPELMI_AbortGIFIter(&job.info);
    const bool is_short = row > 0 && !job.image.shortage.empty();
    return is_short ? int32_t{PELM_RESULT_DONE} : result;
}

int32_t decode_at_once(DecodeJob &job) {
    return ZOTARPELMI_DecodeGIF(&job.info, job.output(), job.box.width, job.box.height);
}

} // namespace

int32_t measure_gif(ImageDecodeInfo &info, Box box) {
    const int32_t result = ZOTARPELMI_DecodeGIFIter(&info, nullptr, box.width, box.height);
    ZOTARPELMI_AbortGIFIter(&info);
    return result == PELM_RESULT_MORE ? PELM_RESULT_DONE : PELM_RESULT_FAILED;
}

int32_t decode_gif(DecodeJob &job) {
    if (job.picture == nullptr) return measure_gif(job.info, job.box);
    switch (job.mode.calls) {
    case Calls::one_shot:
    case Calls::in_two_steps: break; // the latter is for BMP only
    case Calls::iterative: return decode_in_slices(job);
    case Calls::by_lines: return decode_by_lines(job, job.mode.lines);
    }
    return decode_at_once(job);
}

std::vector<std::string> gif_notes(const Options &options, const ImageDescription &image, Box box) {
    constexpr uint32_t turned_never =
        1u << PELM_FORMAT_ARGB8888 | 1u << PELM_FORMAT_RGBA8888 | 1u << PELM_FORMAT_BGRA8888;
    const bool is_turned = options.rotation != PELM_ROTATE_0;
    const bool is_plain = keeps_its_size(image, box, options.rotation | options.placement);
    if (!is_turned || !is_plain || (turned_never >> options.format->code & 1) == 0) return {};
    return {std::string("the decoder does not turn a GIF at its own size in ") + options.format->name +
            "; use --format rgb or bgrx"};
}

} // namespace pelm_tool

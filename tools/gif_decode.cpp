#include "tools/gif_decode.h"

#include <algorithm>

#include "tools/failure.h"

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

// The calls by lines write at the left of a buffer of their own; where the rows belong in the picture is up to us.
class LineBuffer {
public:
    LineBuffer(DecodeJob &job, int32_t lines);
    // The next lines, from `row` of the image on.
    int32_t decode(int32_t row);

private:
    uint8_t *line(int32_t number) { return lines_.data() + static_cast<size_t>(number) * stride_; }
    uint8_t *place_of(int32_t row); // nullptr: outside of the picture

    DecodeJob &job_;
    int32_t count_;
    size_t stride_;    // bytes
    size_t row_bytes_; // of the image
    int32_t left_, top_;
    std::vector<uint8_t> lines_;
};

LineBuffer::LineBuffer(DecodeJob &job, int32_t lines) : job_(job), count_(lines) {
    const Picture &picture = *job.picture;
    stride_ = static_cast<size_t>(job.box.width) * picture.format->bytes;
    row_bytes_ = static_cast<size_t>(job.info.outputWidth) * picture.format->bytes;
    left_ = (static_cast<int32_t>(picture.width) - job.info.outputWidth) / 2;
    top_ = (static_cast<int32_t>(picture.height) - job.info.outputHeight) / 2;
    if (keeps_its_size(job.image, job.box, job.info.flags)) top_ += static_cast<int32_t>(job.image.frames[0].top);
    lines_.resize(static_cast<size_t>(lines) * stride_);
}

uint8_t *LineBuffer::place_of(int32_t row) {
    Picture &picture = *job_.picture;
    const int64_t y = int64_t{top_} + row;
    if (y >= static_cast<int64_t>(picture.height)) return nullptr;
    const size_t pixel = static_cast<size_t>(y) * picture.width + static_cast<size_t>(left_);
    return picture.bytes.data() + pixel * picture.format->bytes;
}

// What a call leaves as it is keeps what the picture holds there.
int32_t LineBuffer::decode(int32_t row) {
    for (int32_t i = 0; i < count_; ++i)
        if (const uint8_t *const from = place_of(row + i)) std::copy_n(from, row_bytes_, line(i));
    const int32_t result = ZOTARPELMI_DecodeGIFLine(&job_.info, lines_.data(), job_.box.width, job_.box.height, count_);
    for (int32_t i = 0; i < count_; ++i)
        if (uint8_t *const to = place_of(row + i)) std::copy_n(line(i), row_bytes_, to);
    return result;
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
    LineBuffer buffer(job, count);
    int32_t row = 0;
    int32_t result = buffer.decode(row);
    while (result == PELM_RESULT_DONE && job.info.decoderState != nullptr && row <= most_rows)
        result = buffer.decode(row += count);
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
    case Calls::one_shot: break;
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

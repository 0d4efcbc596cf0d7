#include "tools/png_decode.h"

#include <algorithm>

namespace pelm_tool {
namespace {

constexpr int32_t grey_lines_per_call = 16;

uint32_t rotation_of(const DecodeJob &job) {
    return job.info.flags & PELM_ROTATE_MASK;
}

bool keeps_its_size(const DecodeJob &job) {
    return keeps_its_size(job.image, job.box, job.info.flags);
}

int64_t polls_since(const DecodeJob &job, uint64_t before) {
    return static_cast<int64_t>(job.polls - before);
}

// How many output rows of a reduced image are finished with that many of its own rows: the second of the two lines of
// samples that an output row is made of lies three quarters of its height down.
int64_t output_rows_after(const DecodeJob &job, int64_t image_rows) {
    if (keeps_its_size(job) || job.image.is_interlaced) return image_rows; // each row of a pass counts
    const int64_t image_height = job.image.height;
    const int64_t sampled = image_rows * job.info.outputHeight - 3 * image_height / 4;
    if (sampled <= 0) return 0;
    return std::min<int64_t>((sampled + image_height - 1) / image_height, job.info.outputHeight);
}

int32_t decode_at_once(DecodeJob &job) {
    const uint64_t before = job.polls;
    const int32_t result = ZOTARPELMI_DecodePNG(&job.info, job.output(), job.box.width, job.box.height);
    job.complete_rows = polls_since(job, before);
    return result;
}

// A call that goes on asks the host once before it decodes; one that starts over does not. Starting over has no end:
// where the first block brings no row of the output, the decoder has to be asked for everything at once.
int32_t decode_by_blocks(DecodeJob &job) {
    for (int calls_without_row = 0; calls_without_row < 2;) {
        const bool goes_on = calls_without_row == 0 && job.complete_rows > 0;
        const uint64_t before = job.polls;
        const int32_t result = ZOTARPELMI_DecodePNGIter(&job.info, job.output(), job.box.width, job.box.height);
        const int64_t polls = polls_since(job, before);
        job.complete_rows = goes_on ? job.complete_rows + std::max<int64_t>(polls - 1, 0) : polls;
        if (result != PELM_RESULT_MORE) return result;
        const bool has_rows = output_rows_after(job, job.complete_rows) > 0;
        calls_without_row = has_rows ? 0 : calls_without_row + 1;
    }
    ZOTARPELMI_AbortPNGIter(&job.info);
    return decode_at_once(job);
}

// The buffers of the calls that decode a reduced image by lines: each begins where the rows before it end, in the
// direction that rows go in when the image is turned. There is room for all of them in a copy of the picture.
class Bands {
public:
    explicit Bands(const DecodeJob &job);
    uint8_t *from_output_row(int64_t row);
    void put_into(Picture &picture) const;

private:
    int64_t size_;
    int64_t row_step_; // bytes
    int64_t start_;    // of the picture in the room
    std::vector<uint8_t> room_;
};

int64_t row_step_in_pixels(const DecodeJob &job) {
    const auto stride = static_cast<int64_t>(job.picture->width);
    if (job.image.is_grey_8) return stride; // never turned
    switch (rotation_of(job)) {
    case PELM_ROTATE_90: return -1;
    case PELM_ROTATE_180: return -stride;
    case PELM_ROTATE_270: return 1;
    default: return stride;
    }
}

Bands::Bands(const DecodeJob &job)
    : size_(static_cast<int64_t>(job.picture->bytes.size())),
      row_step_(row_step_in_pixels(job) * static_cast<int64_t>(job.picture->format->bytes)),
      start_(row_step_ < 0 ? size_ : 0), room_(2 * job.picture->bytes.size()) {
    std::copy(job.picture->bytes.begin(), job.picture->bytes.end(), room_.begin() + start_);
}

uint8_t *Bands::from_output_row(int64_t row) {
    return room_.data() + start_ + std::clamp(row * row_step_, -size_, size_);
}

void Bands::put_into(Picture &picture) const {
    std::copy_n(room_.begin() + start_, size_, picture.bytes.begin());
}

int32_t next_lines(const DecodeJob &job, uint8_t *output, int32_t rows) {
    return ZOTARPELMI_DecodePNGLine(&job.info, output, job.box.width, job.box.height, rows);
}

// A call ends before the host is asked about its last row; the next one asks first.
int32_t decode_bands(DecodeJob &job, int32_t rows) {
    Bands bands(job);
    const uint64_t before = job.polls;
    int64_t row = 0;
    int32_t result = next_lines(job, bands.from_output_row(row), rows);
    while (result == PELM_RESULT_MORE) {
        row = job.image.is_grey_8 ? row + rows : output_rows_after(job, polls_since(job, before) + 1);
        result = next_lines(job, bands.from_output_row(row), rows);
    }
    job.complete_rows = polls_since(job, before);
    bands.put_into(*job.picture);
    return result;
}

int32_t decode_by_lines(DecodeJob &job, int32_t rows) {
    if (!keeps_its_size(job)) return decode_bands(job, rows);
    const uint64_t before = job.polls;
    int32_t result = PELM_RESULT_MORE;
    while (result == PELM_RESULT_MORE)
        result = next_lines(job, job.output(), rows);
    job.complete_rows = polls_since(job, before);
    return result;
}

} // namespace

bool keeps_its_size(const ImageDescription &image, Box box, uint32_t flags) {
    if ((flags & PELM_PLACE_MASK) == PELM_PLACE_STRETCH) return false;
    const uint32_t rotation = flags & PELM_ROTATE_MASK;
    if (rotation == PELM_ROTATE_90 || rotation == PELM_ROTATE_270) std::swap(box.width, box.height);
    return image.width <= box.width && image.height <= box.height;
}

int32_t decode_png(DecodeJob &job) {
    if (job.picture == nullptr) return decode_at_once(job);
    switch (job.mode.calls) {
    case Calls::one_shot:
    case Calls::in_two_steps: break; // the latter is for BMP only
    case Calls::by_lines: return decode_by_lines(job, job.mode.lines);
    case Calls::iterative:
        // Every call of a reduced grey image starts at the top of its buffer, and it cannot be told how far it got.
        if (job.image.is_grey_8 && !keeps_its_size(job)) return decode_by_lines(job, grey_lines_per_call);
        return decode_by_blocks(job);
    }
    return decode_at_once(job);
}

} // namespace pelm_tool

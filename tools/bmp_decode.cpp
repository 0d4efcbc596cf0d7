#include "tools/bmp_decode.h"

#include <algorithm>
#include <limits>

#include "PelmHost.h"
#include "tools/failure.h"
#include "tools/line_buffer.h"

namespace pelm_tool {
namespace {

int32_t decode_at_once(DecodeJob &job) {
    return ZOTARPELMI_DecodeBMP(&job.info, job.output(), job.box.width, job.box.height);
}

int32_t decode_in_bands(DecodeJob &job) {
    int32_t result = PELM_RESULT_MORE;
    while (result == PELM_RESULT_MORE)
        result = ZOTARPELMI_DecodeBMPIter(&job.info, job.output(), job.box.width, job.box.height);
    return result;
}

int32_t next_lines(DecodeJob &job, uint8_t *output, int32_t rows) {
    return ZOTARPELMI_DecodeBMPLine(&job.info, output, job.box.width, job.box.height, rows);
}

// Only the end of a decode frees all of it. However it ends here, a last call for all rows brings it there.
class EndOfLines {
public:
    explicit EndOfLines(DecodeJob &job) : job_(job) {}
    ~EndOfLines() {
        if (job_.info.decoderState != nullptr) next_lines(job_, nullptr, std::numeric_limits<int32_t>::max());
    }
    EndOfLines(const EndOfLines &) = delete;
    EndOfLines &operator=(const EndOfLines &) = delete;

private:
    DecodeJob &job_;
};

// The decoder centres each band between left and right only, also where the picture is just the image.
LinePlace place_of_lines(const DecodeJob &job) {
    LinePlace place = centred_lines(job);
    place.column = (job.box.width - job.info.outputWidth) / 2;
    return place;
}

int32_t decode_by_lines(DecodeJob &job) {
    if ((job.info.flags & PELM_ROTATE_MASK) != PELM_ROTATE_0)
        throw Failure("by lines the decoder does not turn a BMP; use --mode oneshot or iter");
    if (job.picture == nullptr) return decode_at_once(job);
    const EndOfLines end(job);
    if (next_lines(job, nullptr, 0) != PELM_RESULT_DONE) return PELM_RESULT_FAILED; // tells the size
    if (job.info.outputWidth <= 0 || job.info.outputHeight <= 0) return PELM_RESULT_DONE;

    const int32_t count = std::min(job.mode.lines, job.info.outputHeight);
    LineBuffer buffer(*job.picture, place_of_lines(job), count);
    const auto decode = [&](uint8_t *lines) { return next_lines(job, lines, count); };
    int32_t result = PELM_RESULT_DONE;
    for (int64_t row = 0; result == PELM_RESULT_DONE && job.info.decoderState != nullptr; row += count)
        result = buffer.fill(row, decode);
    return result;
}

// The row buffer of a seekable stream, which the decoder owns once the second step has begun. False: no memory.
bool give_staging(InputSource &source, int32_t row_bytes) {
    if (source.kind != PELM_SOURCE_STREAM && source.kind != PELM_SOURCE_STREAM_ALT) return true;
    source.bufferSize = std::max(source.bufferSize, row_bytes);
    source.data = static_cast<uint8_t *>(ZOTARPELM_OsMalloc(static_cast<uint32_t>(source.bufferSize)));
    return source.data != nullptr;
}

int32_t decode_in_two_steps(DecodeJob &job) {
    if (ZOTARPELMI_PreInitBMP(&job.info, job.mode.divisor) != PELM_RESULT_DONE) return PELM_RESULT_FAILED;
    if (!give_staging(*job.info.input, job.image.row_bytes)) {
        PELMI_BMP_DestroyBMP(&job.info);
        return PELM_RESULT_FAILED;
    }
    const int32_t result = ZOTARPELMI_DecodeBMPSKIA(&job.info, job.output(), job.box.width, job.box.height);
    job.info.decoderState = nullptr; // after a refusal it points at a record that is gone
    return result;
}

} // namespace

int32_t decode_bmp(DecodeJob &job) {
    switch (job.mode.calls) {
    case Calls::one_shot: break;
    case Calls::iterative: return decode_in_bands(job);
    case Calls::by_lines: return decode_by_lines(job);
    case Calls::in_two_steps: return decode_in_two_steps(job);
    }
    return decode_at_once(job);
}

} // namespace pelm_tool

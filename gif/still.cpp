// The first image of a GIF: at once, in slices, and by lines.
#include <algorithm>
#include <cstring>

#include "frame/placement.h"
#include "gif/working.h"

namespace pelm {
namespace {

// Required: the rows that an image lacks become zeros, counted from the image's left column on in the buffer's row
// length, and in the 16-bit formats only half of them (docs/oddities.md, "Missing rows of a GIF").
void clear_missing_rows(const GifDecoderState &state, Size box) {
    const int32_t image_end = state.imageTop + state.imageHeight;
    if (image_end > state.screenHeight || state.sourceRow >= image_end || state.rotation != 0) return;
    if (state.output.size == 0 || box.width <= 0) return;
    const int64_t row = int64_t{state.scaledHeight} * state.sourceRow / state.screenHeight;
    if (row >= box.height) return;
    const int64_t row_bytes = int64_t{state.pixelStep} * box.width;
    const auto size = static_cast<int64_t>(state.output.size);
    const int64_t rows = std::min(box.height - row, size / row_bytes + 1); // more than a buffer holds
    const int64_t first = state.outputStart + row * row_bytes;
    const int64_t from = std::clamp<int64_t>(first, 0, size);
    const int64_t behind = std::clamp<int64_t>(first + rows * row_bytes, 0, size);
    std::memset(state.output.start + from, 0, static_cast<size_t>(behind - from));
}

// Set up for `calls`, and the walk to the first image; NULL when either fails.
// Required: where the walk fails the record stays allocated, out of everybody's reach, unless `frees` is set
// (docs/oddities.md, "Broken GIFs that leak").
GifDecoderState *begin(ImageDecodeInfo &info, Size box, void *out, GifCalls calls, bool frees) {
    GifDecoderState *const state = PELMI_InitializeGIF(&info, box.width, box.height, 0, out);
    if (state == nullptr) return nullptr;
    if (PELMI_SeekImageData(info.input, state) == PELM_RESULT_FAILED) {
        if (frees) PELMI_DelGIFDecoderInfo(state);
        return nullptr;
    }
    state->startedBy = calls;
    state->sourceRow = state->imageTop;
    return state;
}

int32_t end(ImageDecodeInfo &info, GifDecoderState *state, int32_t result) {
    PELMI_DelGIFDecoderInfo(state);
    info.decoderState = nullptr;
    return result;
}

int32_t next_slice(ImageDecodeInfo &info, GifDecoderState *state) {
    if (state->startedBy != GIF_ITERATIVE) return PELM_RESULT_FAILED;
    const int32_t result = PELMI_DecodeGIFImageIter(state->input->source, state, state->outputStart, 0);
    return result == PELM_RESULT_MORE ? result : end(info, state, result);
}

// Required: the sampling begins half a screen row below where the image's first row would be (docs/oddities.md,
// "Line calls of offset images").
void begin_sampling(GifDecoderState &state) {
    state.samplePosition =
        int64_t{state.scaledHeight} * state.imageTop / state.screenHeight + (state.screenHeight >> 1);
}

int32_t decode_lines(ImageDecodeInfo &info, GifDecoderState *state, void *out, int32_t rows, bool first) {
    const int32_t result = PELMI_DecodeGIFImageLine(state->input->source, state, out, rows, first ? 1 : 0);
    if (result == PELM_RESULT_FAILED || state->savedRowsDone >= state->imageHeight) return end(info, state, result);
    info.decoderState = state;
    return result;
}

} // namespace
} // namespace pelm

int32_t ZOTARPELMI_DecodeGIF(ImageDecodeInfo *info, void *outBuffer, int32_t outWidth, int32_t outHeight) {
    if (info == nullptr) return PELM_RESULT_FAILED;
    const pelm::Size box = {outWidth, outHeight};
    GifDecoderState *const state = pelm::begin(*info, box, outBuffer, GIF_ONE_SHOT, false);
    if (state == nullptr) return PELM_RESULT_FAILED;
    info->hasTransparency = state->hasTransparency;
    const int32_t result = PELMI_DecodeGIFImage(info->input, state, state->outputStart);
    pelm::clear_missing_rows(*state, box);
    PELMI_DelGIFDecoderInfo(state);
    return result;
}

int32_t ZOTARPELMI_DecodeGIFIter(ImageDecodeInfo *info, void *outBuffer, int32_t outWidth, int32_t outHeight) {
    if (info == nullptr) return PELM_RESULT_FAILED;
    if (info->decoderState != nullptr)
        return pelm::next_slice(*info, static_cast<GifDecoderState *>(info->decoderState));
    GifDecoderState *const state = pelm::begin(*info, {outWidth, outHeight}, outBuffer, GIF_ITERATIVE, false);
    if (state == nullptr) return PELM_RESULT_FAILED;
    info->hasTransparency = state->hasTransparency;
    PELMI_DecodeGIFImageIter(info->input, state, state->outputStart, 1); // the next call tells how it ended
    info->decoderState = state;
    return PELM_RESULT_MORE;
}

int32_t ZOTARPELMI_AbortGIFIter(ImageDecodeInfo *info) {
    if (info == nullptr) return 0;
    return pelm::end(*info, static_cast<GifDecoderState *>(info->decoderState), 1);
}

int32_t ZOTARPELMI_DecodeGIFLine(ImageDecodeInfo *info, void *outBuffer, int32_t outWidth, int32_t outHeight,
                                 int32_t rowsWanted) {
    if (info == nullptr) return PELM_RESULT_FAILED;
    if (auto *const state = static_cast<GifDecoderState *>(info->decoderState))
        return state->startedBy == GIF_BY_LINES ? pelm::decode_lines(*info, state, outBuffer, rowsWanted, false)
                                                : PELM_RESULT_FAILED;
    // The rows of a call go to a buffer of that call's own, however large the box is.
    GifDecoderState *const state = pelm::begin(*info, {outWidth, outHeight}, nullptr, GIF_BY_LINES, true);
    if (state == nullptr) return PELM_RESULT_FAILED;
    pelm::begin_sampling(*state);
    return pelm::decode_lines(*info, state, outBuffer, rowsWanted, true);
}

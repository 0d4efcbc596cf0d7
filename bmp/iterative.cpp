// A BMP in bands of rows, all into the buffer of the first call.
#include "bmp/calls.h"
#include "bmp/geometry.h"
#include "bmp/working.h"

namespace {

constexpr int32_t rows_per_iteration = 100;

BmpState *state_of_band(ImageDecodeInfo *info, void *output, int32_t box_width, int32_t box_height, int32_t rows) {
    auto *const state = static_cast<BmpState *>(info->decoderState);
    if (state == nullptr) return PELMI_BMP_Initialize(info, box_width, box_height, output);
    if (rows > 0) pelm::advance_cursor(*state, rows);
    return state;
}

} // namespace

int32_t ZOTARPELMI_DecodeBMPIterLine(ImageDecodeInfo *info, void *output, int32_t outWidth, int32_t outHeight,
                                     int32_t rows) {
    if (!pelm::begin_call(info)) return PELM_RESULT_FAILED;
    BmpState *const state = state_of_band(info, output, outWidth, outHeight, rows);
    if (state == nullptr) return PELM_RESULT_FAILED;
    const int32_t count = pelm::rows_of_band(*state, rows);
    // As in one call, the rows that are there are the result.
    if (count > 0) pelm::decode_by_depth(*state, state->outputCursor, count);
    pelm::finish_band(*info, *state, count);
    return PELM_RESULT_DONE;
}

int32_t ZOTARPELMI_DecodeBMPIter(ImageDecodeInfo *info, void *output, int32_t outWidth, int32_t outHeight) {
    const int32_t result = ZOTARPELMI_DecodeBMPIterLine(info, output, outWidth, outHeight, rows_per_iteration);
    if (result != PELM_RESULT_DONE) return PELM_RESULT_FAILED;
    return info->decoderState != nullptr ? PELM_RESULT_MORE : PELM_RESULT_DONE;
}

// Required: nothing is freed (docs/oddities.md, "Aborting a BMP leaks").
int32_t ZOTARPELMI_AbortBMPIter(ImageDecodeInfo *info) {
    if (info == nullptr) return 0;
    info->decoderState = nullptr;
    return 1;
}

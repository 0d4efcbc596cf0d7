// A whole BMP in one call.
#include "bmp/calls.h"
#include "bmp/initialize.h"
#include "bmp/working.h"

int32_t ZOTARPELMI_DecodeBMP(ImageDecodeInfo *info, void *output, int32_t outWidth, int32_t outHeight) {
    if (!pelm::begin_call(info)) return PELM_RESULT_FAILED;
    BmpState *const state = PELMI_BMP_Initialize(info, outWidth, outHeight, output);
    if (state == nullptr) return PELM_RESULT_FAILED;
    // What the row decoder says is not passed on: the rows that are there are the result.
    pelm::decode_by_depth(*state, state->outputCursor, state->scaledHeight);
    pelm::end_decode(*info, state);
    return PELM_RESULT_DONE;
}

// A whole BMP in one call.
#include "bmp/header.h"
#include "bmp/working.h"

namespace {

// What the row decoder says is not passed on: the rows that are there are the result. Other depths have no rows.
void decode_all_rows(BmpState *state) {
    const int32_t rows = state->scaledHeight;
    switch (state->bitsPerPixel) {
    case 1: PELMI_BMP_Decode1bitBMP(state, state->outputCursor, rows); break;
    case 4: PELMI_BMP_Decode4bitBMP(state, state->outputCursor, rows); break;
    case 8: PELMI_BMP_Decode8bitBMP(state, state->outputCursor, rows); break;
    case 16: PELMI_BMP_Decode16bitBMP(state, state->outputCursor, rows); break;
    case 24: PELMI_BMP_Decode24bitBMP(state, state->outputCursor, rows); break;
    case 32: PELMI_BMP_Decode32bitBMP(state, state->outputCursor, rows); break;
    default: break;
    }
}

} // namespace

int32_t ZOTARPELMI_DecodeBMP(ImageDecodeInfo *info, void *output, int32_t outWidth, int32_t outHeight) {
    if (info == nullptr || info->input == nullptr) return PELM_RESULT_FAILED;
    InputSource &input = *info->input;
    ZOTARPELM_Seek_IO(&input, 0, 0);
    if (input.kind == PELM_SOURCE_MEMORY && (input.data == nullptr || input.size < pelm::bmp_header_bytes))
        return PELM_RESULT_FAILED;

    BmpState *const state = PELMI_BMP_Initialize(info, outWidth, outHeight, output);
    if (state == nullptr) return PELM_RESULT_FAILED;
    decode_all_rows(state);
    PELMI_BMP_DeleteDecInfo(state);
    info->decoderState = nullptr;
    return PELM_RESULT_DONE;
}

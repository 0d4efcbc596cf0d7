#include "bmp/calls.h"

#include <algorithm>

#include "bmp/header.h"
#include "bmp/initialize.h"
#include "bmp/working.h"

namespace pelm {

bool begin_call(const ImageDecodeInfo *info) {
    if (info == nullptr || info->input == nullptr) return false;
    InputSource &input = *info->input;
    ZOTARPELM_Seek_IO(&input, 0, 0);
    return input.kind != PELM_SOURCE_MEMORY || (input.data != nullptr && input.size >= bmp_header_bytes);
}

int32_t decode_by_depth(BmpState &state, intptr_t cursor, int32_t rows) {
    switch (state.bitsPerPixel) {
    case 1: return PELMI_BMP_Decode1bitBMP(&state, cursor, rows);
    case 4: return PELMI_BMP_Decode4bitBMP(&state, cursor, rows);
    case 8: return PELMI_BMP_Decode8bitBMP(&state, cursor, rows);
    case 16: return PELMI_BMP_Decode16bitBMP(&state, cursor, rows);
    case 24: return PELMI_BMP_Decode24bitBMP(&state, cursor, rows);
    case 32: return PELMI_BMP_Decode32bitBMP(&state, cursor, rows);
    default: return PELM_RESULT_DONE;
    }
}

int32_t rows_of_band(const BmpState &state, int32_t rows) {
    return std::max(0, std::min(rows, state.scaledHeight - state.rowsDone));
}

void finish_band(ImageDecodeInfo &info, BmpState &state, int32_t rows) {
    state.rowsDone += rows;
    if (state.rowsDone >= state.scaledHeight) end_decode(info, &state);
}

} // namespace pelm

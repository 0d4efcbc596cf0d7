// A BMP in bands of rows, each into a buffer of its own that has just these rows.
#include "bmp/calls.h"
#include "bmp/initialize.h"
#include "frame/formats.h"
#include "frame/sizes.h"

namespace pelm {
namespace {

// Required: bands are never turned, and only stretching is known of the placements (docs/oddities.md, "Bands by the
// line call").
uint32_t known_flags(uint32_t flags) {
    return placement_mode(flags) == PELM_PLACE_STRETCH ? PELM_PLACE_STRETCH : PELM_PLACE_FIT;
}

BmpState *state_of_band(ImageDecodeInfo &info, Size box) {
    auto *const state = static_cast<BmpState *>(info.decoderState);
    return state != nullptr ? state : new_state(info, {box, known_flags(info.flags), nullptr});
}

// Points a copy of the record at a buffer of `rows` rows, which the band fills from its first row on. Where no row of
// the image fits, nothing is written.
void place_band(BmpState &band, void *output, int32_t row_pixels, int32_t rows) {
    const int32_t pixel_bytes = bytes_per_pixel(band.outputFormat);
    const int64_t row_step = int64_t{row_pixels} * pixel_bytes * (band.topDown != 0 ? -1 : 1);
    size_t bytes = 0;
    band.output.buffer = {};
    if (output == nullptr || row_pixels < band.scaledWidth || !fits_int32(row_step)) return;
    if (!buffer_bytes(row_pixels, rows, pixel_bytes, bytes)) return;

    const int64_t margin = (int64_t{row_pixels} - band.scaledWidth) >> 1;
    band.output.buffer = {static_cast<uint8_t *>(output), bytes};
    band.outputCursor = static_cast<intptr_t>(margin * pixel_bytes);
    band.output.cursorCarry = 0;
    band.rowStep = static_cast<int32_t>(row_step);
    band.pixelStep = pixel_bytes / pixel_step_unit(band.outputFormat);
}

} // namespace
} // namespace pelm

int32_t ZOTARPELMI_DecodeBMPLine(ImageDecodeInfo *info, void *output, int32_t outWidth, int32_t outHeight,
                                 int32_t rows) {
    if (!pelm::begin_call(info)) return PELM_RESULT_FAILED;
    BmpState *const state = pelm::state_of_band(*info, {outWidth, outHeight});
    if (state == nullptr) return PELM_RESULT_FAILED;

    const int32_t count = pelm::rows_of_band(*state, rows);
    int32_t result = PELM_RESULT_DONE;
    if (count > 0) {
        BmpState band = *state;
        pelm::place_band(band, output, outWidth, count);
        result = pelm::decode_by_depth(band, band.outputCursor, count);
    }
    if (result == PELM_RESULT_FAILED)
        pelm::end_decode(*info, state);
    else
        pelm::finish_band(*info, *state, count);
    return result;
}

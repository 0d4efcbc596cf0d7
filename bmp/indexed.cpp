// The depths with a palette: 1, 4 and 8 bits per pixel.
#include "bmp/decode_rows.h"
#include "bmp/run_length.h"
#include "bmp/working.h"

using namespace pelm;

namespace {

template <int32_t depth>
void write_indexed(const uint8_t *row, void *output, int32_t count, int32_t pixel_step, const uint8_t *palette,
                   uint32_t format) {
    write_row_as(format, IndexedRow<depth>{row, palette}, 0, count, static_cast<uint8_t *>(output),
                 static_cast<ptrdiff_t>(pixel_step) * pixel_step_unit(format));
}

// Expanded codes are rows of 8 bits at either depth.
template <int32_t depth>
int32_t decode_indexed(const BmpState &state, intptr_t cursor, int32_t rows) {
    if (state.bitsPerPixel == depth && is_run_length(state))
        return decode_rows_from<RunLengthReader>(state, cursor, rows, IndexedRow<8>{nullptr, state.palette});
    return decode_rows(state, cursor, rows, IndexedRow<depth>{nullptr, state.palette});
}

} // namespace

int32_t PELMI_BMP_Decode1bitBMP(BmpState *state, intptr_t outputCursor, int32_t rows) {
    return decode_rows(*state, outputCursor, rows, IndexedRow<1>{nullptr, state->palette});
}

int32_t PELMI_BMP_Decode4bitBMP(BmpState *state, intptr_t outputCursor, int32_t rows) {
    return decode_indexed<4>(*state, outputCursor, rows);
}

int32_t PELMI_BMP_Decode8bitBMP(BmpState *state, intptr_t outputCursor, int32_t rows) {
    return decode_indexed<8>(*state, outputCursor, rows);
}

BmpStop PELMI_BMP_Write1bitOutput(const uint8_t *row, void *output, int32_t count, int32_t pixelStep,
                                  const uint8_t *palette, uint32_t outputFormat) {
    write_indexed<1>(row, output, count, pixelStep, palette, outputFormat);
    const int32_t written = bytes_per_pixel(outputFormat) == 0 || count < 0 ? 0 : count;
    const ptrdiff_t bytes = static_cast<ptrdiff_t>(pixelStep) * pixel_step_unit(outputFormat) * written;
    // The place behind the last pixel may lie outside the buffer: it is counted as an address, not as a pointer.
    const uintptr_t stop = reinterpret_cast<uintptr_t>(output) + static_cast<uintptr_t>(bytes);
    return {row + written / 8, reinterpret_cast<uint8_t *>(stop)};
}

void PELMI_BMP_Write4bitOutput(const uint8_t *row, void *output, int32_t count, int32_t pixelStep,
                               const uint8_t *palette, uint32_t outputFormat) {
    write_indexed<4>(row, output, count, pixelStep, palette, outputFormat);
}

void PELMI_BMP_Write8bitOutput(const uint8_t *row, void *output, int32_t count, int32_t pixelStep,
                               const uint8_t *palette, uint32_t outputFormat) {
    write_indexed<8>(row, output, count, pixelStep, palette, outputFormat);
}

// The depths with a palette: 1, 4 and 8 bits per pixel.
#include "bmp/decode_rows.h"
#include "bmp/run_length.h"
#include "bmp/working.h"
#include "frame/finished_colours.h"
#include "frame/processor.h"

using namespace pelm;

namespace {

template <int32_t depth>
void write_indexed(const uint8_t *row, void *output, int32_t count, int32_t pixel_step, const uint8_t *palette,
                   uint32_t format) {
    write_row_as(format, IndexedRow<depth>{row, palette}, 0, count, static_cast<uint8_t *>(output),
                 static_cast<ptrdiff_t>(pixel_step_bytes(pixel_step, format)));
}

// Whether a table of finished colours is worth its making for this band.
bool repays_finished_colours(const BmpState &state, int32_t rows, int32_t depth) {
    const int64_t pixels = int64_t{state.width} * std::min(rows, state.scaledHeight - state.rowsDone);
    return kernels() != Kernels::careful && state.oneToOne != 0 && bytes_per_pixel(state.outputFormat) != 0 &&
           state.output.buffer.size != 0 && pixels >= int64_t{pixels_per_finished_colour} << depth;
}

template <int32_t depth>
void finish_colours(FinishedColours &colours, const BmpState &state) {
    const RowOfSamples row = row_of_samples(depth);
    uint8_t pixels[sizeof FinishedColours::pixels] = {};
    write_row_as(state.outputFormat, IndexedRow<depth>{row.bytes, state.palette}, 0, 1 << depth, pixels, 4);
    fill_finished_colours(colours, pixels, depth, static_cast<uint32_t>(bytes_per_pixel(state.outputFormat)));
}

template <class Reader, int32_t depth>
int32_t decode_samples(const BmpState &state, intptr_t cursor, int32_t rows) {
    if (!repays_finished_colours(state, rows, depth))
        return decode_rows_from<Reader>(state, cursor, rows, IndexedRow<depth>{nullptr, state.palette});
    FinishedColours colours;
    finish_colours<depth>(colours, state);
    return decode_rows_from<Reader>(state, cursor, rows, FinishedRow<depth>{nullptr, &colours});
}

// Expanded codes are rows of 8 bits at either depth.
template <int32_t depth>
int32_t decode_indexed(const BmpState &state, intptr_t cursor, int32_t rows) {
    if (state.bitsPerPixel != depth) return PELM_RESULT_DONE;
    if (depth != 1 && is_run_length(state)) return decode_samples<RunLengthReader, 8>(state, cursor, rows);
    return decode_samples<RowReader, depth>(state, cursor, rows);
}

} // namespace

int32_t PELMI_BMP_Decode1bitBMP(BmpState *state, intptr_t outputCursor, int32_t rows) {
    return decode_indexed<1>(*state, outputCursor, rows);
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
    const int64_t bytes = pixel_step_bytes(pixelStep, outputFormat) * written;
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

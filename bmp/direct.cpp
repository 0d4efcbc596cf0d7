// The depths that store colours: 16, 24 and 32 bits per pixel.
#include "bmp/decode_rows.h"
#include "bmp/working.h"

using namespace pelm;

namespace {

struct Channel {
    uint32_t mask, shift;
};

// A shift by 32 or more gives 0: so does a mask of 0.
Channel channel(uint32_t mask, uint32_t shift) {
    return shift < 32 ? Channel{mask, shift} : Channel{0, 0};
}

MaskedRow masked_row(const uint8_t *row, Channel red, Channel green, Channel blue) {
    return {row, red.mask, green.mask, blue.mask, red.shift, green.shift, blue.shift};
}

template <class Load>
void write_direct(const Load &load, void *output, int32_t count, int32_t pixel_step, uint32_t format) {
    write_row_as(format, load, 0, count, static_cast<uint8_t *>(output),
                 static_cast<ptrdiff_t>(pixel_step_bytes(pixel_step, format)));
}

} // namespace

int32_t PELMI_BMP_Decode16bitBMP(BmpState *state, intptr_t outputCursor, int32_t rows) {
    const MaskedRow layout =
        masked_row(nullptr, channel(state->redMask, state->redShift), channel(state->greenMask, state->greenShift),
                   channel(state->blueMask, state->blueShift));
    return decode_rows(*state, outputCursor, rows, layout);
}

int32_t PELMI_BMP_Decode24bitBMP(BmpState *state, intptr_t outputCursor, int32_t rows) {
    return decode_rows(*state, outputCursor, rows, Bgr24Row{nullptr});
}

int32_t PELMI_BMP_Decode32bitBMP(BmpState *state, intptr_t outputCursor, int32_t rows) {
    return decode_rows(*state, outputCursor, rows, Bgrx32Row{nullptr});
}

void PELMI_BMP_Write16bitOutput(const void *row, void *output, int32_t count, int32_t pixelStep, uint32_t redMask,
                                uint32_t greenMask, uint32_t blueMask, uint32_t redShift, uint32_t greenShift,
                                uint32_t blueShift, uint32_t outputFormat) {
    const MaskedRow load = masked_row(static_cast<const uint8_t *>(row), channel(redMask, redShift),
                                      channel(greenMask, greenShift), channel(blueMask, blueShift));
    write_direct(load, output, count, pixelStep, outputFormat);
}

void PELMI_BMP_Write24bitOutput(const uint8_t *row, void *output, int32_t count, int32_t pixelStep,
                                uint32_t outputFormat) {
    write_direct(Bgr24Row{row}, output, count, pixelStep, outputFormat);
}

void PELMI_BMP_Write32bitOutput(const uint8_t *row, void *output, int32_t count, int32_t pixelStep,
                                uint32_t outputFormat) {
    write_direct(Bgrx32Row{row}, output, count, pixelStep, outputFormat);
}

void PELMI_BMP_WriteResizedOutput(const uint32_t *accumulators, void *output, int32_t count, int32_t pixelStep,
                                  uint32_t outputFormat) {
    write_direct(SumsRow<TenBitSums>{accumulators}, output, count, pixelStep, outputFormat);
}

void PELMI_BMP_WriteResizedOutputWithAlpha(const uint32_t *words, void *output, int32_t count, int32_t pixelStep,
                                           uint32_t outputFormat) {
    write_direct(SumsRow<QuarterSums>{words}, output, count, pixelStep, outputFormat);
}

// The exported working functions of the BMP decoder.
//
// The writers convert `count` pixels of one source row and write them from `output` on, `pixelStep` apart (in pixels
// for RGB565, otherwise in bytes, either way round). They know no bounds: the caller answers for every byte from the
// first pixel to the last. A format that BMP does not write leaves the output untouched.
#pragma once

#include "bmp/state.h"

// Reads and checks the header at the source's position, computes size and placement, allocates the record and its
// buffers, and sets outputWidth, outputHeight, decodeStarted and decoderState of the request. NULL when refused.
PELM_EXPORT BmpState *PELMI_BMP_Initialize(ImageDecodeInfo *info, int32_t outWidth, int32_t outHeight, void *output);

// The same for the record that ZOTARPELMI_PreInitBMP has parked in decoderState, with the rules of the calls in two
// steps. Refused: the record is freed as below, and decoderState still points at it. NULL too without a record.
PELM_EXPORT BmpState *PELMI_BMP_InitializeSKIA(ImageDecodeInfo *info, int32_t outWidth, int32_t outHeight,
                                               void *output);

// Frees the staging buffer (kinds 0 and 2, whose `data` becomes NULL), the palette, the accumulators and the record.
PELM_EXPORT void PELMI_BMP_DeleteDecInfo(BmpState *state);

// Decode `rows` output rows, from row `rowsDone` on, the first one at the given offset in the output buffer.
// 1: done, or the data simply ended. 5: a read failed before that. 0: no memory for the row buffer.
PELM_EXPORT int32_t PELMI_BMP_Decode1bitBMP(BmpState *state, intptr_t outputCursor, int32_t rows);
PELM_EXPORT int32_t PELMI_BMP_Decode4bitBMP(BmpState *state, intptr_t outputCursor, int32_t rows);
PELM_EXPORT int32_t PELMI_BMP_Decode8bitBMP(BmpState *state, intptr_t outputCursor, int32_t rows);
PELM_EXPORT int32_t PELMI_BMP_Decode16bitBMP(BmpState *state, intptr_t outputCursor, int32_t rows);
PELM_EXPORT int32_t PELMI_BMP_Decode24bitBMP(BmpState *state, intptr_t outputCursor, int32_t rows);
PELM_EXPORT int32_t PELMI_BMP_Decode32bitBMP(BmpState *state, intptr_t outputCursor, int32_t rows);

// Where PELMI_BMP_Write1bitOutput stopped: the byte of the next source pixel, and the place of the next output pixel.
struct BmpStop {
    const uint8_t *source;
    uint8_t *output;
};

PELM_EXPORT BmpStop PELMI_BMP_Write1bitOutput(const uint8_t *row, void *output, int32_t count, int32_t pixelStep,
                                              const uint8_t *palette, uint32_t outputFormat);
PELM_EXPORT void PELMI_BMP_Write4bitOutput(const uint8_t *row, void *output, int32_t count, int32_t pixelStep,
                                           const uint8_t *palette, uint32_t outputFormat);
PELM_EXPORT void PELMI_BMP_Write8bitOutput(const uint8_t *row, void *output, int32_t count, int32_t pixelStep,
                                           const uint8_t *palette, uint32_t outputFormat);
PELM_EXPORT void PELMI_BMP_Write16bitOutput(const void *row, void *output, int32_t count, int32_t pixelStep,
                                            uint32_t redMask, uint32_t greenMask, uint32_t blueMask, uint32_t redShift,
                                            uint32_t greenShift, uint32_t blueShift, uint32_t outputFormat);
PELM_EXPORT void PELMI_BMP_Write24bitOutput(const uint8_t *row, void *output, int32_t count, int32_t pixelStep,
                                            uint32_t outputFormat);
PELM_EXPORT void PELMI_BMP_Write32bitOutput(const uint8_t *row, void *output, int32_t count, int32_t pixelStep,
                                            uint32_t outputFormat);

// Write finished accumulator words: sums of four samples, blue in bits 0-9, green in 10-19, red in 20-29; and, "with
// alpha", one byte a channel: blue, green, red, alpha from the low byte up.
PELM_EXPORT void PELMI_BMP_WriteResizedOutput(const uint32_t *accumulators, void *output, int32_t count,
                                              int32_t pixelStep, uint32_t outputFormat);
PELM_EXPORT void PELMI_BMP_WriteResizedOutputWithAlpha(const uint32_t *words, void *output, int32_t count,
                                                       int32_t pixelStep, uint32_t outputFormat);

// The GIF decoder's exported working functions. Positions in the output are byte offsets from the start of the state's
// output buffer, which the writers never leave.
#pragma once

#include "gif/state.h"

// --- Input ---

// Makes sure of `need` unread bytes in a row at `cursor`, reading once when there are fewer. 1; or 0 when there are not
// that many, and then `bytesLeft` and `cursor` are as they were.
PELM_EXPORT int32_t PELMI_CheckBuffer(int32_t need, InputSource *source, uint8_t *buffer, int32_t *bytesLeft,
                                      uint8_t **cursor);

// Rewinds the source and reads the header, the logical screen and the global colour table. 1, or 0 for another file.
PELM_EXPORT int32_t PELMI_ParseGIFHeader(InputSource *source, GifDecoderState *state);

// Packs `count` RGB triplets.
PELM_EXPORT void PELMI_MakeColorTable(const uint8_t *raw, int32_t count, uint32_t *table);

// Walks over blocks to the next image: 1, and the input stands at its LZW data; 3 at the trailer; 0 for malformed or
// short input, or without memory for a row of an image wider than the screen.
PELM_EXPORT int32_t PELMI_SeekImageData(InputSource *source, GifDecoderState *state);

// --- The record ---

// A record that is ready for PELMI_SeekImageData, with size and place in the output settled; NULL on any failure.
// Writes the request's outputWidth and outputHeight.
PELM_EXPORT GifDecoderState *PELMI_InitializeGIF(ImageDecodeInfo *info, int32_t outWidth, int32_t outHeight,
                                                 uint32_t animated, void *outBuffer);

// The fixed buffers. Nonzero, or 0 without memory: what has been allocated hangs from the state.
PELM_EXPORT int32_t PELMI_CreateGIFDecoderInfo(GifDecoderState *state);

// Frees the state and all that it owns. NULL is ignored.
PELM_EXPORT void PELMI_DelGIFDecoderInfo(GifDecoderState *state);

// --- LZW (GIF89a, appendix F) ---

// 1; or 0 above 11, and nothing is written.
PELM_EXPORT int32_t PELMI_InitializeTransTBL(uint32_t minCodeSize, GifLzwTables *tables);
PELM_EXPORT void PELMI_AddToTranslationTable(uint32_t prefixCode, uint8_t pixel, uint32_t index, GifLzwTables *tables);

// Writes the string of `code` from buffer[pos] on and returns its first pixel.
PELM_EXPORT uint8_t PELMI_TranslateCode(uint32_t code, const GifLzwTables *tables, int32_t pos, uint8_t *buffer);
PELM_EXPORT void PELMI_WriteCharacter(uint8_t pixel, int32_t pos, uint8_t *buffer);

// The image, to its end, its end code, or the end of the file (1), or until something fails (0).
PELM_EXPORT int32_t PELMI_DecodeGIFImage(InputSource *source, GifDecoderState *state, intptr_t outBuffer);

// The same over several calls: 4 while there is more. The first call for an image decodes no row.
PELM_EXPORT int32_t PELMI_DecodeGIFImageIter(InputSource *source, GifDecoderState *state, intptr_t outBuffer,
                                             uint32_t first);

// Up to `rowsWanted` output rows to the start of `outBuffer`, which has room for that many of requestedWidth pixels.
PELM_EXPORT int32_t PELMI_DecodeGIFImageLine(InputSource *source, GifDecoderState *state, void *outBuffer,
                                             int32_t rowsWanted, uint32_t first);

// --- Rows ---

// Writes the current row and moves `sourceRow` to the next one, in the order of the interlace passes. 1, or 0 when
// there is no such pass.
PELM_EXPORT int32_t PELMI_WriteTheLine(GifDecoderState *state, intptr_t outBuffer);

PELM_EXPORT void PELMI_WriteGIFOneToOneRow(GifDecoderState *state, intptr_t outBuffer);
PELM_EXPORT void PELMI_DownsizeGIFRow(GifDecoderState *state, intptr_t outBuffer);
PELM_EXPORT void PELMI_WriteAGIFOneToOneRow(GifDecoderState *state, intptr_t outBuffer);
PELM_EXPORT void PELMI_DownsizeAGIFRow(GifDecoderState *state, intptr_t outBuffer);

// Writes at most one output row of the current image row; `consumed` becomes 1 when the image row is used up. 0 for an
// interlaced image.
PELM_EXPORT int32_t PELMI_GIFMakeOut1Row(GifDecoderState *state, intptr_t outBuffer, uint32_t *consumed);

// Composes the current row of an animation's frame with the canvas, in the row buffer, and updates the canvas. 1.
PELM_EXPORT int32_t PELMI_MakeFrameLineBuffer(GifDecoderState *state);

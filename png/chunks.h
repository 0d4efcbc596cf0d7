// The walk over a PNG's chunks, once per decode and before any pixel: every checksum is verified, the header, palette
// and transparency are kept, and the IDAT chunks are indexed (PNG specification, chapters 5 and 11).
#pragma once

#include "png/reader.h"

// PNG_DONE, PNG_BAD_DATA (a checksum, or no image data), PNG_NO_MEMORY or PNG_FORMAT_ERROR.
PELM_EXPORT uint32_t __PELMI_PngParserMain(PngDecodeState *state, PngInputBuffer *input);

// Reads the tRNS data (and only that) at the read position; keyRecord's header fields say how, and its paletteAlpha
// takes a palette's values. A colour key goes to keyTarget. PNG_DONE, PNG_TRNS_BEFORE_IHDR, PNG_BAD_DATA or
// PNG_FORMAT_ERROR.
PELM_EXPORT uint32_t __PELMI_PngParseTRNSbKGd(PngDecodeState *keyRecord, PngInputBuffer *input, uint32_t chunkLength,
                                              uint32_t chunkType, PngDecodeState *keyTarget);

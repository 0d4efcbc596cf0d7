// The image-data loops: from the compressed stream to written rows. Memory or stream, rows one after the other or in
// Adam7 passes; one core (png/inflate/inflate.h) does the work.
//
// `total` receives the number of bytes inflated when the image is complete. `area` is the byte offset of the placed
// image's first pixel in the buffer of the current call. Results are internal codes. Where `decoderState`
// is NULL afterwards the state is gone; after PNG_ROWS_REMAIN it waits for the next call, and after everything else it
// is the caller's to destroy.
#pragma once

#include "png/state.h"

PELM_EXPORT uint32_t _PELMI_PngInflateZStreamData(ImageDecodeInfo *info, uint32_t *total, uint32_t unused, int64_t area,
                                                  const uint32_t *outputWidth, const uint32_t *outputHeight);
PELM_EXPORT uint32_t _PELMI_PngInflateZStreamData_streamming(ImageDecodeInfo *info, PngInputBuffer *input,
                                                             uint32_t *total, uint32_t unused, int64_t area,
                                                             const uint32_t *outputWidth, const uint32_t *outputHeight);

PELM_EXPORT uint32_t _PELMI_PngInflateZStreamDataInterlaced(ImageDecodeInfo *info, uint32_t *total, uint32_t unused,
                                                            int64_t area, const uint32_t *outputWidth,
                                                            const uint32_t *outputHeight);
PELM_EXPORT uint32_t _PELMI_PngInflateZStreamDataInterlaced_streamming(ImageDecodeInfo *info, PngInputBuffer *input,
                                                                       uint32_t *total, uint32_t unused, int64_t area,
                                                                       const uint32_t *outputWidth,
                                                                       const uint32_t *outputHeight);

// A hook for a further reduction of strongly reduced images, which this decoder does without: returns 0.
PELM_EXPORT uint32_t __PELMI_NearestInterpolateOutput(PngDecodeState *state, int64_t area, uint32_t outputWidth,
                                                      uint32_t outputHeight);

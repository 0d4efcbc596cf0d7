// The image formats that the tool can tell apart, and for each the calls that describe and decode it.
#pragma once

#include "PelmImageDecoder.h"
#include "tools/bytes.h"
#include "tools/image_description.h"
#include "tools/pixels.h"

namespace pelm_tool {

struct ImageFormat {
    const char *name;
    const char *magic;                                               // what its files begin with
    ImageDescription (*describe)(Bytes head, const FileFacts &file); // nullptr: known, but not decoded
    int32_t (*decode)(ImageDecodeInfo *info, void *output, int32_t outWidth, int32_t outHeight);
    uint32_t written_formats; // bit n: output format n
};

// By the first bytes. Throws Failure, with the reason, for what cannot be decoded.
const ImageFormat &recognise(Bytes head);

bool writes(const ImageFormat &image, const PixelFormat &pixels);

} // namespace pelm_tool

// One run of a decoder: what it is asked for, and what became of it.
#pragma once

#include "PelmImageDecoder.h"
#include "tools/image_description.h"
#include "tools/options.h"
#include "tools/pixels.h"

namespace pelm_tool {

struct DecodeJob {
    ImageDecodeInfo &info; // ready for the first call
    const ImageDescription &image;
    Box box;
    Mode mode;
    Picture *picture;          // nullptr: run without writing
    const uint64_t &polls;     // how often the decoder has asked whether to go on
    int64_t complete_rows = 0; // of the stored image; counted by decoders that poll once a row

    uint8_t *output() const { return picture == nullptr ? nullptr : picture->bytes.data(); }
};

} // namespace pelm_tool

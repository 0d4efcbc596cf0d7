// The image formats that the tool can tell apart, and for each the calls that describe and decode it.
#pragma once

#include "tools/decode_job.h"
#include "tools/image_description.h"
#include "tools/input.h"
#include "tools/pixels.h"

namespace pelm_tool {

struct ImageFormat {
    const char *name;
    bool (*recognises)(Bytes head);
    ImageDescription (*describe)(Input &input); // nullptr: known, but not decoded
    int32_t (*decode)(DecodeJob &job);          // PELM_RESULT_
    uint32_t written_formats;                   // bit n: output format n
    bool is_read_from_memory;                   // unless the user says otherwise
    bool polls_rows;                            // asks the host once after every row
    bool decodes_in_calls;                      // modes other than one-shot
    bool turns_only_reduced;
};

// By the first bytes. Throws Failure, with the reason, for what cannot be decoded.
const ImageFormat &recognise(Bytes head);

// Throws Failure when the input cannot be read.
ImageDescription describe(const ImageFormat &image, Input &input);

bool writes(const ImageFormat &image, const PixelFormat &pixels);

} // namespace pelm_tool

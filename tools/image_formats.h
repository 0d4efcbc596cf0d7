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
    ImageDescription (*describe)(Input &input, Mode mode);
    int32_t (*decode)(DecodeJob &job); // PELM_RESULT_
    uint32_t written_formats;          // bit n: output format n
    PipeUse pipe_use = PipeUse::front_to_back;
    bool is_read_from_memory = false;  // unless the user says otherwise
    bool polls_rows = false;           // asks the host once after every row
    bool decodes_in_calls = false;     // the modes iter and line
    bool decodes_in_two_steps = false; // the mode skia
    bool turns_only_reduced = false;
    bool never_turns = false;
    bool black_is_clear = false; // alpha 0, at the image's own size
    bool has_frames = false;     // of an animation
    // What it does to this image with these options, beyond what the description says.
    std::vector<std::string> (*notes)(const Options &options, const ImageDescription &image, Box box) = nullptr;
};

// By the first bytes. Throws Failure, with the reason, for what cannot be decoded.
const ImageFormat &recognise(Bytes head);

// Makes the input the kind of source that the decoder is to read. Throws Failure.
void settle(Input &input, const ImageFormat &image, Mode mode);

// What the decoder makes of the input in this mode. Throws Failure when the input cannot be read.
ImageDescription describe(const ImageFormat &image, Input &input, Mode mode);

bool writes(const ImageFormat &image, const PixelFormat &pixels);

} // namespace pelm_tool

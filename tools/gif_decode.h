// Decodes the first image of a GIF in the way that the user asked for: in one call, in slices, or by lines.
#pragma once

#include <string>
#include <vector>

#include "tools/decode_job.h"

namespace pelm_tool {

// PELM_RESULT_DONE or PELM_RESULT_FAILED. Without a picture it only finds out the size. Throws Failure for what cannot
// be done by lines.
int32_t decode_gif(DecodeJob &job);

// What the decoder does to GIFs with these options, still or animated.
std::vector<std::string> gif_notes(const Options &options, const ImageDescription &image, Box box);

// Asks the decoder for the size of the output alone, from the source's first byte on.
int32_t measure_gif(ImageDecodeInfo &info, Box box);

} // namespace pelm_tool

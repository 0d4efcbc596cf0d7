// Decodes a PNG in the way that the user asked for: in one call, block by block, or by lines.
#pragma once

#include "tools/decode_job.h"

namespace pelm_tool {

// PELM_RESULT_DONE or PELM_RESULT_FAILED; counts the rows of the image that were complete.
int32_t decode_png(DecodeJob &job);

// Whether the image goes into the box pixel for pixel. Only then are its rows written unturned, and does every call of
// a decode get the whole box.
bool keeps_its_size(const ImageDescription &image, Box box, uint32_t flags);

} // namespace pelm_tool

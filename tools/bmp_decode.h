// Decodes a BMP in the way that the user asked for: in one call, in bands, by lines, or in two steps as a graphics
// library does.
#pragma once

#include "tools/decode_job.h"

namespace pelm_tool {

// PELM_RESULT_DONE, PELM_RESULT_FAILED, or by lines PELM_RESULT_DATA_ENDED. Leaves nothing of the decoder allocated.
// Throws Failure for what cannot be done by lines.
int32_t decode_bmp(DecodeJob &job);

} // namespace pelm_tool

// From a request to a record that is ready to decode.
#pragma once

#include "bmp/geometry.h"

namespace pelm {

// Everything behind the header: colours, size and place in the output, buffers. The source's own staging buffer is
// allocated only for direct calls.
SetUp complete_state(BmpState &state, const BmpHeader &header, ImageDecodeInfo &info, const Target &target,
                     Calls calls);

// Hangs a complete record from the request.
BmpState *hang_state(ImageDecodeInfo &info, BmpState *state);

// A new record for a direct call, hung from the request; NULL when refused.
BmpState *new_state(ImageDecodeInfo &info, const Target &target);

// The end of a decode: frees the record with all that hangs from it.
void end_decode(ImageDecodeInfo &info, BmpState *state);

} // namespace pelm

// PNG chunks in words: what the file holds, and why the decoder refuses it when it does. The library itself says no
// more than "failed".
#pragma once

#include "PelmHost.h"
#include "tools/bytes.h"
#include "tools/image_description.h"

namespace pelm_tool {

// Whether a file begins with the PNG signature, or with something that was meant to be one.
bool begins_like_png(Bytes head);

// Reads the source from its first byte to its end chunk, through the host services, and leaves it there. Image data is
// verified by its checksums, not decompressed.
ImageDescription describe_png(InputSource &source);

} // namespace pelm_tool

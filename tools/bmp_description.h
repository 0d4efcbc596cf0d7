// BMP headers in words: what the file holds, and why the decoder refuses it when it does. What is refused depends on
// the calls that decode it.
#pragma once

#include "tools/bytes.h"
#include "tools/image_description.h"
#include "tools/options.h"

namespace pelm_tool {

// `head` is the file's first bytes, fewer than `described_bytes` only when the file is shorter.
ImageDescription describe_bmp(Bytes head, const FileFacts &file, Mode mode);

} // namespace pelm_tool

// BMP headers in words: what the file holds, and why the decoder refuses it when it does. The library itself says no
// more than "failed".
#pragma once

#include "tools/bytes.h"
#include "tools/image_description.h"

namespace pelm_tool {

// `head` is the file's first bytes, fewer than `described_bytes` only when the file is shorter.
ImageDescription describe_bmp(Bytes head, const FileFacts &file);

} // namespace pelm_tool

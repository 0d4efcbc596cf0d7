// WBMP headers in words: what the file holds, and why the decoder refuses it when it does.
#pragma once

#include "tools/bytes.h"
#include "tools/image_description.h"

namespace pelm_tool {

// WBMPs have no signature: a type and a fix-header field of 0, and two sides that an image can have. To be asked last.
bool begins_like_wbmp(Bytes head);

// `head` begins like a WBMP.
ImageDescription describe_wbmp(Bytes head, const FileFacts &file);

} // namespace pelm_tool

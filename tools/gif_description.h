// The blocks of a GIF in words: screen, frames, timing, and why the decoder refuses it when it does.
#pragma once

#include "PelmHost.h"
#include "tools/bytes.h"
#include "tools/image_description.h"

namespace pelm_tool {

bool begins_like_gif(Bytes head);

// `head` holds the first bytes of the source, which is read to its last block and left at its first byte.
ImageDescription describe_gif(InputSource &source, Bytes head);

// "frame 3 breaks off after 5 of 10 rows", for the first such frame up to number `last`; empty: none.
std::string broken_frame_words(const ImageDescription &image, size_t last);

// What a file that does not end in its trailer may lack; empty when it does.
std::string ending_words(const ImageDescription &image);

} // namespace pelm_tool

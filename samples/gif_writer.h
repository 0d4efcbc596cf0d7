// Writes GIF files of one or more frames.
#pragma once

#include <string>

#include "samples/picture.h"

namespace pelm_samples {

enum class GifDisposal : uint8_t { unspecified = 0, keep = 1, clear = 2, restore = 3 };

struct GifFrame {
    int left, top, width, height;
    std::vector<uint8_t> indices; // from the top left
    int delay = 0;                // hundredths of a second
    GifDisposal disposal = GifDisposal::unspecified;
    int transparent = -1; // index; -1: none
    bool interlaced = false;
};

struct GifContents {
    int width;
    int height;
    std::vector<Colour> palette; // filled up to a power of two
    std::vector<GifFrame> frames;
    int loops = -1; // how often to play it again; 0: for ever; -1: left out
};

bool write_gif(const std::string &path, const GifContents &contents); // false: failed

} // namespace pelm_samples

// GIFs as giflib reads them, and as the published rules put their frames together.
#pragma once

#include <filesystem>
#include <vector>

#include "tests/tool/image_files.h"

namespace pelm::test {

struct OracleGif {
    Image first; // in the colours of its pixels, transparent ones too; only for images that fill the screen
    std::vector<Image> frames; // composed; what nothing has painted is 0
};

OracleGif read_gif(const std::filesystem::path &path); // no frames: it cannot be read

} // namespace pelm::test

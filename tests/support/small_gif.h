// GIF files of a few frames, for tests of what surrounds the decoder: block by block, with image data that any decoder
// reads and none compresses.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace pelm::test {

struct SmallFrame {
    uint32_t left = 0, top = 0, width = 4, height = 3;
    std::vector<uint8_t> indices; // row by row from the top; empty: 0, 1, 2, 3, 0, ...
    int delay = -1;               // hundredths of a second; below 0: no graphic control block
    int disposal = 0;
    int transparent = -1;
    bool interlaced = false;
    std::vector<uint32_t> colours = {}; // 0xRRGGBB, a power of two of them; empty: no local table
};

struct SmallGif {
    uint32_t width = 4, height = 3;
    std::vector<uint32_t> colours = {0x204060, 0xF0A030, 0x10C080, 0xFFFFFF};
    int loops = -1; // below 0: no loop block
    std::vector<SmallFrame> frames = {SmallFrame{}};
    bool has_trailer = true;
};

std::vector<uint8_t> gif_bytes(const SmallGif &gif);

// Its pieces, for files that are put together otherwise.
std::vector<uint8_t> gif_header(const SmallGif &gif);
std::vector<uint8_t> gif_loop_block(const std::string &application, int loops);
std::vector<uint8_t> gif_frame(const SmallFrame &frame); // with its graphic control block
std::vector<uint8_t> gif_image(const SmallFrame &frame); // without

} // namespace pelm::test

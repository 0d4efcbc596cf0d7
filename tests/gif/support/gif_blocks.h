// The blocks that a GIF decode asks for, in order: sizes in bytes.
#pragma once

#include <cstdint>
#include <vector>

#include "gif/state.h"

namespace pelm::test {

// The record and what is created with it; finished colours and fast tables lie behind two of the blocks.
inline std::vector<uint32_t> gif_record_blocks() {
    return {sizeof(GifDecoderState), sizeof(GifInput), 16384, 1024, 2048, sizeof(GifLzwTables), 16384, 4096, 65536};
}

// And for a screen: pixels that wait for their row, the row; no more for stills.
inline std::vector<uint32_t> gif_still_blocks(uint32_t screen_width) {
    std::vector<uint32_t> blocks = gif_record_blocks();
    blocks.push_back(screen_width + 4104);
    blocks.push_back(screen_width * 4);
    return blocks;
}

// An animation has its canvas too.
inline std::vector<uint32_t> gif_animated_blocks(uint32_t screen_width, uint32_t screen_height) {
    std::vector<uint32_t> blocks = gif_still_blocks(screen_width);
    blocks.push_back(screen_width * screen_height * 4);
    return blocks;
}

// Before all others, at a first frame: the tables of the request.
inline const std::vector<uint32_t> gif_request_tables = {1024, 1024};

} // namespace pelm::test

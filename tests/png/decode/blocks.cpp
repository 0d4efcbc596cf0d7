#include "tests/png/decode/blocks.h"

#include "png/state.h"
#include "tests/png/support/memory.h"

namespace pelm::test {

std::vector<Block> expected_blocks(const Picture &picture, uint32_t kind, const Request &request, Blocks compressed,
                                   Passes passes) {
    const Geometry geometry = geometry_of(picture, request);
    std::vector<Block> blocks{{"state", sizeof(PngDecodeState)}, {"reader", sizeof(PngInputBuffer)}};
    if (kind != PELM_SOURCE_MEMORY) blocks.push_back({"read buffer", 16384});
    if (picture.colour_type == indexed) {
        blocks.push_back({"palette", 768});
        blocks.push_back({"palette alphas", picture.palette.size() * 2});
    }
    blocks.push_back({"index", 2048 * sizeof(PngIdatEntry)});
    if (passes == Passes::one) {
        blocks.push_back({"row accumulator", uint64_t{picture.width} * 4});
        blocks.push_back({"output accumulator", uint64_t{geometry.width} * 4});
    } else if (asks_for_frame(request)) {
        blocks.push_back({"frame", uint64_t{geometry.width} * geometry.height * 4});
    }
    blocks.push_back({"fixed codes", 50008});
    blocks.push_back({"rows", row_buffer_bytes(picture.row_bytes() + 1, picture.width)});
    if (passes == Passes::adam7) blocks.push_back({"row of zeros", uint64_t{picture.width} * 8});
    blocks.push_back({"window", window_bytes});
    if (compressed == Blocks::dynamic) blocks.push_back({"dynamic codes", 50008});
    if (compressed != Blocks::stored) blocks.push_back({"tables", sizeof(BlockCodes)});
    return blocks;
}

std::vector<uint32_t> sizes_of(const std::vector<Block> &blocks) {
    std::vector<uint32_t> sizes;
    for (const Block &block : blocks)
        sizes.push_back(static_cast<uint32_t>(block.size));
    return sizes;
}

} // namespace pelm::test

// What the decode of a PNG has to allocate, in order (docs/formats.md, "Memory").
#pragma once

#include "tests/png/decode/decoding.h"

namespace pelm::test {

struct Block {
    const char *name;
    uint64_t size;
};

enum class Passes { one, adam7 };

std::vector<Block> expected_blocks(const Picture &picture, uint32_t kind, const Request &request, Blocks compressed,
                                   Passes passes = Passes::one);

std::vector<uint32_t> sizes_of(const std::vector<Block> &blocks);

} // namespace pelm::test

// Compresses palette indices as GIF image data, and packs code lists of any kind: right, wrong or odd. Knows nothing of
// decoding but how wide a decoder reads each code.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "tests/support/bmp_builder.h"

namespace pelm::test {

using Codes = std::vector<uint32_t>;

constexpr uint32_t clear_code(int min_code_size) {
    return 1u << min_code_size;
}
constexpr uint32_t end_code(int min_code_size) {
    return clear_code(min_code_size) + 1;
}
// The first code that is free behind a clear code.
constexpr uint32_t first_free_code(int min_code_size) {
    return clear_code(min_code_size) + 2;
}

struct LzwOptions {
    bool begins_with_clear = true;
    bool ends = true;
    size_t clear_every = 0; // codes between clear codes; 0: only when the table is full
    bool clears_full_table = true;
    bool literals_only = false; // roots, one for each pixel
};

// The codes for the pixels, longest known string first. Minimum code sizes below 2 get roots only: their codes never
// grow wider.
Codes lzw_codes(const Bytes &pixels, int min_code_size, const LzwOptions &options = {});

// Codes least significant bit first, each as wide as a decoder reads it: one bit above the minimum behind a clear code,
// one more whenever the table has filled what the width can name, 12 at most.
Bytes packed_codes(const Codes &codes, int min_code_size);

// The width of each code.
std::vector<int> code_widths(const Codes &codes, int min_code_size);

Bytes lzw_data(const Bytes &pixels, int min_code_size, const LzwOptions &options = {});

} // namespace pelm::test

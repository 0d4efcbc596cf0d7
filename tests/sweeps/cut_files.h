// What becomes of a file that ends early, or whose size is not what its source says: by what docs/formats.md and
// docs/oddities.md state, from the bytes alone.
#pragma once

#include <optional>

#include "tests/sweeps/decodes.h"

namespace pelm::sweeps {

struct Cut {
    const Decode *decode;
    uint32_t kind;
    int32_t held;   // bytes that the source delivers, from the file's beginning
    int32_t stated; // its `size`; memory holds what it states
    bool is_reduced;
};

enum class Rows : uint8_t {
    counted,   // the first ones in the file's order, and no others
    leading,   // those from the top down to some row; what is below is empty
    some,      // each is there as a whole or empty
    not_stated // or not as rows
};

struct Stated {
    std::optional<int32_t> result; // of the last call
    uint64_t blocks = 0;           // that stay allocated
    Rows rows = Rows::counted;
    int32_t count = 0; // of the rows that are counted
    // GIF: what a picture that is complete all the same gives.
    std::optional<int32_t> result_if_complete = {};
};

// Of a file that is cut: `held` or `stated` is below its size, and what is not there matters.
Stated stated_for(const Cut &cut);

// Whether the decode sees no difference to the whole file.
bool is_whole_to(const Cut &cut);

// How many of an animation's frames are there as a whole.
size_t whole_frames(const Cut &cut);

// The lengths of a sound file's chunks.
std::vector<uint32_t> png_chunks(const Bytes &file);

// Of the colour table that a GIF's screen or image with this packed byte has.
int64_t gif_table_bytes(uint8_t packed);

// Whether the file's rows are stored from the bottom up.
bool is_bottom_up(const Input &input);

} // namespace pelm::sweeps

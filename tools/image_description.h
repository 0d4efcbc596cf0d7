// What the tool tells about an image file without decoding it, whatever its format.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "PelmAnimation.h"

namespace pelm_tool {

// How many of a file's first bytes tell its format, and describe it where nothing more is read.
constexpr size_t described_bytes = 66;

struct ImageDescription {
    int32_t width = 0; // as decoded; 0 when the image is refused before it is known
    int32_t height = 0;
    int32_t stored_rows = 0;      // PNG: rows of the image data; of all passes together when it is interlaced
    int32_t row_bytes = 0;        // BMP: of a stored row
    uint32_t run_length_bits = 0; // BMP: of an index, where run-length codes are decoded
    bool is_interlaced = false;
    bool is_grey_8 = false;           // PNG: grey of 8 bits in plain rows, which is reduced by rules of its own
    std::string words;                // size, depth and variant
    std::string refusal;              // why the decoder refuses it; empty when it does not
    std::string shortage;             // what a truncated file lacks; empty when it is whole
    std::vector<std::string> notes;   // what the decoder does with it that a user may not expect
    std::vector<std::string> details; // lines of their own for --info

    // GIF: what the animation calls deliver.
    PelmAnimation animation = {};
    std::vector<PelmAnimationFrame> frames = {}; // the first ones, if there are very many
};

// The file around the first bytes.
struct FileFacts {
    int64_t size;         // bytes
    uint32_t source_kind; // PELM_SOURCE_: some rules depend on it
};

} // namespace pelm_tool

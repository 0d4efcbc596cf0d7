// The header of a WBMP: which files are accepted, and what it says of the image.
#pragma once

#include "frame/host.h"

namespace pelm {

struct WbmpHeader {
    int32_t width, height; // pixels; 0 and above, below 2^27
    int32_t length;        // bytes; the rows follow at once
};

// Whole bytes, without padding.
constexpr int32_t row_bytes(const WbmpHeader &header) {
    return (header.width + 7) >> 3;
}

constexpr int32_t wbmp_header_bytes = 20; // what is read of a stream: more than any accepted header has

// False when the header is refused. `length` is how much of it there is.
bool parse_header(const uint8_t *bytes, int32_t length, WbmpHeader &header);

// Whether the image's rows lie within an input of `size` bytes.
bool rows_are_there(const WbmpHeader &header, int32_t size);

} // namespace pelm

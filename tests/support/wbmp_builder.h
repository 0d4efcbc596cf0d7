// Describes a WBMP file, right or wrong, and writes its bytes. What a decoder makes of it is not known here.
#pragma once

#include "tests/support/bmp_builder.h"

namespace pelm::test {

// Seven bits a byte, the most significant first. `length` 0 is as short as possible; more puts zeros in front.
Bytes multi_byte(uint64_t value, size_t length = 0);

struct WbmpFile {
    uint8_t type = 0;
    uint8_t fix_header = 0;
    Bytes width; // multi-byte integers
    Bytes height;
    std::vector<Bytes> rows;
    Bytes behind; // the rows

    size_t header_length() const { return 2 + width.size() + height.size(); }
};

Bytes file_bytes(const WbmpFile &file);

// A well-formed file of 1s (white) and 0s; the bits behind the last pixel of each row are set.
WbmpFile wbmp_of(const Picture &picture);
WbmpFile noise_wbmp(int32_t width, int32_t height, uint32_t seed = 1);

// A header and rows of zeros that hold these sizes.
WbmpFile blank_wbmp(int32_t width, int32_t height);

} // namespace pelm::test

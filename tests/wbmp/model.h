// What a WBMP decode must leave behind, computed pixel by pixel on plain arrays, by formula and with divisions. Only
// for sizes whose ratios single precision tells apart.
#pragma once

#include "tests/support/wbmp_builder.h"

namespace pelm::test {

struct WbmpRequest {
    uint32_t format = 1;
    uint32_t flags = 0;
    int32_t box_width = 0;
    int32_t box_height = 0;
};

int wbmp_pixel_bytes(uint32_t format); // 4 for a format that is not written: test buffers have room for it
bool is_written(uint32_t format);
size_t output_size(const WbmpRequest &request);

struct WbmpExpectation {
    int32_t result;
    bool is_drawn; // then these are the words 7 and 8; otherwise they stay
    int64_t width, height;
    Bytes output;
};

WbmpExpectation expect_wbmp(const Picture &picture, const WbmpRequest &request, uint8_t background);

std::string described(const WbmpRequest &request);

} // namespace pelm::test

// What the tests of iterative decodes have in common.
#pragma once

#include "tests/bmp/expectations.h"

namespace pelm::test {

inline constexpr uint32_t seekable_kinds[] = {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT};

// Calls with these row counts. The output is passed to the first one only.
inline BmpCalls calls_of(const BmpRequest &request, const std::vector<int32_t> &rows) {
    return [&request, &rows](ImageDecodeInfo &info, uint8_t *output) {
        int32_t result = 0;
        for (const int32_t count : rows) {
            result = ZOTARPELMI_DecodeBMPIterLine(&info, output, request.box_width, request.box_height, count);
            if (result != 1) return result;
            output = nullptr;
        }
        return result;
    };
}

} // namespace pelm::test

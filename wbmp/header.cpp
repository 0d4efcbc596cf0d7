#include "wbmp/header.h"

#include <algorithm>

#include "wbmp/working.h"

namespace pelm {
namespace {

constexpr int32_t most_groups = 4; // what 32 bits hold
constexpr int32_t fixed_bytes = 2; // type and fix-header field

// One side of the image. False for integers of more than four bytes and for values that come out negative.
// One that the data's end cuts short counts with the bytes that are there, as 0 without any.
bool read_side(const uint8_t *bytes, int32_t length, int32_t &position, int32_t &side) {
    uint8_t packed[most_groups + 1];
    int32_t groups = 0;
    const int32_t end = std::min(length - position, most_groups + 1) + position; // no more than `packed` holds
    PELMI_WBMPdecodeMultibyte(bytes, end, &position, &groups, packed);
    if (groups > most_groups) return false;
    side = PELMI_WBMPgetMultibyte2Int(packed, groups, groups);
    return side >= 0;
}

} // namespace

bool parse_header(const uint8_t *bytes, int32_t length, WbmpHeader &header) {
    if (length < fixed_bytes) return false;
    const bool is_type_0 = bytes[0] == 0;
    const bool has_extensions = (bytes[1] & 0x80) != 0;
    if (!is_type_0 || has_extensions) return false;
    header.length = fixed_bytes;
    return read_side(bytes, length, header.length, header.width) &&
           read_side(bytes, length, header.length, header.height);
}

bool rows_are_there(const WbmpHeader &header, int32_t size) {
    return int64_t{header.height} * row_bytes(header) + header.length <= size;
}

} // namespace pelm

#include "wbmp/working.h"

namespace {

// Appends seven bits to a string of `length` bits. Every byte is assigned before bits are added to it.
void append_group(uint8_t *packed, int64_t length, uint8_t group) {
    const uint32_t used = static_cast<uint32_t>(length % 8);
    const uint32_t bits = static_cast<uint32_t>(group & 0x7F) << 9 >> used; // the byte that the string ends in, and one
    uint8_t *const last = packed + length / 8;
    last[0] = static_cast<uint8_t>((used == 0 ? 0u : last[0]) | bits >> 8);
    if (used > 1) last[1] = static_cast<uint8_t>(bits);
}

} // namespace

void PELMI_WBMPdecodeMultibyte(const uint8_t *data, int32_t dataLength, int32_t *position, int32_t *groupCount,
                               uint8_t *packed) {
    int32_t count = 0;
    bool goes_on = true;
    while (goes_on && *position < dataLength) {
        const uint8_t byte = data[(*position)++];
        append_group(packed, int64_t{7} * count, byte);
        goes_on = byte >= 128;
        ++count;
    }
    *groupCount = count;
}

int32_t PELMI_WBMPgetMultibyte2Int(const uint8_t *packed, int32_t byteCount, int32_t groupCount) {
    uint32_t value = 0;
    for (int32_t i = 0; i < byteCount; ++i)
        value = value << 8 | packed[i];
    const int32_t divisor = PELMI_WBMPpow(2, groupCount);
    // 2^32 and above have wrapped to 0, and more than the value has been divided away.
    return divisor == 0 ? 0 : static_cast<int32_t>(value) / divisor;
}

// By squaring: modulo 2^32 the order of the multiplications does not matter.
int32_t PELMI_WBMPpow(int32_t base, int32_t exponent) {
    uint32_t power = 1;
    uint32_t square = static_cast<uint32_t>(base);
    for (int32_t rest = exponent; rest > 0; rest /= 2) {
        if (rest % 2 != 0) power *= square;
        square *= square;
    }
    return static_cast<int32_t>(power);
}

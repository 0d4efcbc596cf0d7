#include "png/inflate/bits.h"

uint32_t __PELMI_PngReadBits(const uint8_t *bytes, uint32_t *bytePosition, uint32_t *bitsLeftInByte, uint32_t n) {
    const uint8_t *const at = bytes + *bytePosition;
    const uint32_t window =
        static_cast<uint32_t>(at[0]) | static_cast<uint32_t>(at[1]) << 8 | static_cast<uint32_t>(at[2]) << 16;
    const uint32_t mask = n >= 32 ? ~0u : (1u << n) - 1;
    const uint32_t value = window >> (8 - *bitsLeftInByte) & mask;

    const uint32_t odd = n & 7;
    if (*bitsLeftInByte <= odd) {
        *bitsLeftInByte += 8 - odd;
        ++*bytePosition;
    } else {
        *bitsLeftInByte -= odd;
    }
    *bytePosition += n / 8;
    return value;
}

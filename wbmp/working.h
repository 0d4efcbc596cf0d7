// The exported helpers of the WBMP decoder: the multi-byte integers of its header. They hold seven bits a byte, the
// most significant ones first; bit 7 is set in every byte but the last.
#pragma once

#include "frame/export.h"

// Reads one integer from data[*position] on: up to and with the first byte below 128, or to the end of the data. The
// seven bits of each byte are appended to the bit string `packed`, which begins with the first of them in its highest
// bit; the last byte's unused bits are 0. `packed` has room for 7 bits of every byte that may be read.
// *position moves behind the integer; *groupCount is the number of bytes read, 0 where the data ended before.
PELM_EXPORT void PELMI_WBMPdecodeMultibyte(const uint8_t *data, int32_t dataLength, int32_t *position,
                                           int32_t *groupCount, uint8_t *packed);

// The value of the bit string: its first `byteCount` bytes as one big-endian number of 32 bits, of which the highest is
// the sign, divided by 2 to the power `groupCount`, which drops the unused bits when byteCount is groupCount. Integers
// of up to four bytes come out right below 2^27, and negative from there on. Of more than four bytes the last four
// count.
PELM_EXPORT int32_t PELMI_WBMPgetMultibyte2Int(const uint8_t *packed, int32_t byteCount, int32_t groupCount);

// base to the power exponent, modulo 2^32; 1 when the exponent is below 1.
PELM_EXPORT int32_t PELMI_WBMPpow(int32_t base, int32_t exponent);

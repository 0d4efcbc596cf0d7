// The first 54 bytes of a BMP: which variants are accepted, and what they say of the image.
#pragma once

#include "frame/host.h"

namespace pelm {

constexpr int32_t bmp_header_bytes = 54;

enum : uint32_t { plain_rows = 0, rle8 = 1, rle4 = 2, bit_fields = 3, jpeg = 4, png = 5 };

// Which calls read the header. Those in two steps, for graphics libraries, refuse other things, do not mind reads that
// bring less than asked for, and know run-length codes.
enum class Calls : uint8_t { direct, two_step };

// How a step of the set-up ended. `abandoned`: the decode is refused like `refused`, but what has been allocated stays.
enum class SetUp : uint8_t { done, refused, abandoned };

struct BmpHeader {
    int32_t width;  // above 0
    int32_t height; // absolute
    bool top_down;
    uint16_t bits_per_pixel;
    uint32_t compression;
    uint32_t pixel_data_offset;
};

// Bytes of a stored row: whole bytes, padded to a multiple of 4. width x bits fits int32.
constexpr int32_t row_stride(int32_t width, int32_t bits_per_pixel) {
    return static_cast<int32_t>(((static_cast<int64_t>(width) * bits_per_pixel + 7) / 8 + 3) & ~int64_t{3});
}

// The same without the padding.
constexpr int32_t row_bytes(int32_t width, int32_t bits_per_pixel) {
    return static_cast<int32_t>((static_cast<int64_t>(width) * bits_per_pixel + 7) / 8);
}

bool is_bmp(const uint8_t (&bytes)[bmp_header_bytes]);

// Bytes that do not arrive are zeros, whatever the host has left there. What the host says of their number.
int32_t read_or_zeros(InputSource &input, uint8_t *bytes, int32_t count);

SetUp read_header(InputSource &input, uint8_t (&bytes)[bmp_header_bytes]);

// What the bytes say, and whether such images are decoded.
SetUp parse_header(const uint8_t (&bytes)[bmp_header_bytes], BmpHeader &header);

// The same for the calls in two steps. False: refused.
// Required: every header is taken for one of 40 bytes (docs/oddities.md, "Headers in two steps").
bool parse_parked_header(const uint8_t (&bytes)[bmp_header_bytes], BmpHeader &header);

// The fields of a header of 40 bytes, sound or not. False when the height has no absolute value.
bool parse_info_fields(const uint8_t (&bytes)[bmp_header_bytes], BmpHeader &header);

} // namespace pelm

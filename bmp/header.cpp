#include "bmp/header.h"

#include <cstdlib>
#include <limits>

#include "frame/bytes.h"
#include "frame/sizes.h"

namespace pelm {
namespace {

enum : uint32_t { plain_rows = 0, rle8 = 1, rle4 = 2, bit_fields = 3, jpeg = 4, png = 5 };

// The header of 12 bytes: unsigned 16-bit sizes.
// Required: its compression is read behind it, from the bytes that hold one in the longer headers (docs/oddities.md,
// "Core headers").
void parse_core_header(const uint8_t *bytes, BmpHeader &header, int64_t &height) {
    header.width = read_u16le(bytes + 18);
    height = read_u16le(bytes + 20);
    header.bits_per_pixel = read_u16le(bytes + 24);
    header.compression = read_u16le(bytes + 26);
}

void parse_info_header(const uint8_t *bytes, BmpHeader &header, int64_t &height) {
    header.width = read_i32le(bytes + 18);
    height = read_i32le(bytes + 22);
    header.bits_per_pixel = read_u16le(bytes + 28);
    header.compression = read_u32le(bytes + 30);
}

bool size_is_sound(const BmpHeader &header) {
    if (header.width <= 0) return false;
    if (!fits_int32(static_cast<int64_t>(header.width) * header.bits_per_pixel)) return false;
    const int64_t stride = row_stride(header.width, header.bits_per_pixel);
    return stride > 0 && fits_int32(stride * header.height);
}

bool compression_is_accepted(const BmpHeader &header) {
    switch (header.compression) {
    case plain_rows: return true;
    case rle8:
    case rle4:
    case jpeg:
    case png: return false;
    case bit_fields: return header.bits_per_pixel == 16;
    default: return header.bits_per_pixel != 16; // nothing says where a 16-bit pixel's colours are
    }
}

} // namespace

SetUp read_header(InputSource &input, uint8_t (&bytes)[bmp_header_bytes]) {
    switch (input.kind) {
    case PELM_SOURCE_MEMORY:
        if (input.data == nullptr || input.size < bmp_header_bytes) return SetUp::refused;
        ZOTARPELM_OsMemcpy(bytes, input.data, bmp_header_bytes);
        return SetUp::done;
    case PELM_SOURCE_STREAM:
    case PELM_SOURCE_STREAM_ALT:
    case PELM_SOURCE_SEQUENTIAL:
        // Required: a short header leaves the record allocated (docs/oddities.md, "Refusals that leak").
        return ZOTARPELM_Read_IO(&input, bytes, bmp_header_bytes) < bmp_header_bytes ? SetUp::abandoned : SetUp::done;
    default: return SetUp::refused;
    }
}

SetUp parse_header(const uint8_t (&bytes)[bmp_header_bytes], BmpHeader &header) {
    if (bytes[0] != 'B' || bytes[1] != 'M') return SetUp::refused;
    header.pixel_data_offset = read_u32le(bytes + 10);

    // Required: only the low byte of the header's size counts, so that 296 is taken for 40, and a size that is not
    // supported leaves the record allocated (docs/oddities.md, "Header sizes", "Refusals that leak").
    const uint8_t header_size = bytes[14];
    int64_t height = 0;
    if (header_size == 12)
        parse_core_header(bytes, header, height);
    else if (header_size == 40 || (header_size >= 56 && header_size <= 64))
        parse_info_header(bytes, header, height);
    else
        return SetUp::abandoned;

    header.top_down = height < 0;
    height = std::abs(height);
    if (!fits_int32(height)) return SetUp::refused;
    header.height = static_cast<int32_t>(height);
    return size_is_sound(header) && compression_is_accepted(header) ? SetUp::done : SetUp::refused;
}

} // namespace pelm

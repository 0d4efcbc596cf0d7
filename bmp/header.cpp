#include "bmp/header.h"

#include <cstdlib>

#include "frame/bytes.h"
#include "frame/sizes.h"

namespace pelm {
namespace {

// A height is negative for top-down rows. False when it has no absolute value.
bool set_height(BmpHeader &header, int64_t stored) {
    header.top_down = stored < 0;
    const int64_t height = std::abs(stored);
    if (!fits_int32(height)) return false;
    header.height = static_cast<int32_t>(height);
    return true;
}

// The header of 12 bytes: unsigned 16-bit sizes.
// Required: its compression is read behind it, from the bytes that hold one in the longer headers (docs/oddities.md,
// "Core headers").
bool parse_core_fields(const uint8_t *bytes, BmpHeader &header) {
    header.width = read_u16le(bytes + 18);
    header.bits_per_pixel = read_u16le(bytes + 24);
    header.compression = read_u16le(bytes + 26);
    return set_height(header, read_u16le(bytes + 20));
}

bool size_is_sound(const BmpHeader &header) {
    if (header.width <= 0) return false;
    if (!fits_int32(static_cast<int64_t>(header.width) * header.bits_per_pixel)) return false;
    const int64_t stride = row_stride(header.width, header.bits_per_pixel);
    return stride > 0 && fits_int32(stride * header.height);
}

// A 16-bit pixel's colours are known only of plain rows and bit fields.
bool compression_is_accepted(const BmpHeader &header, Calls calls) {
    switch (header.compression) {
    case plain_rows: return true;
    case rle8:
    case rle4: return calls == Calls::two_step && header.bits_per_pixel != 16;
    case jpeg:
    case png: return false;
    case bit_fields: return header.bits_per_pixel == 16;
    default: return header.bits_per_pixel != 16;
    }
}

bool is_decoded(const BmpHeader &header, Calls calls) {
    return size_is_sound(header) && compression_is_accepted(header, calls);
}

} // namespace

bool is_bmp(const uint8_t (&bytes)[bmp_header_bytes]) {
    return bytes[0] == 'B' && bytes[1] == 'M';
}

bool parse_info_fields(const uint8_t (&bytes)[bmp_header_bytes], BmpHeader &header) {
    header.width = read_i32le(bytes + 18);
    header.bits_per_pixel = read_u16le(bytes + 28);
    header.compression = read_u32le(bytes + 30);
    return set_height(header, read_i32le(bytes + 22));
}

int32_t read_or_zeros(InputSource &input, uint8_t *bytes, int32_t count) {
    const int32_t got = ZOTARPELM_Read_IO(&input, bytes, count);
    for (int32_t i = got < 0 ? 0 : got; i < count; ++i)
        bytes[i] = 0;
    return got;
}

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
    if (!is_bmp(bytes)) return SetUp::refused;
    header.pixel_data_offset = read_u32le(bytes + 10);

    // Required: only the low byte of the header's size counts, so that 296 is taken for 40, and a size that is not
    // supported leaves the record allocated (docs/oddities.md, "Header sizes", "Refusals that leak").
    const uint8_t header_size = bytes[14];
    bool measured = false;
    if (header_size == 12)
        measured = parse_core_fields(bytes, header);
    else if (header_size == 40 || (header_size >= 56 && header_size <= 64))
        measured = parse_info_fields(bytes, header);
    else
        return SetUp::abandoned;
    return measured && is_decoded(header, Calls::direct) ? SetUp::done : SetUp::refused;
}

bool parse_parked_header(const uint8_t (&bytes)[bmp_header_bytes], BmpHeader &header) {
    header.pixel_data_offset = read_u32le(bytes + 10);
    return parse_info_fields(bytes, header) && is_decoded(header, Calls::two_step);
}

} // namespace pelm

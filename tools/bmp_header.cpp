#include "tools/bmp_header.h"

#include <algorithm>
#include <cstdlib>

namespace pelm_tool {
namespace {

int64_t bytes_before_rows(const BmpHeader &header) {
    if (has_palette(header)) return bmp_headers_size + 4 * palette_entries(header);
    return bmp_headers_size + (has_masks(header) ? 12 : 0);
}

} // namespace

// The decoder goes by the low byte of the size and reads a compression even behind a 12-byte header. In two steps it
// takes every header for one of 40 bytes.
BmpHeader parse_bmp(Bytes head, Calls calls) {
    BmpHeader header = {};
    header.is_two_step = calls == Calls::in_two_steps;
    header.pixel_offset = read_le32(head, 10);
    header.header_size = read_le32(head, 14);
    if (is_core(header) && !header.is_two_step) {
        header.width = read_le16(head, 18);
        header.height = read_le16(head, 20);
        header.bits = read_le16(head, 24);
        header.compression = read_le16(head, 26);
    } else {
        header.width = static_cast<int32_t>(read_le32(head, 18));
        header.height = static_cast<int32_t>(read_le32(head, 22));
        header.bits = read_le16(head, 28);
        header.compression = read_le32(head, 30);
    }
    header.top_down = header.height < 0;
    header.height = std::abs(header.height);
    for (size_t i = 0; i < 3; ++i)
        header.masks[i] = read_le32(head, bmp_headers_size + 4 * i);
    header.bytes_before = bytes_before_rows(header);
    return header;
}

int64_t stride_of(const BmpHeader &header) {
    return (header.width * header.bits + 31) / 32 * 4;
}

bool is_core(const BmpHeader &header) {
    return (header.header_size & 0xFF) == 12;
}

bool has_palette(const BmpHeader &header) {
    return header.bits == 1 || header.bits == 4 || header.bits == 8;
}

bool has_masks(const BmpHeader &header) {
    return header.bits == 16 && header.compression == bit_fields;
}

bool states_run_length_codes(const BmpHeader &header) {
    return header.compression == rle8 || header.compression == rle4;
}

bool has_run_length_codes(const BmpHeader &header) {
    if (!header.is_two_step) return false;
    return (header.compression == rle8 && header.bits == 8) || (header.compression == rle4 && header.bits == 4);
}

// Taken from the place of the pixels, not from the header's count of colours, and as a signed 16-bit number. Only in
// one step there is a default.
int64_t palette_entries(const BmpHeader &header) {
    const uint32_t room = header.pixel_offset - static_cast<uint32_t>(bmp_headers_size);
    if (header.is_two_step) return static_cast<int16_t>(static_cast<int32_t>(room) / 4);
    return header.pixel_offset <= bmp_headers_size ? 13 : static_cast<int16_t>(room >> 2);
}

int64_t whole_rows(const BmpHeader &header, const FileFacts &file, int64_t rows_at) {
    return std::max<int64_t>(0, file.size - rows_at) / stride_of(header);
}

} // namespace pelm_tool

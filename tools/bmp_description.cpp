#include "tools/bmp_description.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <limits>

#include "PelmImageDecoder.h"

namespace pelm_tool {
namespace {

constexpr int64_t headers_size = 54; // what the decoder reads before palette or masks, for every header
constexpr int64_t largest_size = std::numeric_limits<int32_t>::max();

enum : uint32_t { uncompressed = 0, rle8 = 1, rle4 = 2, bit_fields = 3, jpeg = 4, png = 5 };

struct BmpHeader {
    uint32_t header_size;
    int64_t width;
    int64_t height; // absolute
    bool top_down;
    uint32_t bits;
    uint32_t compression;
    uint32_t pixel_offset;
    uint32_t masks[3]; // meaningful with bit fields
};

bool is_core(const BmpHeader &header) {
    return (header.header_size & 0xFF) == 12;
}

// The decoder goes by the low byte of the size and reads a compression even behind a 12-byte header.
BmpHeader parse_bmp(Bytes head) {
    BmpHeader header = {};
    header.pixel_offset = read_le32(head, 10);
    header.header_size = read_le32(head, 14);
    if (is_core(header)) {
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
        header.masks[i] = read_le32(head, headers_size + 4 * i);
    return header;
}

int64_t stride_of(const BmpHeader &header) {
    return (header.width * header.bits + 31) / 32 * 4;
}

bool has_palette(const BmpHeader &header) {
    return header.bits == 1 || header.bits == 4 || header.bits == 8;
}

bool has_masks(const BmpHeader &header) {
    return header.bits == 16 && header.compression == bit_fields;
}

// Taken from the place of the pixels, not from the header's count of colours, and as a signed 16-bit number.
int64_t palette_entries(const BmpHeader &header) {
    if (header.pixel_offset <= headers_size) return 13;
    return static_cast<int16_t>(static_cast<uint16_t>((header.pixel_offset - headers_size) >> 2));
}

// What the decoder has read of a stream before it asks for rows.
int64_t bytes_before_rows(const BmpHeader &header) {
    if (has_palette(header)) return headers_size + 4 * palette_entries(header);
    return headers_size + (has_masks(header) ? 12 : 0);
}

bool is_sequential(const FileFacts &file) {
    return file.source_kind == PELM_SOURCE_SEQUENTIAL;
}

int64_t rows_at(const BmpHeader &header, const FileFacts &file) {
    return is_sequential(file) ? bytes_before_rows(header) : header.pixel_offset;
}

std::string size_words(const BmpHeader &header) {
    return std::to_string(header.width) + "x" + std::to_string(header.height);
}

std::string depth_words(const BmpHeader &header) {
    return std::to_string(header.bits) + (header.bits == 1 ? " bit" : " bits") + " per pixel";
}

std::string mask_words(const BmpHeader &header) {
    char words[48];
    std::snprintf(words, sizeof words, "%04X %04X %04X", header.masks[0], header.masks[1], header.masks[2]);
    return words;
}

std::string compression_words(const BmpHeader &header) {
    switch (header.compression) {
    case uncompressed: return "uncompressed";
    case rle8: return "RLE8 compression";
    case rle4: return "RLE4 compression";
    case bit_fields: return has_masks(header) ? "bit fields " + mask_words(header) : "bit fields";
    case jpeg: return "JPEG compression";
    case png: return "PNG compression";
    default: return "compression " + std::to_string(header.compression);
    }
}

std::string variant_words(const BmpHeader &header) {
    return size_words(header) + ", " + depth_words(header) + ", BMP with a " + std::to_string(header.header_size) +
           "-byte header, " + (header.top_down ? "top-down, " : "bottom-up, ") + compression_words(header);
}

bool header_size_is_accepted(const BmpHeader &header) {
    const uint32_t size = header.header_size & 0xFF;
    return size == 12 || size == 40 || (size >= 56 && size <= 64);
}

bool depth_is_accepted(const BmpHeader &header) {
    return has_palette(header) || header.bits == 16 || header.bits == 24 || header.bits == 32;
}

bool masks_are_accepted(const BmpHeader &header) {
    static constexpr uint32_t accepted[][3] = {
        {0xF800, 0x07E0, 0x001F}, {0x7C00, 0x03E0, 0x001F}, {0x0F00, 0x00F0, 0x000F}};
    return std::any_of(std::begin(accepted), std::end(accepted), [&](const uint32_t(&masks)[3]) {
        return std::equal(std::begin(masks), std::end(masks), std::begin(header.masks));
    });
}

std::string why_size_is_refused(const BmpHeader &header) {
    if (header.width <= 0) return "a width of " + std::to_string(header.width) + " pixels is not supported";
    if (header.height == 0) return "a height of 0 pixels leaves nothing to decode";
    const bool row_fits = header.height <= largest_size && header.width * header.bits <= largest_size;
    if (row_fits && stride_of(header) * header.height <= largest_size) return {};
    return size_words(header) + " pixels are too many";
}

std::string why_compression_is_refused(const BmpHeader &header) {
    const std::string at_this_depth = " at " + depth_words(header) + " is not supported";
    switch (header.compression) {
    case uncompressed: return {};
    case rle8:
    case rle4:
    case jpeg:
    case png: return compression_words(header) + " is not supported";
    case bit_fields: return header.bits == 16 ? "" : "bit fields at " + depth_words(header) + " are not supported";
    default: return header.bits == 16 ? compression_words(header) + at_this_depth : "";
    }
}

std::string why_palette_is_refused(const BmpHeader &header, const FileFacts &file) {
    if (palette_entries(header) < 0) return "the pixels lie too far behind the header for a palette between them";
    // From memory, colours that are not there are black.
    const bool must_be_whole = file.source_kind != PELM_SOURCE_MEMORY;
    if (must_be_whole && file.size < bytes_before_rows(header)) return "the file ends inside the palette";
    return {};
}

std::string why_masks_are_refused(const BmpHeader &header, const FileFacts &file) {
    if (file.size < bytes_before_rows(header)) return "the file ends inside the colour masks";
    if (!masks_are_accepted(header)) return "the colour masks " + mask_words(header) + " are not supported";
    return {};
}

std::string why_colours_are_refused(const BmpHeader &header, const FileFacts &file) {
    if (has_palette(header)) return why_palette_is_refused(header, file);
    if (has_masks(header)) return why_masks_are_refused(header, file);
    return {};
}

// The first reason in the order in which the decoder looks.
std::string why_refused(const BmpHeader &header, const FileFacts &file) {
    if (!header_size_is_accepted(header)) {
        return "BMP header of " + std::to_string(header.header_size) + " bytes is not supported";
    }
    std::string why = why_size_is_refused(header);
    if (why.empty()) why = why_compression_is_refused(header);
    if (why.empty() && !depth_is_accepted(header)) why = depth_words(header) + " are not supported";
    if (why.empty()) why = why_colours_are_refused(header, file);
    return why;
}

std::string shortage_of(const BmpHeader &header, const FileFacts &file) {
    const int64_t rows = std::max<int64_t>(0, file.size - rows_at(header, file)) / stride_of(header);
    if (rows >= header.height) return {};
    return "the file ends after " + std::to_string(rows) + " of " + std::to_string(header.height) + " rows";
}

std::vector<std::string> notes_on(const BmpHeader &header, const FileFacts &file) {
    std::vector<std::string> notes;
    if (is_core(header) && has_palette(header)) {
        notes.push_back("the palette behind a 12-byte header is read from the wrong place");
    }
    if (is_sequential(file) && header.pixel_offset != bytes_before_rows(header)) {
        notes.push_back("from a pipe the rows are read at byte " + std::to_string(bytes_before_rows(header)) +
                        " instead of " + std::to_string(header.pixel_offset) + "; use --source memory");
    }
    if (is_sequential(file) && header.top_down) {
        notes.push_back("from a pipe the rows of a top-down file are written upwards; use --source memory");
    }
    return notes;
}

} // namespace

ImageDescription describe_bmp(Bytes head, const FileFacts &file) {
    ImageDescription description;
    if (static_cast<int64_t>(head.size()) < headers_size) {
        description.words = "BMP";
        description.refusal = "the file ends inside the header (" + std::to_string(head.size()) + " bytes of 54)";
        return description;
    }
    const BmpHeader header = parse_bmp(head);
    description.words = variant_words(header);
    description.refusal = why_refused(header, file);
    if (!description.refusal.empty()) return description;
    description.width = static_cast<int32_t>(header.width);
    description.height = static_cast<int32_t>(header.height);
    description.shortage = shortage_of(header, file);
    description.notes = notes_on(header, file);
    return description;
}

} // namespace pelm_tool

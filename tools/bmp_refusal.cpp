#include "tools/bmp_refusal.h"

#include <algorithm>
#include <cstdio>
#include <limits>

#include "PelmImageDecoder.h"
#include "tools/blank_picture.h"

namespace pelm_tool {
namespace {

constexpr int64_t largest_size = std::numeric_limits<int32_t>::max();

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
    return size_words(header.width, header.height) + " pixels are too many";
}

std::string why_compression_is_refused(const BmpHeader &header) {
    const std::string at_this_depth = " at " + bmp_depth_words(header) + " is not supported";
    switch (header.compression) {
    case uncompressed: return {};
    case rle8:
    case rle4:
        if (!header.is_two_step) return bmp_compression_words(header) + " is not supported";
        return header.bits == 16 ? bmp_compression_words(header) + at_this_depth : "";
    case jpeg:
    case png: return bmp_compression_words(header) + " is not supported";
    case bit_fields: return header.bits == 16 ? "" : "bit fields at " + bmp_depth_words(header) + " are not supported";
    default: return header.bits == 16 ? bmp_compression_words(header) + at_this_depth : "";
    }
}

std::string why_palette_is_refused(const BmpHeader &header, const FileFacts &file) {
    if (palette_entries(header) < 0) {
        return header.pixel_offset < bmp_headers_size
                   ? "the pixels begin inside the header, where there is no place for a palette"
                   : "the pixels lie too far behind the header for a palette between them";
    }
    // From memory and in two steps, colours that are not there are black.
    const bool must_be_whole = !header.is_two_step && file.source_kind != PELM_SOURCE_MEMORY;
    if (must_be_whole && file.size < header.bytes_before) return "the file ends inside the palette";
    return {};
}

// In two steps, masks that are not there are zeros.
std::string why_masks_are_refused(const BmpHeader &header, const FileFacts &file) {
    if (!header.is_two_step && file.size < header.bytes_before) return "the file ends inside the colour masks";
    if (!masks_are_accepted(header)) return "the colour masks " + bmp_mask_words(header) + " are not supported";
    return {};
}

std::string why_colours_are_refused(const BmpHeader &header, const FileFacts &file) {
    if (has_palette(header)) return why_palette_is_refused(header, file);
    if (has_masks(header)) return why_masks_are_refused(header, file);
    return {};
}

// In two steps only a file with all its rows is begun.
std::string why_rows_are_refused(const BmpHeader &header, const FileFacts &file) {
    if (!header.is_two_step || header.compression != uncompressed) return {};
    const int64_t rows = whole_rows(header, file, header.pixel_offset);
    if (rows >= header.height) return {};
    return "the file ends after " + std::to_string(rows) + " of " + std::to_string(header.height) +
           " rows, and --mode skia takes only whole files";
}

std::string why_header_size_is_refused(const BmpHeader &header) {
    if (header.is_two_step || header_size_is_accepted(header)) return {};
    return "BMP header of " + std::to_string(header.header_size) + " bytes is not supported";
}

} // namespace

std::string why_bmp_is_refused(const BmpHeader &header, const FileFacts &file) {
    std::string why = why_header_size_is_refused(header);
    if (why.empty()) why = why_size_is_refused(header);
    if (why.empty()) why = why_compression_is_refused(header);
    if (why.empty() && !depth_is_accepted(header)) why = bmp_depth_words(header) + " are not supported";
    if (why.empty()) why = why_rows_are_refused(header, file);
    if (why.empty()) why = why_colours_are_refused(header, file);
    return why;
}

bool may_fit_two_steps(const BmpHeader &header) {
    if (header.is_two_step || header.header_size < plain_header_size) return false;
    return !header_size_is_accepted(header) || states_run_length_codes(header);
}

std::string bmp_depth_words(const BmpHeader &header) {
    return std::to_string(header.bits) + (header.bits == 1 ? " bit" : " bits") + " per pixel";
}

std::string bmp_mask_words(const BmpHeader &header) {
    char words[48];
    std::snprintf(words, sizeof words, "%04X %04X %04X", header.masks[0], header.masks[1], header.masks[2]);
    return words;
}

std::string bmp_compression_words(const BmpHeader &header) {
    switch (header.compression) {
    case uncompressed: return "uncompressed";
    case rle8: return "RLE8 compression";
    case rle4: return "RLE4 compression";
    case bit_fields: return has_masks(header) ? "bit fields " + bmp_mask_words(header) : "bit fields";
    case jpeg: return "JPEG compression";
    case png: return "PNG compression";
    default: return "compression " + std::to_string(header.compression);
    }
}

} // namespace pelm_tool

// The header of a BMP as the decoder reads it, and what follows from it for the rest of the file.
#pragma once

#include <cstdint>

#include "tools/bytes.h"
#include "tools/image_description.h"
#include "tools/options.h"

namespace pelm_tool {

constexpr int64_t bmp_headers_size = 54; // what the decoder reads before palette or masks, for every header

constexpr uint32_t plain_header_size = 40; // of the one that most files have

enum : uint32_t { uncompressed = 0, rle8 = 1, rle4 = 2, bit_fields = 3, jpeg = 4, png = 5 };

struct BmpHeader {
    uint32_t header_size;
    int64_t width;
    int64_t height; // absolute
    bool top_down;
    uint32_t bits;
    uint32_t compression;
    uint32_t pixel_offset;
    uint32_t masks[3];    // meaningful with bit fields
    bool is_two_step;     // read by the calls in two steps, which have rules of their own
    int64_t bytes_before; // what the decoder has read of a stream before it asks for rows
};

// Bytes that are not there are zeros.
BmpHeader parse_bmp(Bytes head, Calls calls);

int64_t stride_of(const BmpHeader &header); // bytes
bool is_core(const BmpHeader &header);
bool has_palette(const BmpHeader &header);
bool has_masks(const BmpHeader &header);
bool states_run_length_codes(const BmpHeader &header);
bool has_run_length_codes(const BmpHeader &header); // and the decoder takes them for such
int64_t palette_entries(const BmpHeader &header);   // as the decoder counts them; negative: refused
int64_t whole_rows(const BmpHeader &header, const FileFacts &file, int64_t rows_at);

} // namespace pelm_tool

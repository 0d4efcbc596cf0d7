// Describes a PNG file, right or wrong, and writes its bytes. What a decoder makes of it is not known here.
//
//     Png png{.width = 4, .height = 3, .colour_type = 2, .depth = 8};
//     png.rows = noise_rows(png, 1);
//     png.filters = {4};             // all rows; a longer list is gone through again and again
//     png.idat_sizes = {1, 0, 5};    // then one chunk with the rest
//     const Bytes file = build(png);
//
// Anything else: take chunks_of(png), change the list, and write it with file_of(chunks).
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "tests/png/support/deflate_builder.h"

namespace pelm::test {

struct Chunk {
    std::string type;
    Bytes data;
    std::optional<uint32_t> length = {}; // as written; default: of the data
    std::optional<uint32_t> crc = {};    // as written; default: the right one
};

struct Png {
    uint32_t width = 1;
    uint32_t height = 1;
    uint8_t colour_type = 0;
    uint8_t depth = 8;
    uint8_t interlace = 0; // 1: the rows are cut into the seven passes
    uint8_t compression_method = 0;
    uint8_t filter_method = 0;

    std::vector<Bytes> rows = {};       // of the image, packed, before filtering; missing ones are zeros
    std::vector<uint8_t> filters = {0}; // one per row (per pass anew), cyclic. 5 and above: the row as it is

    std::optional<Bytes> plte = {}; // RGB triplets
    std::optional<Bytes> trns = {};

    std::vector<Chunk> before_plte = {};
    std::vector<Chunk> before_idat = {};
    std::vector<Chunk> after_idat = {};
    bool has_iend = true;

    std::optional<Bytes> scanlines = {}; // what is compressed; default: filter bytes and filtered rows
    std::optional<Bytes> stream = {};    // the zlib stream; default: `scanlines` compressed
    int level = 6;                       // of that; 0 stores

    // Sizes of the first IDAT chunks; one more takes the rest, if there is any. 0 writes an empty chunk.
    std::vector<size_t> idat_sizes = {};
    // All IDAT chunks of this size instead (the last may be smaller); 0: not.
    size_t idat_size = 0;
};

uint32_t channels_of(const Png &png);
uint32_t bits_per_pixel(const Png &png);
uint32_t filter_distance(const Png &png);     // bytes
size_t row_bytes(const Png &png);             // of a whole row, without filter byte
size_t row_bytes(const Png &png, uint32_t w); // of `w` pixels

// Rows of any bits; the unused ones of a row's last byte too.
std::vector<Bytes> noise_rows(const Png &png, uint32_t seed);
// Rows of smooth content, which compress with matches.
std::vector<Bytes> smooth_rows(const Png &png);
// One row of samples (16-bit ones too), channels side by side. The bits behind the last sample are 0.
Bytes pack_samples(const std::vector<uint32_t> &samples, uint32_t depth);

// Filter byte and filtered row; `above` is the raw row above, or zeros.
Bytes filtered_row(uint8_t filter, const Bytes &row, const Bytes &above, uint32_t distance);

// The first pixels, steps and sizes of the seven passes of interlaced images (PNG specification, 8.2).
struct Pass {
    uint32_t x_start, y_start, x_step, y_step, width, height;
};
std::vector<Pass> passes_of(const Png &png); // those without pixels too
std::vector<Bytes> rows_of_pass(const Png &png, const Pass &pass);

Bytes scanlines_of(const Png &png);
Bytes stream_of(const Png &png);
std::vector<Chunk> idat_chunks(const Bytes &stream, const std::vector<size_t> &sizes);
Chunk ihdr_chunk(const Png &png);
std::vector<Chunk> chunks_of(const Png &png);
Bytes build(const Png &png);

// Signature and chunks.
Bytes file_of(const std::vector<Chunk> &chunks);
Bytes bytes_of(const Chunk &chunk);
inline constexpr uint8_t png_signature[8] = {0x89, 'P', 'N', 'G', 0x0D, 0x0A, 0x1A, 0x0A};

uint32_t crc32_of(const Bytes &bytes);
uint32_t read_u32be(const uint8_t *bytes);

} // namespace pelm::test

// What decodes of interlaced pictures leave behind, computed from a plain map of the passes, and the files that are
// decoded.
#pragma once

#include "tests/png/decode/decoding.h"

namespace pelm::test {

// The pass of every pixel of an 8 x 8 square, as the PNG specification draws it.
uint32_t pass_of(uint32_t x, uint32_t y);

// One row of a pass, in the order of the stream.
struct PassRow {
    uint32_t pass;
    uint32_t y; // in the image
    std::vector<uint32_t> columns;
    size_t bytes; // with the filter byte
};

std::vector<PassRow> pass_rows_of(const Picture &picture);

// What the pass rows from `first` to before `end` write when they arrive.
void draw_pass_rows(const Picture &picture, const Request &request, size_t first, size_t end, Bytes &bytes);
// What the frame writes when the image is complete; nothing for requests without a frame, or at the image's own size.
void draw_frame(const Picture &picture, const Request &request, Bytes &bytes);
// The whole image.
void draw_interlaced(const Picture &picture, const Request &request, Bytes &bytes);

// The image from a fresh background.
Bytes expected_bytes(const Picture &picture, const Request &request);
// The same after the first pass rows of an image that is not yet complete.
Bytes expected_after(const Picture &picture, const Request &request, size_t pass_rows);

Png interlaced_png_of(const Picture &picture);
Bytes interlaced_file_of(const Picture &picture);
// Deflate blocks of at least `block_size` bytes of scanlines each.
Bytes interlaced_file_of_blocks(const Picture &picture, Blocks blocks, size_t block_size);

// Scanlines of the picture, cut into its pass rows.
std::vector<Bytes> scanlines_by_pass_row(const Picture &picture);
std::vector<Bytes> scanlines_by_pass(const Picture &picture);
// A zlib stream of one block per part.
Bytes stream_of_parts(const std::vector<Bytes> &parts, Blocks blocks);
Bytes interlaced_file_of_parts(const Picture &picture, const std::vector<Bytes> &parts, Blocks blocks);

// Decodes by one call (or by iterative or line calls of 0 rows) and compares with the model. Empty when equal.
std::string interlaced_difference(const Picture &picture, const Bytes &file, uint32_t kind, const Request &request,
                                  Call call = Call::one_shot, size_t bytes_behind = 0);

// The same for noise of every layout in every format, smaller than the picture, with and without transparency. The
// first difference found; empty when there is none.
std::string reduced_noise_difference(uint32_t flags);

// Noise, with a tRNS chunk where the colour type can have one.
Picture interlaced_noise(Layout layout, bool transparent, uint32_t width, uint32_t height, uint32_t seed = 1);

} // namespace pelm::test

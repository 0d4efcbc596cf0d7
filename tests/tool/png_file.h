// PNG files chunk by chunk, right ones and wrong ones.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace pelm::test {

struct PngPart {
    std::string type;
    std::vector<uint8_t> data;
};

struct PngHeader {
    uint32_t width = 4;
    uint32_t height = 4;
    uint8_t depth = 8;
    uint8_t colour_type = 2;
    uint8_t compression = 0;
    uint8_t filter = 0;
    uint8_t interlace = 0;
};

PngPart header_part(const PngHeader &header);
PngPart data_part(const std::vector<uint8_t> &rows); // filter bytes and samples, compressed
PngPart end_part();

// With lengths, checksums and the signature.
std::vector<uint8_t> png_bytes(const std::vector<PngPart> &parts);

// Where part number `index` begins.
size_t position_of(const std::vector<PngPart> &parts, size_t index);

std::vector<uint8_t> zlib_bytes(const std::vector<uint8_t> &data);
// One block that is not the last, as it is.
std::vector<uint8_t> stored_block(const std::vector<uint8_t> &data);

// Rows of noise without filters; `row_bytes` is without the filter byte.
std::vector<uint8_t> noise_rows(size_t row_bytes, size_t rows);

} // namespace pelm::test

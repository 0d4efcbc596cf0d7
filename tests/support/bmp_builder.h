// Describes a BMP file, right or wrong, and writes its bytes. What a decoder makes of it is not known here.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "tests/support/bytes.h"

namespace pelm::test {

// Pixels as stored, counted from the top left: palette indices, 16-bit values, 0xRRGGBB or 0xAARRGGBB.
using Picture = std::vector<std::vector<uint32_t>>;

struct BmpFile {
    std::array<char, 2> signature{'B', 'M'};
    uint32_t header_size = 40; // a low byte of 12 makes the fields those of a core header
    int32_t width = 1;
    int32_t height = 1; // as stored: negative for top-down
    uint16_t bits = 24;
    uint32_t compression = 0;
    uint32_t colors_used = 0;
    std::optional<uint32_t> pixel_data_offset; // in the header; the rows always follow what stands before them
    std::vector<uint32_t> masks;               // from offset 54 on
    Bytes palette;                             // from offset 54 on, behind any masks: blue, green, red, reserved
    Bytes gap;                                 // between these and the rows
    std::vector<Bytes> rows;                   // in file order, without padding
    uint8_t padding = 0xEE;

    bool top_down() const { return height < 0; }
    uint32_t rows_at() const; // where the rows really are
    uint32_t stated_offset() const { return pixel_data_offset.value_or(rows_at()); }
    int64_t stride() const;
    int64_t row_bytes() const; // without padding
};

Bytes file_bytes(const BmpFile &file);

// The bytes of one row of stored pixels; the bits behind the last pixel are set.
Bytes pack_row(const std::vector<uint32_t> &pixels, uint16_t bits);
std::vector<Bytes> pack_rows(const Picture &picture, uint16_t bits, bool top_down);

// What a stored pixel can be.
struct BmpVariant {
    const char *name;
    uint16_t bits;
    uint32_t compression;
    std::array<uint32_t, 3> masks; // red, green, blue of compression 3
};

inline constexpr BmpVariant bmp_variants[] = {
    {"one_bit", 1, 0, {}},
    {"four_bits", 4, 0, {}},
    {"eight_bits", 8, 0, {}},
    {"sixteen_bits_plain", 16, 0, {}},
    {"sixteen_bits_565", 16, 3, {0xF800, 0x07E0, 0x001F}},
    {"sixteen_bits_555", 16, 3, {0x7C00, 0x03E0, 0x001F}},
    {"sixteen_bits_444", 16, 3, {0x0F00, 0x00F0, 0x000F}},
    {"twenty_four_bits", 24, 0, {}},
    {"thirty_two_bits", 32, 0, {}},
};

const BmpVariant &variant_named(const std::string &name);

// Numbers that look random and are the same in every run.
class Noise {
public:
    explicit Noise(uint32_t seed) : state_(seed * 2654435761u + 12345u) {}
    uint32_t next();
    uint32_t below(uint32_t limit) { return next() % limit; }

private:
    uint32_t state_;
};

Picture noise_picture(int32_t width, int32_t height, uint16_t bits, uint32_t seed);
Bytes noise_palette(uint32_t entries, uint32_t seed);

// A well-formed file of noise with a full palette.
BmpFile noise_bmp(const BmpVariant &variant, int32_t width, int32_t height, bool top_down, uint32_t seed = 1);

// A header of 40 bytes whose sizes, depth and pixel offset are anything, near and beyond what can be decoded, with or
// without masks, in front of noise.
BmpFile noise_header(Noise &noise);

// A well-formed file of one stored pixel value; `palette` serves the indexed depths.
BmpFile flat_bmp(const BmpVariant &variant, int32_t width, int32_t height, uint32_t value, Bytes palette = {});

} // namespace pelm::test

// What a BMP decode, in one call or in bands, must leave behind, computed pixel by pixel on plain two-dimensional
// arrays: by formula, slowly, and sharing nothing with the library. Only the constants of the public header are used.
#pragma once

#include "tests/support/bmp_builder.h"

namespace pelm::test {

struct Rgb {
    uint8_t r, g, b;
    bool operator==(const Rgb &) const = default;
};

struct BmpRequest {
    uint32_t format = 1;
    int quarter_turns = 0; // clockwise
    uint32_t placement = 0;
    int32_t box_width = 0;
    int32_t box_height = 0;

    uint32_t flags() const { return static_cast<uint32_t>(quarter_turns) << 2 | placement; }
    bool stretches() const { return placement == 0x700; }
    bool is_exact() const { return placement == 0x100; }
};

struct ScaledSize {
    int64_t width;
    int64_t height;
    bool one_to_one;
};

// Not for a height of 0 that does not fit the box. `bw` and `bh` are measured in the image's orientation.
ScaledSize scaled_size(int32_t width, int32_t height, int32_t bw, int32_t bh, uint32_t placement);

int bytes_per_pixel(uint32_t format); // 0 for a format that BMP does not write
// How large test buffers are: as large as any pixel where nothing is written.
int buffer_bytes_per_pixel(uint32_t format);

// The bytes that a pixel becomes, as many as bytes_per_pixel says. `blue_first` exchanges red and blue in format 6.
std::array<uint8_t, 4> packed_pixel(Rgb color, uint32_t format, bool blue_first = false);

struct BmpExpectation {
    bool refused;
    size_t blocks_left; // of the library's, never freed
    ScaledSize size;
    Bytes output;         // the whole buffer
    int64_t row_pixels;   // length of a buffer row
    size_t pixels_landed; // written at least once
};

// Rows `first` .. `first` + `count` - 1 of the scaled image, the first one put where image row `at` belongs.
struct BmpBand {
    int64_t first, count, at;
};

// The bands that calls with these row counts decode: each is cut at the image's end and, except for the first, placed
// as many rows behind the one before as it was asked to have itself. Counts below 1 give none.
std::vector<BmpBand> bands_of(int64_t scaled_height, const std::vector<int32_t> &rows);

// A well-formed file, possibly cut short, as one kind of source delivers it. Sequential ones only in one band.
class BmpModel {
public:
    // `bytes` are those of `file` or a beginning of them.
    BmpModel(const BmpFile &file, const Bytes &bytes, uint32_t kind);

    BmpExpectation expect(const BmpRequest &request, uint8_t background) const;

    // The same after calls with these row counts.
    BmpExpectation expect_bands(const BmpRequest &request, const std::vector<int32_t> &rows, uint8_t background) const;

    // The buffer of one band of a line call: never turned, only stretched or not, and with nothing above it.
    Bytes expect_line(const BmpRequest &request, int64_t first, int64_t count, uint8_t background) const;

private:
    struct Walk; // where pixels go
    void set_palette(const BmpFile &file, const Bytes &bytes);
    void set_refusal(size_t size);
    Rgb pixel_at(const BmpFile &file, const Bytes &bytes, int64_t row_start, int32_t x, uint8_t &fourth) const;
    void unpack(const BmpFile &file, const Bytes &bytes);
    size_t rows_reached(bool one_to_one) const;
    int32_t row_in_file(int32_t y) const { return top_down_ ? y : height_ - 1 - y; }
    Rgb averaged(const int64_t (&columns)[2], const int64_t (&rows)[2]) const;
    ScaledSize size_for(const BmpRequest &request) const;
    bool reverses(const BmpRequest &request, const ScaledSize &size) const;
    void paint(Walk &walk, const BmpBand &band) const;
    void paint_one_to_one(Walk &walk, const BmpBand &band) const;
    void paint_scaled(Walk &walk, const BmpBand &band) const;

    uint32_t kind_;
    int32_t width_;
    int32_t height_;
    uint16_t bits_;
    bool top_down_;
    bool bit_fields_;
    int64_t size_;
    int64_t stride_;
    int64_t row_bytes_;
    int64_t rows_start_;
    int64_t palette_size_ = 0;
    bool refused_ = false;
    size_t blocks_left_ = 0;
    std::vector<Rgb> palette_;
    std::vector<std::vector<Rgb>> image_; // [y][x] from the top left
};

} // namespace pelm::test

// What a decode has to leave in the caller's buffer: geometry, conversions and the three ways of writing rows, each
// computed directly from the stored pixels.
#pragma once

#include "tests/png/decode/picture.h"

namespace pelm::test {

struct Request {
    uint32_t format = 7;
    uint32_t flags = 0; // rotation and placement
    int32_t box_width = 0;
    int32_t box_height = 0;

    uint32_t quarter_turns() const { return (flags >> 2) & 3; }
    bool exact() const { return (flags & 0x700) == 0x100; }
    std::string described() const;
};

inline bool asks_for_frame(const Request &request) {
    return (request.flags & 0x3000) == 0x1000;
}

inline constexpr uint32_t written_formats[] = {0, 1, 5, 6, 7, 8};

size_t pixel_size(uint32_t format);

Request own_size(const Picture &picture, uint32_t format = 7);

// Where the image lies, measured in pixels of the buffer.
struct Geometry {
    bool one_to_one = false;
    uint32_t width = 0; // scaled, in the image's own orientation
    uint32_t height = 0;
    int64_t stride = 0;
    int64_t left = 0;
    int64_t top = 0;
    bool empty() const { return width == 0 || height == 0; }
};

Geometry geometry_of(const Picture &picture, const Request &request);

// Pixels of the caller's buffer.
int64_t buffer_pixels(const Geometry &geometry, const Request &request);

// A buffer's bytes, of which only whole pixels inside are written.
class Canvas {
public:
    Canvas(uint32_t format, Bytes &bytes) : format_(format), bytes_(bytes) {}
    void put(int64_t index, const Pixel &pixel);

private:
    uint32_t format_;
    Bytes &bytes_;
};

// Rows of an image at its own size.
void draw_one_to_one(const Picture &picture, const Geometry &geometry, const Request &request, uint32_t first_row,
                     uint32_t end_row, Bytes &bytes);

// Scaled grey of 8 bits: which source rows are used, in order, and what is drawn of them.
struct GreyRow {
    uint32_t source_row;
    uint32_t output_row;
    uint32_t first_sample; // of the horizontal accumulator
};
std::vector<GreyRow> used_grey_rows(const Picture &picture, const Geometry &geometry);
void draw_scaled_grey(const Picture &picture, const Geometry &geometry, const Request &request, size_t first_used,
                      size_t end_used, uint32_t base, Bytes &bytes);

// All other layouts, scaled.
Pixel reduced_pixel(const Picture &picture, const Geometry &geometry, uint32_t column, uint32_t row);
// Output rows that are complete when the first `source_rows` rows have been seen.
uint32_t reduced_rows_after(const Picture &picture, const Geometry &geometry, uint32_t source_rows);
void draw_reduced(const Picture &picture, const Geometry &geometry, const Request &request, uint32_t first_row,
                  uint32_t end_row, uint32_t base, Bytes &bytes);

// A whole image, or what its first rows make.
void draw(const Picture &picture, const Request &request, Bytes &bytes);
void draw_rows(const Picture &picture, const Request &request, uint32_t source_rows, Bytes &bytes);

// Contents that no decode can be mistaken for.
Bytes background(size_t size);

// Bytes of the buffer that a request describes.
size_t buffer_size(const Picture &picture, const Request &request);

// A buffer of the image's own size, of background but for the first rows.
Bytes after_rows(const Picture &picture, uint32_t rows);

// Empty when equal; otherwise the first differing pixel with both values.
std::string difference(const Bytes &expected, const Bytes &got, const Picture &picture, const Request &request);

} // namespace pelm::test

#include "tests/wbmp/model.h"

#include <algorithm>

namespace pelm::test {

namespace {

struct Scaled {
    int64_t width, height;
    bool one_to_one;
};

Scaled scaled(int64_t w, int64_t h, const WbmpRequest &request) {
    const int64_t bw = request.box_width;
    const int64_t bh = request.box_height;
    if (request.flags == 0x700) return {bw, bh, false};
    if (w <= bw && h <= bh) return {w, h, true};
    if (w * bh < h * bw) return {bh * w / h, bh, false};
    return {bw, bw * h / w, false};
}

int64_t rounded_up_half(int64_t margin) {
    return (margin + 1) / 2;
}

// How bright the output pixel is, of 252.
int grey_at(const Picture &picture, const Scaled &to, int64_t i, int64_t j) {
    const int64_t w = static_cast<int64_t>(picture[0].size());
    const int64_t h = static_cast<int64_t>(picture.size());
    int grey = 0;
    for (const int64_t row_quarter : {h / 4, 3 * h / 4})
        for (const int64_t column_quarter : {w / 4, 3 * w / 4}) {
            const int64_t row = (row_quarter + j * h) / to.height;
            const int64_t column = (column_quarter + i * w) / to.width;
            grey += picture[static_cast<size_t>(row)][static_cast<size_t>(column)] != 0 ? 63 : 0;
        }
    return grey;
}

// The bytes of a pixel with three equal channels.
Bytes grey_pixel(int grey, uint32_t format) {
    const auto byte = static_cast<uint8_t>(grey);
    if (format == 0) {
        const int value = grey / 8 * 2048 + grey / 4 * 32 + grey / 8;
        return {static_cast<uint8_t>(value % 256), static_cast<uint8_t>(value / 256)};
    }
    return format == 1 ? Bytes{byte, byte, byte} : Bytes{byte, byte, byte, 255};
}

} // namespace

bool is_written(uint32_t format) {
    return format == 0 || format == 1 || format == 7 || format == 8;
}

int wbmp_pixel_bytes(uint32_t format) {
    return format == 0 ? 2 : format == 1 ? 3 : 4;
}

size_t output_size(const WbmpRequest &request) {
    if (request.box_width <= 0 || request.box_height <= 0) return 0;
    return static_cast<size_t>(request.box_width) * static_cast<size_t>(request.box_height) *
           static_cast<size_t>(wbmp_pixel_bytes(request.format));
}

WbmpExpectation expect_wbmp(const Picture &picture, const WbmpRequest &request, uint8_t background) {
    WbmpExpectation expected{1, false, 0, 0, Bytes(output_size(request), background)};
    if (request.box_width <= 0 || request.box_height <= 0) return expected;
    const Scaled to = scaled(static_cast<int64_t>(picture[0].size()), static_cast<int64_t>(picture.size()), request);
    if (to.width == 0 || to.height == 0) return expected;
    if (!is_written(request.format)) {
        expected.result = 0;
        return expected;
    }
    expected.is_drawn = true;
    expected.width = to.width;
    expected.height = to.height;
    const int64_t left = rounded_up_half(request.box_width - to.width);
    const int64_t top = rounded_up_half(request.box_height - to.height);
    const int size = wbmp_pixel_bytes(request.format);
    for (int64_t j = 0; j < to.height; ++j)
        for (int64_t i = 0; i < to.width; ++i) {
            const bool white = to.one_to_one && picture[static_cast<size_t>(j)][static_cast<size_t>(i)] != 0;
            const Bytes pixel = to.one_to_one ? Bytes(static_cast<size_t>(size), white ? 255 : 0)
                                              : grey_pixel(grey_at(picture, to, i, j), request.format);
            const int64_t at = ((top + j) * request.box_width + left + i) * size;
            std::copy(pixel.begin(), pixel.end(), expected.output.begin() + static_cast<ptrdiff_t>(at));
        }
    return expected;
}

std::string described(const WbmpRequest &request) {
    return "format " + std::to_string(request.format) + ", flags " + std::to_string(request.flags) + ", box " +
           std::to_string(request.box_width) + " x " + std::to_string(request.box_height);
}

} // namespace pelm::test

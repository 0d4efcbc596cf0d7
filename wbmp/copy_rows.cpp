// Pixel for pixel: a table turns each stored byte into eight pixels.
#include <cstring>

#include "wbmp/draw.h"

namespace pelm {
namespace {

// Required: white is 0xFF and black 0 in every byte, so that black is transparent in the formats with alpha
// (docs/oddities.md, "Black WBMP pixels are transparent").
template <int32_t pixel_bytes>
struct EightPixels {
    uint8_t bytes[256][8 * pixel_bytes];

    constexpr EightPixels() : bytes{} {
        for (int32_t byte = 0; byte < 256; ++byte)
            for (int32_t i = 0; i < 8 * pixel_bytes; ++i)
                bytes[byte][i] = (byte << i / pixel_bytes & 0x80) != 0 ? 0xFF : 0;
    }
};

template <int32_t pixel_bytes>
constexpr EightPixels<pixel_bytes> eight_pixels;

template <int32_t pixel_bytes>
void write_bits(const uint8_t *row, int32_t width, uint8_t *__restrict out) {
    const auto &pixels_of = eight_pixels<pixel_bytes>.bytes;
    const int32_t whole = width / 8;
    for (int32_t i = 0; i < whole; ++i, out += 8 * pixel_bytes)
        std::memcpy(out, pixels_of[row[i]], 8 * pixel_bytes);
    const int32_t rest = width % 8;
    if (rest != 0) std::memcpy(out, pixels_of[row[whole]], static_cast<size_t>(rest) * size_t{pixel_bytes});
}

template <int32_t pixel_bytes>
bool copy_rows_as(WbmpDrawing &drawing) {
    int64_t position = drawing.position;
    for (int32_t y = 0; y < drawing.image.height; ++y, position += drawing.row_step) {
        const uint8_t *const row = read_row(drawing.rows, y);
        if (row == nullptr) return false;
        write_bits<pixel_bytes>(row, drawing.image.width, drawing.output.start + static_cast<ptrdiff_t>(position));
    }
    return true;
}

} // namespace

bool copy_rows(WbmpDrawing &drawing) {
    switch (wbmp_pixel_bytes(drawing.format)) {
    case 2: return copy_rows_as<2>(drawing);
    case 3: return copy_rows_as<3>(drawing);
    default: return copy_rows_as<4>(drawing);
    }
}

} // namespace pelm

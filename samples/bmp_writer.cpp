#include "samples/bmp_writer.h"

#include <cstdio>

namespace pelm_samples {
namespace {

using Bytes = std::vector<uint8_t>;

void put(Bytes &bytes, uint32_t value, int count) {
    for (int i = 0; i < count; ++i)
        bytes.push_back(static_cast<uint8_t>(value >> 8 * i & 0xFF));
}

uint32_t stride_of(const BmpContents &contents) {
    return static_cast<uint32_t>((contents.width * contents.bits + 31) / 32 * 4);
}

uint32_t pixel_offset(const BmpContents &contents) {
    return static_cast<uint32_t>(54 + 4 * (contents.palette.size() + contents.masks.size()));
}

void put_file_header(Bytes &bytes, const BmpContents &contents) {
    put(bytes, 'B' | 'M' << 8, 2);
    put(bytes, pixel_offset(contents) + stride_of(contents) * static_cast<uint32_t>(contents.height), 4);
    put(bytes, 0, 4);
    put(bytes, pixel_offset(contents), 4);
}

void put_info_header(Bytes &bytes, const BmpContents &contents) {
    constexpr uint32_t pixels_per_metre = 2835; // 72 per inch
    put(bytes, 40, 4);
    put(bytes, static_cast<uint32_t>(contents.width), 4);
    put(bytes, static_cast<uint32_t>(contents.top_down ? -contents.height : contents.height), 4);
    put(bytes, 1, 2);
    put(bytes, static_cast<uint32_t>(contents.bits), 2);
    put(bytes, contents.masks.empty() ? 0 : 3, 4);
    put(bytes, stride_of(contents) * static_cast<uint32_t>(contents.height), 4);
    put(bytes, pixels_per_metre, 4);
    put(bytes, pixels_per_metre, 4);
    put(bytes, static_cast<uint32_t>(contents.palette.size()), 4);
    put(bytes, 0, 4);
}

void put_colours(Bytes &bytes, const BmpContents &contents) {
    for (const uint32_t mask : contents.masks)
        put(bytes, mask, 4);
    for (const Colour &c : contents.palette)
        put(bytes, static_cast<uint32_t>(c.b | c.g << 8 | c.r << 16), 4);
}

// Several pixels share a byte, the first one in its highest bits.
void put_packed_row(Bytes &bytes, const uint32_t *values, int width, int bits) {
    const int per_byte = 8 / bits;
    for (int x = 0; x < width; x += per_byte) {
        uint32_t byte = 0;
        for (int i = 0; i < per_byte; ++i)
            byte = byte << bits | (x + i < width ? values[x + i] : 0);
        put(bytes, byte, 1);
    }
}

void put_row(Bytes &bytes, const BmpContents &contents, int y) {
    const uint32_t *const values = contents.values.data() + static_cast<ptrdiff_t>(y) * contents.width;
    const size_t end = bytes.size() + stride_of(contents);
    if (contents.bits <= 8) {
        put_packed_row(bytes, values, contents.width, contents.bits);
    } else {
        for (int x = 0; x < contents.width; ++x)
            put(bytes, values[x], contents.bits / 8);
    }
    bytes.resize(end);
}

} // namespace

bool write_bmp(const std::string &path, const BmpContents &contents) {
    Bytes bytes;
    put_file_header(bytes, contents);
    put_info_header(bytes, contents);
    put_colours(bytes, contents);
    for (int y = 0; y < contents.height; ++y)
        put_row(bytes, contents, contents.top_down ? y : contents.height - 1 - y);

    std::FILE *const file = std::fopen(path.c_str(), "wb");
    if (file == nullptr) return false;
    const bool written = std::fwrite(bytes.data(), 1, bytes.size(), file) == bytes.size();
    return std::fclose(file) == 0 && written;
}

} // namespace pelm_samples

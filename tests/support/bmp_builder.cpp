#include "tests/support/bmp_builder.h"

#include <cstdlib>

namespace pelm::test {

namespace {

constexpr size_t headers_size = 54;

void put16(Bytes &bytes, size_t at, uint32_t value) {
    bytes[at] = static_cast<uint8_t>(value);
    bytes[at + 1] = static_cast<uint8_t>(value >> 8);
}

void put32(Bytes &bytes, size_t at, uint32_t value) {
    put16(bytes, at, value);
    put16(bytes, at + 2, value >> 16);
}

void put_core_fields(Bytes &bytes, const BmpFile &file) {
    put16(bytes, 18, static_cast<uint32_t>(file.width));
    put16(bytes, 20, static_cast<uint32_t>(file.height));
    put16(bytes, 22, 1);
    put16(bytes, 24, file.bits);
    put16(bytes, 26, file.compression);
}

void put_info_fields(Bytes &bytes, const BmpFile &file) {
    put32(bytes, 18, static_cast<uint32_t>(file.width));
    put32(bytes, 22, static_cast<uint32_t>(file.height));
    put16(bytes, 26, 1);
    put16(bytes, 28, file.bits);
    put32(bytes, 30, file.compression);
    put32(bytes, 46, file.colors_used);
}

} // namespace

uint32_t BmpFile::rows_at() const {
    return static_cast<uint32_t>(headers_size + 4 * masks.size() + palette.size() + gap.size());
}

int64_t BmpFile::row_bytes() const {
    return (int64_t{width} * bits + 7) / 8;
}

int64_t BmpFile::stride() const {
    return (row_bytes() + 3) / 4 * 4;
}

Bytes file_bytes(const BmpFile &file) {
    Bytes bytes(headers_size);
    bytes[0] = static_cast<uint8_t>(file.signature[0]);
    bytes[1] = static_cast<uint8_t>(file.signature[1]);
    put32(bytes, 10, file.stated_offset());
    put32(bytes, 14, file.header_size);
    if ((file.header_size & 0xFF) == 12)
        put_core_fields(bytes, file);
    else
        put_info_fields(bytes, file);
    for (const uint32_t mask : file.masks) {
        bytes.resize(bytes.size() + 4);
        put32(bytes, bytes.size() - 4, mask);
    }
    append(bytes, file.palette);
    append(bytes, file.gap);
    for (const Bytes &row : file.rows) {
        append(bytes, row);
        bytes.resize(bytes.size() + (4 - row.size() % 4) % 4, file.padding);
    }
    put32(bytes, 2, static_cast<uint32_t>(bytes.size()));
    return bytes;
}

Bytes pack_row(const std::vector<uint32_t> &pixels, uint16_t bits) {
    if (bits < 8) {
        const size_t per_byte = 8u / bits;
        Bytes row((pixels.size() + per_byte - 1) / per_byte, 0xFF);
        for (size_t x = 0; x < pixels.size(); ++x) {
            const size_t shift = 8 - bits * (x % per_byte + 1);
            const uint32_t mask = ((1u << bits) - 1) << shift;
            uint8_t &byte = row[x / per_byte];
            byte = static_cast<uint8_t>((byte & ~mask) | (pixels[x] << shift & mask));
        }
        return row;
    }
    Bytes row;
    for (const uint32_t pixel : pixels)
        for (uint32_t shift = 0; shift < bits; shift += 8)
            row.push_back(static_cast<uint8_t>(pixel >> shift));
    return row;
}

std::vector<Bytes> pack_rows(const Picture &picture, uint16_t bits, bool top_down) {
    std::vector<Bytes> rows;
    for (size_t i = 0; i < picture.size(); ++i)
        rows.push_back(pack_row(picture[top_down ? i : picture.size() - 1 - i], bits));
    return rows;
}

const BmpVariant &variant_named(const std::string &name) {
    for (const BmpVariant &variant : bmp_variants)
        if (name == variant.name) return variant;
    abort();
}

uint32_t Noise::next() {
    state_ ^= state_ << 13;
    state_ ^= state_ >> 17;
    state_ ^= state_ << 5;
    return state_ ^ (state_ >> 16);
}

Picture noise_picture(int32_t width, int32_t height, uint16_t bits, uint32_t seed) {
    Noise noise(seed);
    Picture picture(static_cast<size_t>(height));
    for (auto &row : picture)
        for (int32_t x = 0; x < width; ++x)
            row.push_back(bits >= 32 ? noise.next() : noise.next() & ((1u << bits) - 1));
    return picture;
}

Bytes noise_palette(uint32_t entries, uint32_t seed) {
    Noise noise(seed + 77);
    Bytes palette(size_t{entries} * 4);
    for (uint8_t &byte : palette)
        byte = static_cast<uint8_t>(noise.next());
    return palette;
}

namespace {

BmpFile file_of(const BmpVariant &variant, const Picture &picture, int32_t width, bool top_down, Bytes palette) {
    const int32_t height = static_cast<int32_t>(picture.size());
    BmpFile file;
    file.width = width;
    file.height = top_down ? -height : height;
    file.bits = variant.bits;
    file.compression = variant.compression;
    if (variant.compression == 3) file.masks.assign(variant.masks.begin(), variant.masks.end());
    if (variant.bits <= 8) file.palette = std::move(palette);
    file.rows = pack_rows(picture, variant.bits, top_down);
    return file;
}

} // namespace

BmpFile noise_bmp(const BmpVariant &variant, int32_t width, int32_t height, bool top_down, uint32_t seed) {
    const Bytes palette = variant.bits <= 8 ? noise_palette(1u << variant.bits, seed) : Bytes{};
    return file_of(variant, noise_picture(width, height, variant.bits, seed), width, top_down, palette);
}

BmpFile noise_header(Noise &noise) {
    static constexpr int32_t sides[] = {0,  1,   -1,    2,     7,         -7,        31,
                                        33, 255, 65535, 65536, INT32_MAX, INT32_MIN, 0x20000000};
    static constexpr uint16_t depths[] = {0, 1, 2, 4, 8, 15, 16, 24, 32, 64, 65535};
    static constexpr uint32_t offsets[] = {0,    53,     54,     58,         62,         66,        118,
                                           1078, 131125, 131126, 0x7FFFFFFF, 0x80000000, 0xFFFFFFFF};
    BmpFile file;
    file.width = sides[noise.below(std::size(sides))];
    file.height = sides[noise.below(std::size(sides))];
    file.bits = depths[noise.below(std::size(depths))];
    file.pixel_data_offset = offsets[noise.below(std::size(offsets))];
    if (noise.below(2) == 0) file.masks = {0xF800, 0x07E0, 0x001F};
    file.gap.resize(noise.below(1500));
    for (uint8_t &byte : file.gap)
        byte = static_cast<uint8_t>(noise.next());
    return file;
}

BmpFile flat_bmp(const BmpVariant &variant, int32_t width, int32_t height, uint32_t value, Bytes palette) {
    const std::vector<uint32_t> row(static_cast<size_t>(width), value);
    return file_of(variant, Picture(static_cast<size_t>(height), row), width, false, std::move(palette));
}

} // namespace pelm::test

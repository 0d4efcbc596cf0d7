#include "samples/png_writer.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>

#include "samples/deflate_writer.h"

namespace pelm_samples {
namespace {

using Bytes = std::vector<uint8_t>;

constexpr int rows_per_block = 40;
constexpr int filter_types = 5;

void put_u32(Bytes &bytes, uint32_t value) {
    for (int shift = 24; shift >= 0; shift -= 8)
        bytes.push_back(static_cast<uint8_t>(value >> shift));
}

uint32_t crc32(const Bytes &bytes, size_t from) {
    uint32_t crc = 0xFFFFFFFF;
    for (size_t i = from; i < bytes.size(); ++i) {
        crc ^= bytes[i];
        for (int bit = 0; bit < 8; ++bit)
            crc = crc >> 1 ^ ((crc & 1) != 0 ? 0xEDB88320u : 0);
    }
    return ~crc;
}

void put_chunk(Bytes &file, const std::string &type, const Bytes &data) {
    put_u32(file, static_cast<uint32_t>(data.size()));
    const size_t start = file.size();
    file.insert(file.end(), type.begin(), type.end());
    file.insert(file.end(), data.begin(), data.end());
    put_u32(file, crc32(file, start));
}

size_t channels_of(PngColour colour) {
    switch (colour) {
    case PngColour::rgb: return 3;
    case PngColour::rgb_alpha: return 4;
    default: return 1;
    }
}

int paeth(int left, int above, int corner) {
    const int guess = left + above - corner;
    const int to_left = std::abs(guess - left), to_above = std::abs(guess - above),
              to_corner = std::abs(guess - corner);
    if (to_left <= to_above && to_left <= to_corner) return left;
    return to_above <= to_corner ? above : corner;
}

int prediction(int type, int left, int above, int corner) {
    switch (type) {
    case 1: return left;
    case 2: return above;
    case 3: return (left + above) / 2;
    case 4: return paeth(left, above, corner);
    default: return 0;
    }
}

// With the filter type in front. `above` is as long as the row.
Bytes filtered(int type, const uint8_t *row, const uint8_t *above, size_t length, size_t distance) {
    Bytes result = {static_cast<uint8_t>(type)};
    for (size_t i = 0; i < length; ++i) {
        const int left = i < distance ? 0 : row[i - distance];
        const int corner = i < distance ? 0 : above[i - distance];
        result.push_back(static_cast<uint8_t>(row[i] - prediction(type, left, above[i], corner)));
    }
    return result;
}

int cost(const Bytes &row) {
    int sum = 0;
    for (const uint8_t byte : row)
        sum += std::abs(static_cast<int8_t>(byte));
    return sum;
}

// Palette indices do not follow their neighbours.
Bytes best_filtered(const PngContents &contents, const uint8_t *row, const uint8_t *above, size_t length) {
    const size_t distance = channels_of(contents.colour);
    Bytes best = filtered(0, row, above, length, distance);
    for (int type = 1; type < filter_types && contents.colour != PngColour::palette; ++type) {
        Bytes other = filtered(type, row, above, length, distance);
        if (cost(other) < cost(best)) best = std::move(other);
    }
    return best;
}

Bytes image_data(const PngContents &contents) {
    const size_t length = static_cast<size_t>(contents.width) * channels_of(contents.colour);
    const Bytes nothing(length);
    std::vector<Bytes> pieces;
    for (int y = 0; y < contents.height; ++y) {
        const uint8_t *const row = contents.samples.data() + static_cast<size_t>(y) * length;
        const Bytes bytes = best_filtered(contents, row, y == 0 ? nothing.data() : row - length, length);
        if (y % rows_per_block == 0) pieces.emplace_back();
        pieces.back().insert(pieces.back().end(), bytes.begin(), bytes.end());
    }
    return zlib_stream(pieces);
}

Bytes header(const PngContents &contents) {
    Bytes bytes;
    put_u32(bytes, static_cast<uint32_t>(contents.width));
    put_u32(bytes, static_cast<uint32_t>(contents.height));
    bytes.insert(bytes.end(), {8, static_cast<uint8_t>(contents.colour), 0, 0, 0});
    return bytes;
}

void put_palette(Bytes &file, const PngContents &contents) {
    Bytes bytes;
    for (const Colour &c : contents.palette) {
        for (const int channel : {c.r, c.g, c.b})
            bytes.push_back(static_cast<uint8_t>(channel));
    }
    put_chunk(file, "PLTE", bytes);
    if (!contents.alphas.empty()) put_chunk(file, "tRNS", contents.alphas);
}

void put_image_data(Bytes &file, const PngContents &contents) {
    const Bytes data = image_data(contents);
    for (size_t from = 0; from < data.size(); from += contents.longest_chunk) {
        const size_t count = std::min(contents.longest_chunk, data.size() - from);
        const auto begin = data.begin() + static_cast<ptrdiff_t>(from);
        put_chunk(file, "IDAT", Bytes(begin, begin + static_cast<ptrdiff_t>(count)));
    }
}

} // namespace

bool write_png(const std::string &path, const PngContents &contents) {
    Bytes bytes = {0x89, 'P', 'N', 'G', 0x0D, 0x0A, 0x1A, 0x0A};
    put_chunk(bytes, "IHDR", header(contents));
    if (contents.colour == PngColour::palette) put_palette(bytes, contents);
    put_image_data(bytes, contents);
    put_chunk(bytes, "IEND", {});

    std::FILE *const file = std::fopen(path.c_str(), "wb");
    if (file == nullptr) return false;
    const bool written = std::fwrite(bytes.data(), 1, bytes.size(), file) == bytes.size();
    return std::fclose(file) == 0 && written;
}

} // namespace pelm_samples

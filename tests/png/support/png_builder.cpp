#include "tests/png/support/png_builder.h"

#include <algorithm>
#include <cstdlib>
#include <random>

namespace pelm::test {

namespace {

// PNG specification, 9.4, from its wording.
int32_t paeth_predictor(int32_t a, int32_t b, int32_t c) {
    const int32_t p = a + b - c;
    const int32_t pa = std::abs(p - a), pb = std::abs(p - b), pc = std::abs(p - c);
    if (pa <= pb && pa <= pc) return a;
    return pb <= pc ? b : c;
}

int32_t prediction(uint8_t filter, int32_t left, int32_t up, int32_t up_left) {
    switch (filter) {
    case 1: return left;
    case 2: return up;
    case 3: return (left + up) / 2;
    case 4: return paeth_predictor(left, up, up_left);
    default: return 0;
    }
}

uint32_t bits_at(const Bytes &row, size_t bit, uint32_t count) {
    uint32_t value = 0;
    for (size_t i = bit; i < bit + count; ++i)
        value = value << 1 | (row[i / 8] >> (7 - i % 8) & 1);
    return value;
}

void put_bits(Bytes &row, size_t bit, uint32_t count, uint32_t value) {
    for (uint32_t i = 0; i < count; ++i) {
        uint8_t &byte = row[(bit + i) / 8];
        byte = static_cast<uint8_t>(byte | (value >> (count - 1 - i) & 1) << (7 - (bit + i) % 8));
    }
}

Bytes row_at(const Png &png, size_t y) {
    Bytes row = y < png.rows.size() ? png.rows[y] : Bytes();
    row.resize(row_bytes(png));
    return row;
}

void append_filtered(Bytes &scanlines, const Png &png, const std::vector<Bytes> &rows) {
    for (size_t y = 0; y < rows.size(); ++y) {
        const Bytes above = y == 0 ? Bytes(rows[0].size()) : rows[y - 1];
        const uint8_t filter = png.filters.empty() ? uint8_t{0} : png.filters[y % png.filters.size()];
        append(scanlines, filtered_row(filter, rows[y], above, filter_distance(png)));
    }
}

std::vector<size_t> idat_sizes_of(const Png &png, size_t stream_size) {
    if (png.idat_size == 0) return png.idat_sizes;
    return std::vector<size_t>(stream_size / png.idat_size, png.idat_size);
}

} // namespace

uint32_t channels_of(const Png &png) {
    switch (png.colour_type) {
    case 2: return 3;
    case 4: return 2;
    case 6: return 4;
    default: return 1;
    }
}

uint32_t bits_per_pixel(const Png &png) {
    return png.depth * channels_of(png);
}

uint32_t filter_distance(const Png &png) {
    return std::max(1u, bits_per_pixel(png) / 8);
}

size_t row_bytes(const Png &png, uint32_t w) {
    return (size_t{w} * bits_per_pixel(png) + 7) / 8;
}

size_t row_bytes(const Png &png) {
    return row_bytes(png, png.width);
}

std::vector<Bytes> noise_rows(const Png &png, uint32_t seed) {
    std::mt19937 noise(seed);
    std::vector<Bytes> rows(png.height, Bytes(row_bytes(png)));
    for (Bytes &row : rows)
        for (uint8_t &byte : row)
            byte = static_cast<uint8_t>(noise() >> 24);
    return rows;
}

std::vector<Bytes> smooth_rows(const Png &png) {
    std::vector<Bytes> rows(png.height, Bytes(row_bytes(png)));
    for (size_t y = 0; y < rows.size(); ++y)
        for (size_t i = 0; i < rows[y].size(); ++i)
            rows[y][i] = static_cast<uint8_t>((i / filter_distance(png)) * 3 + y * 5 + 40 * (i % filter_distance(png)));
    return rows;
}

Bytes pack_samples(const std::vector<uint32_t> &samples, uint32_t depth) {
    Bytes row((samples.size() * depth + 7) / 8);
    for (size_t i = 0; i < samples.size(); ++i)
        put_bits(row, i * depth, depth, samples[i]);
    return row;
}

Bytes filtered_row(uint8_t filter, const Bytes &row, const Bytes &above, uint32_t distance) {
    Bytes filtered = {filter};
    for (size_t i = 0; i < row.size(); ++i) {
        const int32_t left = i < distance ? 0 : row[i - distance];
        const int32_t up_left = i < distance ? 0 : above[i - distance];
        filtered.push_back(static_cast<uint8_t>(row[i] - prediction(filter, left, above[i], up_left)));
    }
    return filtered;
}

std::vector<Pass> passes_of(const Png &png) {
    std::vector<Pass> passes = {{0, 0, 8, 8, 0, 0}, {4, 0, 8, 8, 0, 0}, {0, 4, 4, 8, 0, 0}, {2, 0, 4, 4, 0, 0},
                                {0, 2, 2, 4, 0, 0}, {1, 0, 2, 2, 0, 0}, {0, 1, 1, 2, 0, 0}};
    for (Pass &pass : passes) {
        if (png.width > pass.x_start) pass.width = (png.width - pass.x_start - 1) / pass.x_step + 1;
        if (png.height > pass.y_start) pass.height = (png.height - pass.y_start - 1) / pass.y_step + 1;
    }
    return passes;
}

std::vector<Bytes> rows_of_pass(const Png &png, const Pass &pass) {
    std::vector<Bytes> rows;
    const uint32_t bits = bits_per_pixel(png);
    for (uint32_t y = 0; y < pass.height && pass.width > 0; ++y) {
        const Bytes whole = row_at(png, pass.y_start + size_t{y} * pass.y_step);
        Bytes row(row_bytes(png, pass.width));
        for (size_t x = 0; x < pass.width; ++x)
            for (uint32_t bit = 0; bit < bits; bit += std::min(bits, 8u))
                put_bits(row, x * bits + bit, std::min(bits, 8u),
                         bits_at(whole, (pass.x_start + x * pass.x_step) * bits + bit, std::min(bits, 8u)));
        rows.push_back(row);
    }
    return rows;
}

Bytes scanlines_of(const Png &png) {
    if (png.scanlines) return *png.scanlines;
    Bytes scanlines;
    if (png.interlace == 1) {
        for (const Pass &pass : passes_of(png))
            append_filtered(scanlines, png, rows_of_pass(png, pass));
        return scanlines;
    }
    std::vector<Bytes> rows;
    for (size_t y = 0; y < png.height; ++y)
        rows.push_back(row_at(png, y));
    append_filtered(scanlines, png, rows);
    return scanlines;
}

Bytes stream_of(const Png &png) {
    return png.stream ? *png.stream : zlib_compressed(scanlines_of(png), png.level);
}

std::vector<Chunk> idat_chunks(const Bytes &stream, const std::vector<size_t> &sizes) {
    std::vector<Chunk> chunks;
    size_t at = 0;
    const auto cut = [&](size_t size) {
        const size_t end = std::min(stream.size(), at + size);
        chunks.push_back(
            {"IDAT", {stream.begin() + static_cast<ptrdiff_t>(at), stream.begin() + static_cast<ptrdiff_t>(end)}});
        at = end;
    };
    for (const size_t size : sizes)
        cut(size);
    if (at < stream.size()) cut(stream.size());
    return chunks;
}

Chunk ihdr_chunk(const Png &png) {
    Chunk chunk{"IHDR", {}};
    append_u32be(chunk.data, png.width);
    append_u32be(chunk.data, png.height);
    append(chunk.data, {png.depth, png.colour_type, png.compression_method, png.filter_method, png.interlace});
    return chunk;
}

std::vector<Chunk> chunks_of(const Png &png) {
    std::vector<Chunk> chunks = {ihdr_chunk(png)};
    const auto add = [&](const std::vector<Chunk> &more) { chunks.insert(chunks.end(), more.begin(), more.end()); };
    add(png.before_plte);
    if (png.plte) chunks.push_back({"PLTE", *png.plte});
    if (png.trns) chunks.push_back({"tRNS", *png.trns});
    add(png.before_idat);
    const Bytes stream = stream_of(png);
    add(idat_chunks(stream, idat_sizes_of(png, stream.size())));
    add(png.after_idat);
    if (png.has_iend) chunks.push_back({"IEND", {}});
    return chunks;
}

Bytes build(const Png &png) {
    return file_of(chunks_of(png));
}

Bytes bytes_of(const Chunk &chunk) {
    Bytes covered(chunk.type.begin(), chunk.type.end());
    append(covered, chunk.data);
    Bytes bytes;
    append_u32be(bytes, chunk.length.value_or(static_cast<uint32_t>(chunk.data.size())));
    append(bytes, covered);
    append_u32be(bytes, chunk.crc.value_or(crc32_of(covered)));
    return bytes;
}

Bytes file_of(const std::vector<Chunk> &chunks) {
    Bytes file(std::begin(png_signature), std::end(png_signature));
    for (const Chunk &chunk : chunks)
        append(file, bytes_of(chunk));
    return file;
}

// PNG specification, annex D: the plain definition, bit by bit through one small table.
uint32_t read_u32be(const uint8_t *bytes) {
    return uint32_t{bytes[0]} << 24 | uint32_t{bytes[1]} << 16 | uint32_t{bytes[2]} << 8 | bytes[3];
}

uint32_t crc32_of(const Bytes &bytes) {
    static const std::vector<uint32_t> table = [] {
        std::vector<uint32_t> entries(256);
        for (uint32_t i = 0; i < 256; ++i) {
            uint32_t crc = i;
            for (int bit = 0; bit < 8; ++bit)
                crc = crc & 1 ? crc >> 1 ^ 0xEDB88320u : crc >> 1;
            entries[i] = crc;
        }
        return entries;
    }();
    uint32_t crc = 0xFFFFFFFF;
    for (const uint8_t byte : bytes)
        crc = table[(crc ^ byte) & 0xFF] ^ crc >> 8;
    return ~crc;
}

} // namespace pelm::test

#include "tests/gif/support/gif_builder.h"

#include <algorithm>

namespace pelm::test {

namespace {

// The three bits that stand for the number of entries.
uint8_t size_bits(const ColourTable &table) {
    uint8_t bits = 0;
    while ((size_t{2} << bits) * 3 < table.size())
        ++bits;
    return bits;
}

uint8_t low(uint16_t value) {
    return static_cast<uint8_t>(value);
}

} // namespace

ColourTable distinct_table(size_t entries, uint32_t seed) {
    ColourTable table;
    for (uint32_t i = 0; i < entries; ++i) {
        const uint32_t mixed = (i * 167 + seed * 59) & 255; // a permutation of the bytes
        table.push_back(static_cast<uint8_t>(mixed));
        table.push_back(static_cast<uint8_t>(255 - i * 255 / 256));
        table.push_back(static_cast<uint8_t>(i * 61 + seed * 83 + 7));
    }
    return table;
}

GifFile &GifFile::raw(const Bytes &more) {
    bytes.insert(bytes.end(), more.begin(), more.end());
    return *this;
}

GifFile &GifFile::word(uint16_t value) {
    return raw({low(value), low(static_cast<uint16_t>(value >> 8))});
}

GifFile &GifFile::screen(uint16_t width, uint16_t height, const ColourTable &table, uint8_t background,
                         const std::string &signature) {
    raw(Bytes(signature.begin(), signature.end())).word(width).word(height);
    const uint8_t packed = table.empty() ? 0x70 : static_cast<uint8_t>(0xF0 | size_bits(table));
    return raw({packed, background, 0}).raw(table);
}

GifFile &GifFile::control(const GraphicControl &control) {
    const bool transparent = control.transparent >= 0;
    const uint8_t packed = static_cast<uint8_t>(control.disposal << 2 | (transparent ? 1 : 0) | control.other_bits);
    raw({0x21, 0xF9, 4, packed}).word(control.delay);
    return raw({static_cast<uint8_t>(transparent ? control.transparent : 0), 0});
}

GifFile &GifFile::extension(uint8_t label, const std::vector<Bytes> &sub_blocks) {
    raw({0x21, label});
    for (const Bytes &block : sub_blocks)
        raw({static_cast<uint8_t>(block.size())}).raw(block);
    return raw({0});
}

GifFile &GifFile::descriptor(const ImagePlace &place, const ColourTable &local) {
    raw({0x2C}).word(place.left).word(place.top).word(place.width).word(place.height);
    const uint8_t table_bits = local.empty() ? 0 : static_cast<uint8_t>(0x80 | size_bits(local));
    return raw({static_cast<uint8_t>(table_bits | (place.interlaced ? 0x40 : 0))}).raw(local);
}

GifFile &GifFile::data(int min_code_size, const Bytes &packed, uint8_t largest) {
    return data_in(min_code_size, packed, {largest});
}

GifFile &GifFile::data_in(int min_code_size, const Bytes &packed, const SubBlockSizes &sizes) {
    raw({static_cast<uint8_t>(min_code_size)});
    size_t at = 0;
    for (size_t block = 0; at < packed.size(); ++block) {
        const size_t wanted = sizes[std::min(block, sizes.size() - 1)];
        const size_t size = std::min(wanted, packed.size() - at);
        raw({static_cast<uint8_t>(size)});
        const auto from = packed.begin() + static_cast<ptrdiff_t>(at);
        bytes.insert(bytes.end(), from, from + static_cast<ptrdiff_t>(size));
        at += size;
    }
    return raw({0});
}

GifFile &GifFile::trailer() {
    return raw({0x3B});
}

GifFile &GifFile::image(const ImagePlace &place, const Bytes &pixels, int min_code_size, const ColourTable &local,
                        const LzwOptions &options) {
    const Bytes stored = place.interlaced ? interlaced_pixels(pixels, place.width) : pixels;
    return descriptor(place, local).data(min_code_size, lzw_data(stored, min_code_size, options));
}

std::vector<uint32_t> interlaced_order(uint32_t height) {
    constexpr uint32_t first[] = {0, 4, 2, 1}, step[] = {8, 8, 4, 2};
    std::vector<uint32_t> rows;
    for (int pass = 0; pass < 4; ++pass)
        for (uint32_t row = first[pass]; row < height; row += step[pass])
            rows.push_back(row);
    return rows;
}

Bytes interlaced_pixels(const Bytes &pixels, uint32_t width) {
    if (width == 0) return pixels;
    Bytes stored;
    for (const uint32_t row : interlaced_order(static_cast<uint32_t>(pixels.size() / width))) {
        const auto from = pixels.begin() + static_cast<ptrdiff_t>(size_t{row} * width);
        stored.insert(stored.end(), from, from + static_cast<ptrdiff_t>(width));
    }
    return stored;
}

Bytes noise_pixels(size_t count, uint32_t colours, uint32_t seed) {
    Noise noise(seed);
    Bytes pixels;
    while (pixels.size() < count) {
        const size_t run = noise.below(4) == 0 ? 1 + noise.below(9) : 1;
        pixels.insert(pixels.end(), std::min(run, count - pixels.size()),
                      static_cast<uint8_t>((noise.next() >> 8) % colours));
    }
    return pixels;
}

Bytes pixel_runs(size_t count, uint32_t colours, uint32_t longest, Noise &noise) {
    Bytes pixels;
    while (pixels.size() < count)
        pixels.insert(pixels.end(), 1 + (noise.next() >> 8) % longest,
                      static_cast<uint8_t>((noise.next() >> 8) % colours));
    pixels.resize(count);
    return pixels;
}

Bytes still_pixels(const Still &still) {
    return noise_pixels(size_t{still.width} * still.height, 1u << still.bits, still.seed);
}

GifFile still_file(const Still &still, const LzwOptions &options) {
    GifFile file;
    file.screen(still.width, still.height, distinct_table(size_t{1} << still.bits, still.seed));
    const ImagePlace place{0, 0, still.width, still.height, still.interlaced};
    file.image(place, still_pixels(still), std::max(still.bits, 2), {}, options);
    return file.trailer();
}

std::string hex_of(const Bytes &bytes, size_t most) {
    constexpr char digits[] = "0123456789abcdef";
    std::string text = std::to_string(bytes.size()) + " bytes:";
    for (size_t i = 0; i < bytes.size() && i < most; ++i)
        (((text += ' ') += digits[bytes[i] >> 4]) += digits[bytes[i] & 15]);
    return bytes.size() > most ? text + " ..." : text;
}

} // namespace pelm::test

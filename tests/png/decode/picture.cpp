#include "tests/png/decode/picture.h"

#include <algorithm>
#include <random>

namespace pelm::test {

unsigned Picture::channels() const {
    switch (colour_type) {
    case rgb: return 3;
    case grey_alpha: return 2;
    case rgb_alpha: return 4;
    default: return 1;
    }
}

size_t Picture::row_bytes() const {
    return (static_cast<size_t>(width) * depth * channels() + 7) / 8;
}

uint32_t Picture::sample(uint32_t x, uint32_t y, unsigned channel) const {
    const uint8_t *const row = rows.data() + row_bytes() * y;
    const size_t number = static_cast<size_t>(x) * channels() + channel;
    if (depth == 16) return static_cast<uint32_t>(row[number * 2] << 8 | row[number * 2 + 1]);
    const size_t bit = number * depth;
    return (static_cast<uint32_t>(row[bit / 8]) >> (8 - depth - bit % 8)) & ((1u << depth) - 1);
}

void Picture::set_sample(uint32_t x, uint32_t y, unsigned channel, uint32_t value) {
    uint8_t *const row = rows.data() + row_bytes() * y;
    const size_t number = static_cast<size_t>(x) * channels() + channel;
    if (depth == 16) {
        row[number * 2] = static_cast<uint8_t>(value >> 8);
        row[number * 2 + 1] = static_cast<uint8_t>(value);
        return;
    }
    const size_t bit = number * depth;
    const unsigned shift = static_cast<unsigned>(8 - depth - bit % 8);
    const unsigned mask = ((1u << depth) - 1) << shift;
    row[bit / 8] = static_cast<uint8_t>((row[bit / 8] & ~mask) | ((value << shift) & mask));
}

namespace {

unsigned word_at(const Bytes &bytes, size_t at) {
    return static_cast<unsigned>(bytes[at] << 8 | bytes[at + 1]);
}

Pixel palette_pixel(const Picture &picture, uint32_t index) {
    Pixel pixel{0, 0, 0, 255, Coverage::opaque};
    if (index * 3 + 2 < picture.palette.size()) {
        pixel.r = picture.palette[index * 3];
        pixel.g = picture.palette[index * 3 + 1];
        pixel.b = picture.palette[index * 3 + 2];
    }
    if (picture.transparency) {
        pixel.coverage = Coverage::blended;
        // Three alphas are kept for every colour of the palette.
        const size_t kept = std::min(picture.transparency->size(), picture.palette.size());
        if (index < kept) pixel.a = (*picture.transparency)[index];
    }
    return pixel;
}

// The transparent colour of grey: one byte of it at 8 bits, both at 16, and not looked at below.
bool matches_grey(const Picture &picture, uint32_t sample) {
    if (!picture.transparency || picture.depth < 8) return false;
    return picture.depth == 8 ? sample == (*picture.transparency)[1] : sample == word_at(*picture.transparency, 0);
}

// The transparent colour of RGB: all 16 bits at both depths, so that 8-bit samples never meet one above 255.
bool matches_rgb(const Picture &picture, uint32_t x, uint32_t y) {
    if (!picture.transparency) return false;
    for (unsigned channel = 0; channel < 3; ++channel)
        if (picture.sample(x, y, channel) != word_at(*picture.transparency, channel * 2)) return false;
    return true;
}

uint8_t widened_grey(unsigned depth, uint32_t sample) {
    switch (depth) {
    case 1: return sample != 0 ? 255 : 0;
    case 2: return static_cast<uint8_t>(sample << 6 | 0x3F);
    case 4: return static_cast<uint8_t>(sample << 4 | 0x0F);
    case 8: return static_cast<uint8_t>(sample);
    default: return static_cast<uint8_t>(sample >> 8);
    }
}

} // namespace

Pixel Picture::pixel(uint32_t x, uint32_t y) const {
    if (colour_type == indexed) return palette_pixel(*this, sample(x, y, 0));
    const auto byte = [&](unsigned channel) { return widened_grey(depth, sample(x, y, channel)); };
    switch (colour_type) {
    case grey: {
        const bool key = matches_grey(*this, sample(x, y, 0));
        return {byte(0), byte(0), byte(0), static_cast<uint8_t>(key ? 0 : 255),
                key ? Coverage::keyed : Coverage::opaque};
    }
    case rgb: {
        const bool key = matches_rgb(*this, x, y);
        return {byte(0), byte(1), byte(2), static_cast<uint8_t>(key ? 0 : 255),
                key ? Coverage::keyed : Coverage::opaque};
    }
    case grey_alpha: return {byte(0), byte(0), byte(0), byte(1), Coverage::blended};
    default: return {byte(0), byte(1), byte(2), byte(3), Coverage::blended};
    }
}

std::string Picture::described() const {
    return "type " + std::to_string(colour_type) + " depth " + std::to_string(depth) + ", " + std::to_string(width) +
           "x" + std::to_string(height) + (transparency ? " with tRNS" : "");
}

Picture noise_picture(uint8_t colour_type, uint8_t depth, uint32_t width, uint32_t height, uint32_t seed) {
    std::mt19937 random(seed * 7919 + colour_type * 31 + depth);
    Picture picture{width, height, colour_type, depth, {}, {}, {}};
    picture.rows.resize(picture.row_bytes() * height);
    for (uint8_t &byte : picture.rows)
        byte = static_cast<uint8_t>(random() >> 8);
    if (colour_type == indexed) {
        picture.palette.resize(3u << depth);
        for (uint8_t &byte : picture.palette)
            byte = static_cast<uint8_t>(random() >> 8);
    }
    // Alphas at both ends of the scale, not only somewhere between.
    const unsigned channels = picture.channels();
    if (colour_type == grey_alpha || colour_type == rgb_alpha)
        for (uint32_t y = 0; y < height; ++y)
            for (uint32_t x = 0; x < width; ++x) {
                const uint32_t choice = random() % 4;
                if (choice < 2) picture.set_sample(x, y, channels - 1, choice == 0 ? 0 : 0xFFFFu >> (16 - depth));
            }
    return picture;
}

Picture with_transparency(Picture picture, uint32_t seed) {
    std::mt19937 random(seed * 104729 + picture.depth);
    if (picture.colour_type == indexed) {
        Bytes alphas(picture.palette.size() / 6 + 1);
        for (uint8_t &alpha : alphas)
            alpha = random() % 3 == 0 ? (random() % 2 == 0 ? 0 : 255) : static_cast<uint8_t>(random() >> 8);
        picture.transparency = alphas;
    } else if (picture.colour_type == grey || picture.colour_type == rgb) {
        Bytes key;
        for (unsigned channel = 0; channel < picture.channels(); ++channel) {
            const uint32_t value = picture.sample(0, 0, channel);
            key.push_back(static_cast<uint8_t>(value >> 8));
            key.push_back(static_cast<uint8_t>(value));
            for (uint32_t y = 0; y < picture.height; ++y)
                for (uint32_t x = y % 3; x < picture.width; x += 3)
                    picture.set_sample(x, y, channel, value);
        }
        picture.transparency = key;
    }
    return picture;
}

} // namespace pelm::test

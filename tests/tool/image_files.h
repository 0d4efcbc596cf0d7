// Reads the kinds of files that the tool writes, and the PNGs that tests start from.
#pragma once

#include <filesystem>
#include <string>

#include "tests/support/bmp_builder.h"

namespace pelm::test {

// Packed as 0xRRGGBBAA, from the top left.
struct Image {
    size_t width = 0;
    size_t height = 0;
    std::vector<uint32_t> pixels;
    bool has_alpha = false; // whether the file has a channel for it

    uint32_t at(size_t x, size_t y) const { return pixels[y * width + x]; }
    bool operator==(const Image &) const = default;
};

// Empty images for what cannot be read.
Image read_png(const std::filesystem::path &path);
// The stored samples as they are, without colour management: 16 bits cut to the first byte.
Image read_png_samples(const std::filesystem::path &path);
Image read_ppm(const Bytes &file);
Image read_pam(const Bytes &file);

Image turned(const Image &image, int quarter_turns); // clockwise

// The first difference in words; empty: none. Whether the files have an alpha channel is not compared.
std::string difference(const Image &expected, const Image &got);

} // namespace pelm::test

// Palette indices and blocks of GIF files as giflib reads them, and the shared pictures to read.
#pragma once

#include <filesystem>
#include <optional>

#include "tests/gif/support/gif_builder.h"

namespace pelm::test {

struct GiflibImage {
    ImagePlace place;
    ColourTable local;      // empty: none
    Bytes indices;          // rows from the top down
    GraphicControl control; // the last one before the image
};

struct GiflibFile {
    uint16_t width = 0, height = 0;
    uint8_t background = 0;
    ColourTable global; // empty: none
    std::vector<GiflibImage> images;
};

std::optional<GiflibFile> read_with_giflib(const Bytes &file);

// The first image alone, whatever follows it; `images` has one entry, without its control. Nothing when giflib reads
// none.
std::optional<GiflibFile> first_image_with_giflib(const Bytes &file);

// Three bytes, or black where the table ends before.
std::array<uint8_t, 3> table_colour(const ColourTable &table, size_t index);

// The GIF files beside the repository, or in PELM_TEST_IMAGES. Says so when there are none.
std::vector<std::filesystem::path> shared_gifs();
Bytes contents_of(const std::filesystem::path &path);

} // namespace pelm::test

// PNGs made at start, so that the benchmark needs no files, written by libpng with its default settings.
#pragma once

#include <cstdint>
#include <vector>

#include "bench/motifs.h"
#include "bench/png_writer.h"

namespace bench {

// Palettes of 256 colours are dithered where the motif is a photo. Empty when libpng cannot write it.
std::vector<uint8_t> png_picture(Motif motif, PngLayout layout, uint32_t width, uint32_t height);

// 32 x 32 pixels: every colour type and depth, interlaced and not, of different contents.
std::vector<std::vector<uint8_t>> png_icons();

} // namespace bench

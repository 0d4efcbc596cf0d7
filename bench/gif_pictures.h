// Large GIFs made at start from the motifs of the PNG benchmarks, written by giflib.
#pragma once

#include <cstdint>
#include <vector>

#include "bench/motifs.h"

namespace bench {

enum class Colours {
    dithered, // 256, with error diffusion
    nearest,  // 256
    two       // black and white
};

// All of them are empty when giflib cannot write them.
std::vector<uint8_t> gif_picture(Motif motif, Colours colours, uint32_t width, uint32_t height);

// A view that moves over a larger picture.
std::vector<uint8_t> gif_of_full_frames(Motif motif, uint32_t width, uint32_t height, uint32_t frames);

// A picture over which smaller ones are painted, here and there, with transparent parts.
std::vector<uint8_t> gif_of_small_changes(Motif motif, uint32_t width, uint32_t height, uint32_t frames);

} // namespace bench

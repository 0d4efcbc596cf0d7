// Every way to decode a file, to its end.
#pragma once

#include <string>
#include <vector>

#include "PelmImageDecoder.h"
#include "tests/support/bmp_builder.h"

namespace pelm::test {

enum class Way {
    bmp,
    bmp_iterative,
    bmp_bands,
    bmp_lines,
    bmp_two_steps,
    wbmp,
    png,
    png_iterative,
    png_lines,
    gif,
    gif_iterative,
    gif_lines,
    frames,
    frames_iterative
};

inline constexpr Way bmp_ways[] = {Way::bmp, Way::bmp_iterative, Way::bmp_bands, Way::bmp_lines, Way::bmp_two_steps};
inline constexpr Way png_ways[] = {Way::png, Way::png_iterative, Way::png_lines};
inline constexpr Way still_ways[] = {Way::gif, Way::gif_iterative, Way::gif_lines};
inline constexpr Way frame_ways[] = {Way::frames, Way::frames_iterative};
inline constexpr uint32_t every_kind[] = {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT,
                                          PELM_SOURCE_SEQUENTIAL};

std::string name_of(Way way);

struct Asking {
    uint32_t kind = PELM_SOURCE_MEMORY;
    uint32_t format = PELM_FORMAT_RGBA8888;
    uint32_t flags = 0;
    int32_t width = 0, height = 0; // of the box
    int32_t rows = 0;              // of each band, where there is an output at most the height; 0: the height
    bool has_output = true;
};

struct Decoded {
    int32_t result = -1; // of the last call
    int32_t calls = 0;
    int32_t output_width = 0, output_height = 0;
    Bytes output; // of 4 bytes per pixel of the box, zeros before
};

// A decode that takes more calls than a file can need ends there, with the result -1. What belongs to the caller
// afterwards is freed. Nothing outside the output is touched, or the test fails.
Decoded decode(const Bytes &file, Way way, const Asking &asking);

} // namespace pelm::test

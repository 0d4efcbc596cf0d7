// The command line: what it offers, and what the user chose.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "tools/input.h"
#include "tools/pixels.h"

namespace pelm_tool {

struct Box {
    int32_t width;
    int32_t height;
};

enum class Calls { one_shot, iterative, by_lines, in_two_steps };

struct Mode {
    Calls calls = Calls::one_shot;
    int32_t lines = 0;   // per call, of by_lines
    int32_t divisor = 1; // of the size, of in_two_steps
};

enum class OutputType { png, ppm, pam, raw };

struct Options {
    std::vector<std::string> inputs;
    std::string output; // as given; empty with --info and --animate
    std::string page;   // of --animate; empty: none
    uint32_t frame = 0; // of an animation, from 1 on; 0: not asked for
    bool all_frames = false;
    std::optional<OutputType> output_type;
    const PixelFormat *format = find_pixel_format("rgba");
    std::optional<Box> box; // measured in the output; none: the image's own size
    uint32_t rotation = 0;  // PELM_ROTATE_
    uint32_t placement = 0; // PELM_PLACE_
    Mode mode;
    SourceChoice source = SourceChoice::automatic;
    std::optional<uint32_t> background; // 0xRRGGBB
    uint64_t max_memory = 0;            // bytes; 0: no limit
    uint32_t deadline = 0;              // milliseconds per input; 0: none
    bool frame_buffer = false;          // PNG: interlaced images through a whole-frame buffer
    bool info = false;
    bool stats = false;
    bool quiet = false;

    bool wants_frames() const { return frame > 0 || all_frames || !page.empty(); }
};

// Fills `options`, or says what there is to say (help, version, a mistake) and returns the status to end with.
std::optional<int> parse_options(int argc, char **argv, Options &options);

} // namespace pelm_tool

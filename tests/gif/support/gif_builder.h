// Writes GIF files block by block, right or wrong. What a decoder makes of them is not known here.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <string>
#include <vector>

#include "tests/gif/support/lzw_encoder.h"
#include "tests/support/bmp_builder.h"

namespace pelm::test {

// Red, green, blue, as many times as there are entries: 2, 4, 8 .. 256 of them.
using ColourTable = Bytes;

// Entries that all differ, in every 5-bit channel where there are few enough of them.
ColourTable distinct_table(size_t entries, uint32_t seed = 1);

struct GraphicControl {
    uint8_t disposal = 0;
    int transparent = -1; // index; below 0: none
    uint16_t delay = 0;   // hundredths of a second
    uint8_t other_bits = 0;
};

struct ImagePlace {
    uint16_t left = 0, top = 0, width = 1, height = 1;
    bool interlaced = false;
};

// Bytes of a sub-block; 0 in between is an empty one.
using SubBlockSizes = std::vector<uint8_t>;

class GifFile {
public:
    Bytes bytes;

    GifFile &raw(const Bytes &more);
    GifFile &word(uint16_t value); // little-endian
    // Signature and logical screen. No table entries: no global table.
    GifFile &screen(uint16_t width, uint16_t height, const ColourTable &table, uint8_t background = 0,
                    const std::string &signature = "GIF89a");
    GifFile &control(const GraphicControl &control);
    GifFile &extension(uint8_t label, const std::vector<Bytes> &sub_blocks);
    // The descriptor and the local table, if it has entries.
    GifFile &descriptor(const ImagePlace &place, const ColourTable &local = {});
    // Minimum code size, sub-blocks of at most `largest` bytes, terminator.
    GifFile &data(int min_code_size, const Bytes &packed, uint8_t largest = 255);
    // Sub-blocks of the given sizes in turn (zeros included), the last ones as large as the last size.
    GifFile &data_in(int min_code_size, const Bytes &packed, const SubBlockSizes &sizes);
    GifFile &trailer();

    // Descriptor and data of the pixels: those of rows from the top down, which are interlaced here when asked for.
    GifFile &image(const ImagePlace &place, const Bytes &pixels, int min_code_size, const ColourTable &local = {},
                   const LzwOptions &options = {});
};

// Screen rows in the order in which an interlaced image of that height stores them.
std::vector<uint32_t> interlaced_order(uint32_t height);

// Row r of the pixels goes where the order says.
Bytes interlaced_pixels(const Bytes &pixels, uint32_t width);

// Indices below `colours`, in runs here and there.
Bytes noise_pixels(size_t count, uint32_t colours, uint32_t seed);

// Runs of up to `longest` pixels: strings get long, and so do the rows that one of them completes.
Bytes pixel_runs(size_t count, uint32_t colours, uint32_t longest, Noise &noise);

// A whole file: one image that fills the screen.
struct Still {
    uint16_t width = 8, height = 8;
    int bits = 4; // of the table, and the minimum code size from 2 on
    bool interlaced = false;
    uint32_t seed = 1;
};
GifFile still_file(const Still &still, const LzwOptions &options = {});
Bytes still_pixels(const Still &still);

// "in hexadecimal", for messages.
std::string hex_of(const Bytes &bytes, size_t most = 120);

} // namespace pelm::test

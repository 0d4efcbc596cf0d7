// Pixels that are finished: what lies in the output is looked up, not computed.
#pragma once

#include <cstdint>
#include <cstring>

#include "frame/packed.h"
#include "frame/write_row.h"

namespace pelm {

// A pixel as it lies in memory, in the first bytes of the word.
struct FinishedPixel {
    uint32_t word;
};

template <int32_t bytes>
struct StoreFinished {
    static constexpr int32_t size = bytes;
    static void put(uint8_t *at, FinishedPixel pixel) { std::memcpy(at, &pixel.word, bytes); }
    // In one piece, over the bytes behind it.
    static void put_wide(uint8_t *at, FinishedPixel pixel) { std::memcpy(at, &pixel.word, sizeof pixel.word); }
};

// Samples of `depth` bits as pixels of two or four bytes, eight bytes with each store. Returns how many it wrote.
template <int32_t depth, int32_t size>
inline int32_t write_looked_up(const uint32_t *colours, const uint8_t *samples, int32_t count, uint8_t *out) {
    constexpr int32_t at_once = 8 / size;
    const int32_t groups = count / at_once;
    for (ptrdiff_t i = 0; i < groups; ++i, samples += at_once * depth / 8) {
        uint64_t pixels = 0;
        for (int32_t j = 0; j < at_once; ++j)
            pixels |= uint64_t{colours[packed_sample<depth>(samples, j)]} << (8 * size * j);
        std::memcpy(out + 8 * i, &pixels, 8);
    }
    return groups * at_once;
}

// The formats of a list, for pixels that are finished in one of them: only their width is left of the format.
template <class Formats>
struct Finished {
    static constexpr int32_t size(uint32_t format) { return Formats::size(format); }

    template <class Load>
    static void write_row(uint32_t format, const Load &load, int32_t from, int32_t count, uint8_t *out,
                          ptrdiff_t step) {
        switch (size(format)) {
        case 2: return write_run_as<StoreFinished<2>>(load, from, count, out, step);
        case 3: return write_run_as<StoreFinished<3>>(load, from, count, out, step);
        case 4: return write_run_as<StoreFinished<4>>(load, from, count, out, step);
        default: return;
        }
    }
};

} // namespace pelm

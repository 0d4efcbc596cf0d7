// Pixels that are finished: what lies in the output is looked up, not computed.
#pragma once

#include <cstdint>
#include <cstring>

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

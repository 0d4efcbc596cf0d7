// Pixels that are finished: what lies in the output is looked up, not computed.
#pragma once

#include <cstdint>
#include <cstring>

#include "frame/packed.h"
#include "frame/row_hints.h"
#include "frame/sixteen_colours.h"
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

// As many samples of `depth` bits as make eight bytes of pixels, each of two or four bytes.
template <int32_t depth, int32_t size>
inline uint64_t eight_bytes_looked_up(const uint32_t *colours, const uint8_t *samples) {
    uint64_t pixels = 0;
    for (int32_t j = 0; j < 8 / size; ++j)
        pixels |= uint64_t{colours[packed_sample<depth>(samples, j)]} << (8 * size * j);
    return pixels;
}

// The same into the output: small pixels in one piece.
template <int32_t depth, int32_t size>
inline void put_eight_bytes_looked_up(const uint32_t *colours, const uint8_t *samples, uint8_t *out) {
    if constexpr (size == 4) {
        for (int32_t j = 0; j < 2; ++j)
            std::memcpy(out + 4 * j, &colours[packed_sample<depth>(samples, j)], 4);
    } else {
        const uint64_t pixels = eight_bytes_looked_up<depth, size>(colours, samples);
        std::memcpy(out, &pixels, 8);
    }
}

// Samples of `depth` bits as pixels of two or four bytes. Returns how many it wrote.
template <int32_t depth, int32_t size>
inline int32_t write_looked_up(const uint32_t *colours, const uint8_t *samples, int32_t count, uint8_t *out) {
    constexpr int32_t at_once = 8 / size, group_bytes = at_once * depth / 8;
    constexpr int32_t groups_in_eight = 8 / group_bytes;
    const int32_t groups = count / at_once;
    ptrdiff_t i = 0;
    const RowHints hints = hints_of_row(samples, int64_t{groups} * group_bytes);
    if (depth == 8 && hints.is_all_small) i = write_sixteen_colours(colours, size, samples, count, out) / at_once;
    if (hints.has_runs) {
        for (; i <= groups - groups_in_eight; i += groups_in_eight) {
            const uint8_t *const eight = samples + i * group_bytes;
            if (are_eight_alike(eight)) {
                const uint64_t pixels = eight_bytes_looked_up<depth, size>(colours, eight);
                for (int32_t k = 0; k < groups_in_eight; ++k)
                    std::memcpy(out + 8 * (i + k), &pixels, 8);
            } else {
                for (int32_t k = 0; k < groups_in_eight; ++k)
                    put_eight_bytes_looked_up<depth, size>(colours, eight + k * group_bytes, out + 8 * (i + k));
            }
        }
    }
#pragma GCC unroll 4
    for (; i < groups; ++i)
        put_eight_bytes_looked_up<depth, size>(colours, samples + i * group_bytes, out + 8 * i);
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

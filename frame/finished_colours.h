// Tables of the colours that samples stand for, as they lie in the output: for palettes and narrow grey.
#pragma once

#include "frame/finished.h"

namespace pelm {

struct FinishedColours {
    uint32_t pixels[256];   // by sample
    uint8_t groups[16][16]; // 1 and 2 bits: by half a byte, the pixels of its samples one behind the other
};

constexpr uint32_t pixels_per_finished_colour = 8; // an image of fewer does not repay the table

// All samples of `depth` bits in turn: the row that fills a table.
struct RowOfSamples {
    uint8_t bytes[256];
};

RowOfSamples row_of_samples(uint32_t depth);

// Fills the table for samples of `depth` bits with what a row of all samples in turn, written four bytes apart, leaves
// in `pixels` in a format of `size` bytes.
void fill_finished_colours(FinishedColours &colours, const uint8_t (&pixels)[4 * 256], uint32_t depth, uint32_t size);

// A row of samples that the table has.
template <int32_t depth>
struct FinishedRow {
    using Formats = Finished<FullColourFormats>;
    const uint8_t *row;
    const FinishedColours *colours;

    FinishedPixel operator()(int32_t x) const { return {colours->pixels[packed_sample<depth>(row, x)]}; }

    template <class Store>
    int32_t write_some(int32_t from, int32_t count, uint8_t *out) const {
        constexpr int32_t in_byte = 8 / depth;
        if (from % in_byte != 0) return 0;
        const uint8_t *const bytes = row + from / in_byte;
        if constexpr (depth <= 2)
            return write_groups<Store::size>(bytes, count, out);
        else if constexpr (Store::size == 4 || Store::size == 2)
            return write_looked_up<depth, Store::size>(colours->pixels, bytes, count, out);
        else
            return 0;
    }

private:
    // Group by group, 16 bytes each, however few of them count.
    template <int32_t size>
    int32_t write_groups(const uint8_t *bytes, int32_t count, uint8_t *out) const {
        constexpr int32_t in_byte = 8 / depth;
        constexpr int32_t half = in_byte / 2 * size;
        constexpr int32_t room = (half + 16 + size - 1) / size; // pixels that the two groups of a byte reach over
        const int32_t whole = count < room ? 0 : (count - room) / in_byte + 1;
        const uint8_t(*const groups)[16] = colours->groups; // the output might be where the pointer to it lies
        const auto write_byte = [&](ptrdiff_t at, uint32_t byte) {
            std::memcpy(out + 2 * half * at, groups[byte >> 4], 16);
            std::memcpy(out + 2 * half * at + half, groups[byte & 15], 16);
        };
        ptrdiff_t i = 0;
        if (hints_of_row(bytes, whole).has_runs) {
            for (; i <= whole - 8; i += 8) {
                const bool are_alike = are_eight_alike(bytes + i);
                for (ptrdiff_t k = 0; k < 8; ++k)
                    write_byte(i + k, bytes[are_alike ? i : i + k]);
            }
        }
        for (; i < whole; ++i)
            write_byte(i, bytes[i]);
        return whole * in_byte;
    }
};

} // namespace pelm

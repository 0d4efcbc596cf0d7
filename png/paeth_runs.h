// Where a run of Paeth's residuals is zero, mostly no predictor has to be found. Where the pixel on its left is like
// the one above that, the run is like what is above it; and where that and all that is above the run is one pixel over
// and over, the run is the pixel on its left over and over.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace pelm {

// One run at a time: `row` holds its residuals, with the reconstructed pixel on their left, and `above` what is above.
template <uint32_t unit>
struct PaethRuns {
    static constexpr uint32_t length = unit <= 2 ? 16 : unit % 3 == 0 ? 24 : 32; // bytes of one run
    static_assert(length % unit == 0 && length % 8 == 0); // whole pixels, and what chains undo to the end

    // Undoes the run if this is such a place.
    static bool undo(uint8_t *row, const uint8_t *above) {
        if (!is_zero(row)) return false;
        if (std::memcmp(row - unit, above - unit, unit) == 0)
            std::memcpy(row, above, length);
        else if (repeats_left(above))
            repeat_left(row);
        else
            return false;
        return true;
    }

    // Whether so many runs of a row of residuals are zero that looking for them pays: a few of them tell.
    static bool are_common(const uint8_t *row, uint32_t row_length) {
        if (row_length < 5 * length) return false; // too few to tell
        const uint32_t runs = row_length / length;
        const uint32_t probes = std::min(runs, 16u);
        uint32_t zero = 0;
        for (uint32_t i = 0; i < probes; ++i)
            zero += is_zero(row + static_cast<size_t>(uint64_t{runs} * i / probes * length)) ? 1 : 0;
        return 4 * zero >= probes;
    }

private:
    static uint64_t eight_bytes(const uint8_t *from) {
        uint64_t bytes;
        std::memcpy(&bytes, from, sizeof bytes);
        return bytes;
    }

    static bool is_zero(const uint8_t *row) {
        uint64_t any = 0;
        for (uint32_t i = 0; i < length; i += 8)
            any |= eight_bytes(row + i);
        return any == 0;
    }

    static bool repeats_left(const uint8_t *above) {
        uint64_t differences = 0;
        for (uint32_t i = 0; i < length; i += 8)
            differences |= eight_bytes(above + i) ^ eight_bytes(above + i - unit);
        return differences == 0;
    }

    static void repeat_left(uint8_t *row) {
        uint8_t left[unit];
        std::memcpy(left, row - unit, unit);
        for (uint32_t i = 0; i < length; i += unit)
            std::memcpy(row + i, left, unit);
    }
};

// Undoes Paeth for a row, by runs where they are common. A chain goes from pixel to pixel: undo(row, above, length)
// goes on for so many bytes, as far as it can, and returns how many are done. It need not hear of the runs between,
// but may keep the left pixel, and the one above that, from before them: behind a copied run both pairs are alike, and
// then the pixel above is what is predicted, whatever they are; behind a repeated pixel they are the same. Returns how
// many bytes are done.
template <uint32_t unit, class Chain>
inline uint32_t undo_paeth_by_runs(Chain &chain, uint8_t *row, const uint8_t *above, uint32_t length) {
    using Runs = PaethRuns<unit>;
    if (!Runs::are_common(row, length)) return chain.undo(row, above, length);
    uint32_t i = chain.undo(row, above, Runs::length); // which has no pixel on its left
    for (; length - i >= Runs::length; i += Runs::length)
        if (!Runs::undo(row + i, above + i)) chain.undo(row + i, above + i, Runs::length);
    return i + chain.undo(row + i, above + i, length - i);
}

} // namespace pelm

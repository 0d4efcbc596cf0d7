// Where a run of Paeth's residuals is zero, mostly no predictor has to be found: below the pixel that is like the one
// above it the run is like the one above it; and below a run of one pixel it is the pixel on its left over and over.
#pragma once

#include <algorithm>
#include <cstddef>

#include "frame/lanes.h"

#ifdef PELM_HAS_LANES

namespace pelm {

// One run at a time: `row` holds its residuals, with the reconstructed pixel on their left, and `above` what is above.
template <uint32_t unit>
struct PaethRuns {
    static constexpr uint32_t length = unit <= 2 ? 16 : unit % 3 == 0 ? 24 : 32; // bytes of one run: whole pixels

    // Undoes the run if this is such a place.
    static bool undo(uint8_t *row, const uint8_t *above) {
        if (!is_zero(row)) return false;
        const Bytes16 left = load_bytes<unit>(row - unit);
        if (pelm::is_zero(left ^ load_bytes<unit>(above - unit))) {
            copy(row, above);
            return true;
        }
        if (!repeats_left(above)) return false;
        fill(row, left);
        return true;
    }

    // Whether so many runs of a row of residuals are zero that looking for them pays: a few of them tell.
    static bool are_common(const uint8_t *row, uint32_t row_length) {
        if (row_length < 5 * length) return false;
        const uint32_t runs = row_length / length;
        const uint32_t probes = std::min(runs, 16u);
        uint32_t zero = 0;
        for (uint32_t i = 0; i < probes; ++i)
            zero += is_zero(row + static_cast<size_t>(uint64_t{runs} * i / probes * length)) ? 1 : 0;
        return 4 * zero >= probes;
    }

private:
    static constexpr uint32_t rest = length % 16; // bytes behind the whole vectors

    static bool is_zero(const uint8_t *row) {
        Bytes16 any{};
        for (uint32_t i = 0; i + 16 <= length; i += 16)
            any |= load_bytes<16>(row + i);
        if constexpr (rest != 0) any |= load_bytes<rest>(row + length - rest);
        return pelm::is_zero(any);
    }

    static bool repeats_left(const uint8_t *above) {
        Bytes16 differences{};
        for (uint32_t i = 0; i + 16 <= length; i += 16)
            differences |= load_bytes<16>(above + i) ^ load_bytes<16>(above + i - unit);
        if constexpr (rest != 0) {
            const uint8_t *const last = above + length - rest;
            differences |= load_bytes<rest>(last) ^ load_bytes<rest>(last - unit);
        }
        return pelm::is_zero(differences);
    }

    static void copy(uint8_t *row, const uint8_t *above) { std::memcpy(row, above, length); }

    // `left` in its first bytes.
    static void fill(uint8_t *row, Bytes16 left) {
        constexpr uint32_t period = 16 / unit * unit, whole = (length - 16) / period * period + period;
        const Bytes16 pixels = first_everywhere<unit>(left);
        for (uint32_t i = 0; i < whole; i += period)
            store_bytes<16>(row + i, pixels);
        if constexpr (whole < length) store_bytes<length - whole>(row + whole, pixels);
    }
};

} // namespace pelm

#endif

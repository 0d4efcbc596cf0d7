// Where a picture is flat, a run of Paeth's residuals is zero below a row whose pixels are all alike: every predictor
// is the pixel on the left, and the run is that pixel over and over.
#pragma once

#include <algorithm>
#include <cstddef>

#include "frame/lanes.h"

#ifdef PELM_HAS_LANES

namespace pelm {

template <uint32_t unit>
struct FlatRuns {
    static constexpr uint32_t length = unit <= 2 ? 16 : unit % 3 == 0 ? 48 : 64; // bytes of one run: whole pixels

    // Whether the run at `row` is flat, with the pixel on its left above.
    static bool is_flat(const uint8_t *row, const uint8_t *above) {
        Bytes16 differences{};
        for (uint32_t i = 0; i < length; i += 16)
            differences |= load_bytes<16>(row + i) | (load_bytes<16>(above + i) ^ load_bytes<16>(above + i - unit));
        return is_zero(differences);
    }

    // `left` in its first bytes.
    static void fill(uint8_t *row, Bytes16 left) {
        constexpr uint32_t period = 16 / unit * unit, whole = (length - 16) / period * period + period;
        const Bytes16 pixels = first_everywhere<unit>(left);
        for (uint32_t i = 0; i < whole; i += period)
            store_bytes<16>(row + i, pixels);
        if constexpr (whole < length) store_bytes<length - whole>(row + whole, pixels);
    }

    // Whether so many runs of the row are flat that looking for them pays: a few of them tell.
    static bool are_common(const uint8_t *row, const uint8_t *above, uint32_t row_length) {
        if (row_length < 5 * length) return false;
        const uint32_t later_runs = row_length / length - 1; // the first one has no pixel on its left
        const uint32_t probes = std::min(later_runs, 16u);
        uint32_t flat = 0;
        for (uint32_t i = 0; i < probes; ++i) {
            const auto at = static_cast<size_t>((1 + uint64_t{later_runs} * i / probes) * length);
            flat += is_flat(row + at, above + at) ? 1 : 0;
        }
        return 4 * flat >= probes;
    }
};

} // namespace pelm

#endif

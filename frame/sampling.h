// Reduction by four samples at the quarter points of each output pixel's footprint: which source columns and rows they
// fall into. Positions are counted in units where a source pixel spans `scaled` units and an output pixel `full` units.
#pragma once

#include <cstdint>

namespace pelm {

struct SamplePoints {
    int64_t first, second; // units from the start of the output pixel
};

constexpr SamplePoints quarter_points(int32_t full) {
    return {full >> 2, (3 * static_cast<int64_t>(full)) >> 2};
}

// Walks along output pixels 0, 1, 2 ... and says which source pixel holds the sample point, without dividing.
struct SampleWalk {
    uint32_t at;   // source pixel
    uint32_t rest; // units of the sample point beyond that pixel's start; below `scaled`
    uint32_t step, step_rest, scaled;

    constexpr SampleWalk(int64_t point, int32_t full, int32_t scaled_size)
        : at(static_cast<uint32_t>(point / scaled_size)), rest(static_cast<uint32_t>(point % scaled_size)),
          step(static_cast<uint32_t>(full / scaled_size)), step_rest(static_cast<uint32_t>(full % scaled_size)),
          scaled(static_cast<uint32_t>(scaled_size)) {}

    constexpr void advance() {
        at += step;
        rest += step_rest;
        if (rest >= scaled) {
            rest -= scaled;
            ++at;
        }
    }
};

// The source row (or column) that holds the sample point `point` of output row (or column) `index`.
constexpr int32_t sampled_at(int32_t index, int64_t point, int32_t full, int32_t scaled) {
    return static_cast<int32_t>((static_cast<int64_t>(index) * full + point) / scaled);
}

} // namespace pelm

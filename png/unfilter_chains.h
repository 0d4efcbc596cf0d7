// Average and Paeth a pixel at a time, all its channels at once: what goes from pixel to pixel, in as few operations as
// can be, because each waits for the one before it.
#pragma once

#include "frame/lanes.h"

#ifdef PELM_HAS_LANES

namespace pelm {

// The truncated mean of a and b is the complement of the rounded mean of their complements. What goes from pixel to
// pixel is the complement: two operations.
struct AverageChain {
    Bytes16 left = ~Bytes16{};

    Bytes16 next(Bytes16 residual, Bytes16 up) { return ~next_complement(residual, ~up); }

    Bytes16 next_complement(Bytes16 residual, Bytes16 up_complement) {
        return left = mean_rounded_up(left, up_complement) - residual;
    }
};

// With t = 3c - (a + b) the predictor is the lesser of a and b where the greater one is at most t, the greater one
// where t is at most the lesser, else c. 3c - b and what is added to c wait for no pixel on the left: five operations.
struct PaethLanes {
    Lanes left{}, up_left{}, three_up_left{};

    Lanes next(Lanes residual, Lanes up) {
        const Lanes sum = add_low_bytes(up_left, residual);
        const Lanes threshold = subtract_alone(three_up_left - up, left);
        const Lanes less = least(left, up), more = greatest(left, up);
        const Lanes from_less = ~(more > threshold) & subtract_low_bytes(less, up_left);
        const Lanes from_more = ~(threshold > less) & subtract_low_bytes(more, up_left);
        left = add_low_bytes(from_less | from_more, sum); // both at once only where all three are equal
        up_left = up;
        three_up_left = up + up + up;
        return left;
    }
};

struct PaethChain {
    PaethLanes lanes;

    Bytes16 next(Bytes16 residual, Bytes16 up) { return narrow(lanes.next(widen(residual), widen(up))); }
};

} // namespace pelm

#endif

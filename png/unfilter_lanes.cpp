#include "png/unfilter_lanes.h"

#include "png/paeth_runs.h"
#include "png/unfilter_chains.h"
#include "png/unfilter_plain.h"

namespace pelm {

#ifdef PELM_HAS_LANES
namespace {

template <uint32_t distance>
using Distance = std::integral_constant<uint32_t, distance>;

// Sums of the vector's own pixels in log steps; the sum of all vectors before it, in every pixel, comes on top.
template <uint32_t unit>
struct SubChain {
    Bytes16 left{};

    static Bytes16 sums(Bytes16 bytes) {
        bytes += move_up<unit>(bytes);
        if constexpr (unit <= 4) bytes += move_up<2 * unit>(bytes);
        if constexpr (unit <= 2) bytes += move_up<4 * unit>(bytes);
        if constexpr (unit <= 1) bytes += move_up<8 * unit>(bytes);
        return bytes;
    }

    // Of the pixels that `sums` adds up.
    static Bytes16 last_in_every_pixel(Bytes16 bytes) {
        if constexpr (unit == 3) {
            Bytes16 last = move_down<13>(move_up<4>(bytes));
            last |= move_up<3>(last);
            return last | move_up<6>(last);
        } else {
            return last_everywhere<unit>(bytes);
        }
    }

    Bytes16 next(Bytes16 residuals) {
        const Bytes16 own = sums(residuals), result = own + left;
        left += last_in_every_pixel(own);
        return result;
    }
};

// Goes through whole steps of `step` bytes, loading and storing `wide` of them at once; the surplus belongs to the next
// step, which is loaded before it is overwritten. Where a row ends exactly the step's bytes are touched. Returns how
// many bytes are done. `next(residuals, at, count)` gives the bytes for those at `at`; `count` is as for load_bytes.
template <uint32_t step, uint32_t wide, class Next>
[[gnu::always_inline]] inline uint32_t undo_in_steps(uint8_t *row, uint32_t length, Next next) {
    constexpr Distance<step> narrow_count;
    constexpr Distance<wide> wide_count;
    size_t i = 0;
    if (length >= step + wide) {
        const size_t last_wide = length - (step + wide);
        Bytes16 residuals = load_bytes<wide>(row);
        for (; i <= last_wide; i += step) {
            const Bytes16 later = load_bytes<wide>(row + i + step);
            store_bytes<wide>(row + i, next(residuals, i, wide_count));
            residuals = later;
        }
        store_bytes<step>(row + i, next(residuals, i, narrow_count));
        i += step;
    }
    for (; length - i >= step; i += step)
        store_bytes<step>(row + i, next(load_bytes<step>(row + i), i, narrow_count));
    return static_cast<uint32_t>(i);
}

template <uint32_t unit, class Chain>
[[gnu::always_inline]] inline uint32_t undo_by_pixels(Chain &chain, uint8_t *row, const uint8_t *above,
                                                      uint32_t length) {
    constexpr uint32_t wide = unit <= 4 ? 4 : 8;
    return undo_in_steps<unit, wide>(row, length, [&](Bytes16 residuals, size_t at, auto count) {
        return chain.next(residuals, load_bytes<count>(above + at));
    });
}

template <uint32_t unit>
uint32_t undo_sub(uint8_t *row, uint32_t length) {
    if constexpr (unit == 6) {
        Bytes16 left{};
        return undo_in_steps<6, 8>(row, length, [&](Bytes16 residuals, size_t, auto) { return left += residuals; });
    } else {
        SubChain<unit> chain;
        return undo_in_steps < unit == 3 ? 12 : 16,
               16 > (row, length, [&](Bytes16 residuals, size_t, auto) { return chain.next(residuals); });
    }
}

uint32_t undo_up(uint8_t *row, const uint8_t *above, uint32_t length) {
    return undo_in_steps<16, 16>(row, length, [&](Bytes16 residuals, size_t at, auto count) {
        return residuals + load_bytes<count>(above + at);
    });
}

// Pixels of one or two bytes: eight bytes at a time, of which the pixel in turn is moved down to the first lanes.
template <uint32_t unit>
inline uint32_t undo_average_of_small_pixels(uint8_t *row, const uint8_t *above, uint32_t length) {
    constexpr uint32_t count = 8 / unit;
    AverageChain chain;
    uint32_t i = 0;
    for (; length - i >= 8; i += 8) {
        auto residuals = std::bit_cast<Words2>(load_bytes<8>(row + i));
        auto up = std::bit_cast<Words2>(~load_bytes<8>(above + i));
        Bytes16 complements[count];
        for (uint32_t k = 0; k < count; ++k) {
            complements[k] = chain.next_complement(std::bit_cast<Bytes16>(residuals), std::bit_cast<Bytes16>(up));
            residuals >>= 8 * unit;
            up >>= 8 * unit;
        }
        store_bytes<8>(row + i, ~join_first<unit>(complements));
    }
    return i;
}

// Without a branch, which would go wrong every other time.
inline uint32_t choose(bool condition, uint32_t yes, uint32_t no) {
#if defined(__clang__)
    return __builtin_unpredictable(condition) ? yes : no;
#else
    return __builtin_expect_with_probability(condition, true, 0.5) ? yes : no;
#endif
}

// What decides about Paeth's predictor in eight bytes, without the byte on the left. With e = b - c it is a outside of
// the numbers from b to c - 2e; from b as far as c - e / 2 it is b, and beyond it c.
struct PaethChoices {
    int16_t first[8];  // of the numbers for which it is not a; the end that is no such number is left out
    uint16_t more[8];  // numbers after the first
    int16_t middle[8]; // from there on it is the greater one of b and c, below it the lesser one
    uint16_t lesser[8], greater[8];

    PaethChoices(Lanes up, Lanes up_left) {
        const Lanes step = up - up_left, far = up_left - step - step;
        const Lanes begin = least(far + 1, up), end = greatest(far - 1, up);
        store(first, begin);
        store(more, end - begin);
        store(middle, up_left - ((step + (step >> 15)) >> 1));
        store(lesser, least(up, up_left));
        store(greater, greatest(up, up_left));
    }

    uint32_t predictor(uint32_t left, uint32_t k) const {
        const auto a = static_cast<int32_t>(left);
        const uint32_t b_or_c = choose(a >= middle[k], greater[k], lesser[k]);
        return choose(static_cast<uint32_t>(a - first[k]) <= more[k], b_or_c, left);
    }

private:
    static void store(void *to, Lanes lanes) { std::memcpy(to, &lanes, sizeof(lanes)); }
};

// Returns the last pixel of the eight bytes. Inlined into a loop this is what compilers make branches of.
template <class Pixel>
[[gnu::noinline]] Pixel undo_paeth_of_eight(uint8_t *__restrict row, const PaethChoices &__restrict choices,
                                            Pixel left) {
    const auto undo_byte = [&](uint32_t &channel, uint32_t k) {
        channel = (row[k] + choices.predictor(channel, k)) & 0xFF;
        row[k] = static_cast<uint8_t>(channel);
    };
    for (uint32_t i = 0; i < 8; i += Pixel::count) {
        undo_byte(left.channels[0], i);
        if constexpr (Pixel::count == 2) undo_byte(left.channels[1], i + 1);
    }
    return left;
}

template <uint32_t unit>
struct SmallPixel {
    static constexpr uint32_t count = unit;
    uint32_t channels[unit]; // which the calling conventions pass in registers
};

// Pixels of one or two bytes: a number at a time goes faster through the processor's other registers.
template <uint32_t unit>
struct SmallPaethChain {
    SmallPixel<unit> left{};
    Bytes16 last_up{};

    uint32_t undo(uint8_t *row, const uint8_t *above, uint32_t length) {
        uint32_t i = 0;
        for (; length - i >= 8; i += 8) {
            const Bytes16 up = load_bytes<8>(above + i);
            const PaethChoices choices(widen(up), widen(move_up<unit>(up) | last_up));
            left = undo_paeth_of_eight(row + i, choices, left);
            last_up = move_down<8 - unit>(up);
        }
        return i;
    }
};

template <uint32_t unit>
struct LargePaethChain {
    PaethChain chain;

    uint32_t undo(uint8_t *row, const uint8_t *above, uint32_t length) {
        return undo_by_pixels<unit>(chain, row, above, length);
    }
};

template <uint32_t unit, class Chain>
uint32_t undo_paeth(uint8_t *row, const uint8_t *above, uint32_t length) {
    Chain chain;
    return undo_paeth_by_runs<unit>(chain, row, above, length);
}

template <uint32_t unit>
uint32_t undo_average(uint8_t *row, const uint8_t *above, uint32_t length) {
    AverageChain chain;
    return undo_by_pixels<unit>(chain, row, above, length);
}

// Returns how many bytes are done; what is left is shorter than a step.
template <uint32_t unit>
uint32_t undo(uint8_t filter, uint8_t *row, const uint8_t *above, uint32_t length) {
    switch (filter) {
    case FILTER_SUB: return undo_sub<unit>(row, length);
    case FILTER_UP: return undo_up(row, above, length);
    case FILTER_AVERAGE:
        if constexpr (unit <= 2) return undo_average_of_small_pixels<unit>(row, above, length);
        return undo_average<unit>(row, above, length);
    case FILTER_PAETH:
        if constexpr (unit <= 2) return undo_paeth<unit, SmallPaethChain<unit>>(row, above, length);
        return undo_paeth<unit, LargePaethChain<unit>>(row, above, length);
    default: return length;
    }
}

uint32_t undo(uint8_t filter, uint8_t *row, const uint8_t *above, uint32_t length, uint32_t distance) {
    switch (distance) {
    case 1: return undo<1>(filter, row, above, length);
    case 2: return undo<2>(filter, row, above, length);
    case 3: return undo<3>(filter, row, above, length);
    case 4: return undo<4>(filter, row, above, length);
    case 6: return undo<6>(filter, row, above, length);
    default: return undo<8>(filter, row, above, length);
    }
}

} // namespace

void unfilter_lanes(uint8_t filter, uint8_t *row, const uint8_t *above, uint32_t length, uint32_t distance) {
    const uint32_t done = undo(filter, row, above, length, distance);
    unfilter_plain_from(done, filter, row, above, length, distance);
}

#else

void unfilter_lanes(uint8_t filter, uint8_t *row, const uint8_t *above, uint32_t length, uint32_t distance) {
    unfilter_plain(filter, row, above, length, distance);
}

#endif

} // namespace pelm

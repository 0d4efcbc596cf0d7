#include "png/unfilter_two_rows.h"

#include "frame/processor.h"
#include "png/paeth_runs.h"
#include "png/unfilter_chains.h"
#include "png/unfilter_plain.h"

namespace pelm {

#ifdef PELM_HAS_LANES

namespace {

struct TwoPixels {
    Bytes16 first, second;
};

// A chain for each row.
template <class First, class Second>
struct TwoChains {
    First first;
    Second second;
    Bytes16 first_left{};

    // The next pixel of the first row, and that on its left in the second row, which is below what the last call gave.
    TwoPixels next(TwoPixels residuals, Bytes16 up) {
        const Bytes16 below = second.next(residuals.second, first_left);
        first_left = first.next(residuals.first, up);
        return {first_left, below};
    }
};

// Paeth for pixels of up to four bytes: both in one vector, the second row in its upper half.
struct PaethPair {
    PaethLanes lanes;

    TwoPixels next(TwoPixels residuals, Bytes16 up) {
        const Lanes both =
            lanes.next(widen(join_words<4>(residuals.first, residuals.second)), join_words<8>(widen(up), lanes.left));
        const Bytes16 bytes = narrow(both);
        return {bytes, move_down<4>(bytes)};
    }
};

// Pixels are loaded and stored `wide` bytes at once where the row goes on behind them: the surplus belongs to the next
// one, which is loaded before it is overwritten.
template <uint32_t unit, class Chain>
class Run {
public:
    explicit Run(const TwoRows &rows) : first_(rows.first), second_(rows.second), above_(rows.above) {
        const size_t end = rows.length - rows.length % unit;
        if (end == 0) return;
        residuals_.first = load_bytes<unit>(first_);
        step_at_end(0, end);
        size_t at = unit;
        for (; at + unit + wide <= end; at += unit)
            step(at);
        for (; at <= end; at += unit)
            step_at_end(at, end);
    }

private:
    static constexpr uint32_t wide = unit <= 4 ? 4 : 8;

    [[gnu::always_inline]] void step(size_t at) {
        const TwoPixels later = {load_bytes<wide>(first_ + at + unit), load_bytes<wide>(second_ + at)};
        const TwoPixels pixels = chain_.next(residuals_, load_bytes<wide>(above_ + at));
        store_bytes<wide>(first_ + at, pixels.first);
        store_bytes<wide>(second_ + at - unit, pixels.second);
        residuals_ = later;
    }

    // The first row ends at `end`; the second one is complete a step later.
    void step_at_end(size_t at, size_t end) {
        TwoPixels later{};
        if (at + unit < end) later.first = load_bytes<unit>(first_ + at + unit);
        if (at < end) later.second = load_bytes<unit>(second_ + at);
        const TwoPixels pixels = chain_.next(residuals_, at < end ? load_bytes<unit>(above_ + at) : Bytes16{});
        if (at < end) store_bytes<unit>(first_ + at, pixels.first);
        if (at > 0) store_bytes<unit>(second_ + at - unit, pixels.second);
        residuals_ = later;
    }

    Chain chain_;
    TwoPixels residuals_{};
    uint8_t *first_, *second_;
    const uint8_t *above_;
};

template <uint32_t unit>
void undo(const TwoRows &rows) {
    using TwoPaeths = std::conditional_t<unit <= 4, PaethPair, TwoChains<PaethChain, PaethChain>>;
    const bool second_is_paeth = rows.second_filter == FILTER_PAETH;
    if (rows.first_filter == FILTER_PAETH && second_is_paeth)
        Run<unit, TwoPaeths>{rows};
    else if (rows.first_filter == FILTER_PAETH)
        Run<unit, TwoChains<PaethChain, AverageChain>>{rows};
    else if (second_is_paeth)
        Run<unit, TwoChains<AverageChain, PaethChain>>{rows};
    else
        Run<unit, TwoChains<AverageChain, AverageChain>>{rows};
}

bool is_chain(uint8_t filter) {
    return filter == FILTER_AVERAGE || filter == FILTER_PAETH;
}

template <uint32_t unit>
bool has_runs(const TwoRows &rows) {
    return rows.first_filter == FILTER_PAETH && PaethRuns<unit>::are_common(rows.first, rows.length);
}

} // namespace

bool two_rows_pay(const TwoRows &rows) {
    if (!is_chain(rows.first_filter) || !is_chain(rows.second_filter) || kernels() < Kernels::lanes) return false;
    switch (rows.distance) {
    case 3: return !has_runs<3>(rows);
    case 4: return !has_runs<4>(rows);
    case 6: return !has_runs<6>(rows);
    case 8: return !has_runs<8>(rows);
    default: return false;
    }
}

void unfilter_two_rows(const TwoRows &rows) {
    switch (rows.distance) {
    case 3: undo<3>(rows); break;
    case 4: undo<4>(rows); break;
    case 6: undo<6>(rows); break;
    default: undo<8>(rows);
    }
    const uint32_t done = rows.length - rows.length % rows.distance; // a row that is no whole pixels is not a PNG's
    unfilter_plain_from(done, rows.first_filter, rows.first, rows.above, rows.length, rows.distance);
    unfilter_plain_from(done, rows.second_filter, rows.second, rows.first, rows.length, rows.distance);
}

#else

bool two_rows_pay(const TwoRows &) {
    return false;
}

void unfilter_two_rows(const TwoRows &rows) {
    unfilter_plain(rows.first_filter, rows.first, rows.above, rows.length, rows.distance);
    unfilter_plain(rows.second_filter, rows.second, rows.first, rows.length, rows.distance);
}

#endif

} // namespace pelm

#include "png/unfilter_plain.h"

#include <algorithm>
#include <type_traits>

#include "png/paeth_runs.h"

namespace pelm {
namespace {

int32_t distance_between(int32_t a, int32_t b) {
    return a < b ? b - a : a - b;
}

uint8_t paeth_predictor(int32_t left, int32_t up, int32_t up_left) {
    const int32_t from_left = distance_between(up, up_left);
    const int32_t from_up = distance_between(left, up_left);
    const int32_t from_up_left = distance_between(left + up, 2 * up_left);
    const int32_t up_or_up_left = from_up <= from_up_left ? up : up_left;
    return static_cast<uint8_t>(((from_left <= from_up) & (from_left <= from_up_left)) != 0 ? left : up_or_up_left);
}

template <class D>
void undo_sub_from(uint32_t i, uint8_t *row, uint32_t length, D distance) {
    for (i = std::max<uint32_t>(i, distance); i < length; ++i)
        row[i] = static_cast<uint8_t>(row[i] + row[i - distance]);
}

void undo_up_from(uint32_t i, uint8_t *__restrict row, const uint8_t *__restrict above, uint32_t length) {
    for (; i < length; ++i)
        row[i] = static_cast<uint8_t>(row[i] + above[i]);
}

template <class D>
void undo_average_from(uint32_t i, uint8_t *__restrict row, const uint8_t *__restrict above, uint32_t length,
                       D distance) {
    const uint32_t first = std::min<uint32_t>(distance, length);
    for (; i < first; ++i)
        row[i] = static_cast<uint8_t>(row[i] + (above[i] >> 1));
    for (; i < length; ++i)
        row[i] = static_cast<uint8_t>(row[i] + ((row[i - distance] + above[i]) >> 1));
}

template <class D>
void undo_paeth_from(uint32_t i, uint8_t *__restrict row, const uint8_t *__restrict above, uint32_t length,
                     D distance) {
    const uint32_t first = std::min<uint32_t>(distance, length);
    for (; i < first; ++i)
        row[i] = static_cast<uint8_t>(row[i] + above[i]);
    for (; i < length; ++i)
        row[i] = static_cast<uint8_t>(row[i] + paeth_predictor(row[i - distance], above[i], above[i - distance]));
}

// The distance is a template argument where it is one of those that PNG has, so that the row's last pixels stay in
// registers.
template <uint32_t distance>
using Distance = std::integral_constant<uint32_t, distance>;

template <class D>
void undo_paeth(uint8_t *row, const uint8_t *above, uint32_t length, D distance) {
    undo_paeth_from(0, row, above, length, distance);
}

// Whole pixels, whose left neighbours stay in registers.
template <uint32_t distance>
struct PlainPaethChain {
    int32_t left[distance] = {}, above_left[distance] = {};

    uint32_t undo(uint8_t *__restrict row, const uint8_t *__restrict above, uint32_t length) {
        uint32_t i = 0;
        for (; length - i >= distance; i += distance)
            for (uint32_t k = 0; k < distance; ++k) {
                const int32_t up = above[i + k];
                left[k] = static_cast<uint8_t>(row[i + k] + paeth_predictor(left[k], up, above_left[k]));
                above_left[k] = up;
                row[i + k] = static_cast<uint8_t>(left[k]);
            }
        return i;
    }
};

template <uint32_t distance>
void undo_paeth(uint8_t *row, const uint8_t *above, uint32_t length, Distance<distance>) {
    PlainPaethChain<distance> chain;
    const uint32_t done = chain.undo(row, above, length);
    undo_paeth_from(done, row, above, length, Distance<distance>());
}

template <uint32_t distance>
void undo_paeth_with_runs(uint8_t *row, const uint8_t *above, uint32_t length) {
    PlainPaethChain<distance> chain;
    const uint32_t done = undo_paeth_by_runs<distance>(chain, row, above, length);
    undo_paeth_from(done, row, above, length, Distance<distance>());
}

template <class D>
void undo(uint8_t filter, uint8_t *row, const uint8_t *above, uint32_t length, D distance) {
    switch (filter) {
    case FILTER_NONE: return;
    case FILTER_SUB: return undo_sub_from(0, row, length, distance);
    case FILTER_UP: return undo_up_from(0, row, above, length);
    case FILTER_AVERAGE: return undo_average_from(0, row, above, length, distance);
    case FILTER_PAETH: return undo_paeth(row, above, length, distance);
    default:
        // Required: an unknown filter is no error (docs/oddities.md, "Unknown filters").
        if (length > 0) row[0] = 0;
    }
}

} // namespace

void unfilter_plain_from(uint32_t done, uint8_t filter, uint8_t *row, const uint8_t *above, uint32_t length,
                         uint32_t distance) {
    if (done == length) return;
    switch (filter) {
    case FILTER_SUB: return undo_sub_from(done, row, length, distance);
    case FILTER_UP: return undo_up_from(done, row, above, length);
    case FILTER_AVERAGE: return undo_average_from(done, row, above, length, distance);
    case FILTER_PAETH: return undo_paeth_from(done, row, above, length, distance);
    default: return;
    }
}

void unfilter_paeth_by_runs(uint8_t *row, const uint8_t *above, uint32_t length, uint32_t distance) {
    switch (distance) {
    case 1: return undo_paeth_with_runs<1>(row, above, length);
    case 2: return undo_paeth_with_runs<2>(row, above, length);
    case 3: return undo_paeth_with_runs<3>(row, above, length);
    case 4: return undo_paeth_with_runs<4>(row, above, length);
    case 6: return undo_paeth_with_runs<6>(row, above, length);
    case 8: return undo_paeth_with_runs<8>(row, above, length);
    default: return undo_paeth_from(0, row, above, length, distance);
    }
}

void unfilter_plain(uint8_t filter, uint8_t *row, const uint8_t *above, uint32_t length, uint32_t distance) {
    switch (distance) {
    case 1: return undo(filter, row, above, length, Distance<1>());
    case 2: return undo(filter, row, above, length, Distance<2>());
    case 3: return undo(filter, row, above, length, Distance<3>());
    case 4: return undo(filter, row, above, length, Distance<4>());
    case 6: return undo(filter, row, above, length, Distance<6>());
    case 8: return undo(filter, row, above, length, Distance<8>());
    default: return undo(filter, row, above, length, distance);
    }
}

} // namespace pelm

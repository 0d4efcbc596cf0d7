#include "png/unfilter.h"

#include "frame/lanes.h"

#include <algorithm>
#include <cstdlib>
#include <type_traits>

using namespace pelm;

namespace {

// The distance to the byte on the left is a template argument where it is one of those that PNG has, so that the row's
// last pixels stay in registers.
template <uint32_t distance>
using Distance = std::integral_constant<uint32_t, distance>;

template <class D>
void undo_sub(uint8_t *row, uint32_t length, D distance) {
    for (uint32_t i = distance; i < length; ++i)
        row[i] = static_cast<uint8_t>(row[i] + row[i - distance]);
}

void undo_up(uint8_t *__restrict row, const uint8_t *__restrict above, uint32_t length) {
    for (uint32_t i = 0; i < length; ++i)
        row[i] = static_cast<uint8_t>(row[i] + above[i]);
}

// Byte by byte, from byte `i` on: the whole filter, and the end of a row that is no whole pixel.
template <class D>
void undo_average_from(uint32_t i, uint8_t *__restrict row, const uint8_t *__restrict above, uint32_t length,
                       D distance) {
    const uint32_t first = std::min<uint32_t>(distance, length);
    for (; i < first; ++i)
        row[i] = static_cast<uint8_t>(row[i] + (above[i] >> 1));
    for (; i < length; ++i)
        row[i] = static_cast<uint8_t>(row[i] + ((row[i - distance] + above[i]) >> 1));
}

[[maybe_unused]] inline uint8_t paeth(int32_t a, int32_t b, int32_t c) {
    const int32_t pa = std::abs(b - c);
    const int32_t pb = std::abs(a - c);
    const int32_t pc = std::abs(a + b - 2 * c);
    const int32_t b_or_c = pb <= pc ? b : c;
    return static_cast<uint8_t>(((pa <= pb) & (pa <= pc)) != 0 ? a : b_or_c);
}

inline Lanes paeth(Lanes a, Lanes b, Lanes c) {
    const Lanes pa = magnitude(b - c);
    const Lanes pb = magnitude(a - c);
    const Lanes pc = magnitude(a + b - c - c);
    return choose((pa <= pb) & (pa <= pc), a, choose(pb <= pc, b, c));
}

template <class D>
void undo_paeth_from(uint32_t i, uint8_t *__restrict row, const uint8_t *__restrict above, uint32_t length,
                     D distance) {
    const uint32_t first = std::min<uint32_t>(distance, length);
    for (; i < first; ++i)
        row[i] = static_cast<uint8_t>(row[i] + above[i]);
    for (; i < length; ++i)
        row[i] = static_cast<uint8_t>(row[i] + paeth(row[i - distance], above[i], above[i - distance]));
}

template <class D>
void undo_average(uint8_t *row, const uint8_t *above, uint32_t length, D distance) {
    undo_average_from(0, row, above, length, distance);
}

template <class D>
void undo_paeth(uint8_t *row, const uint8_t *above, uint32_t length, D distance) {
    undo_paeth_from(0, row, above, length, distance);
}

// Whole pixels, whose left neighbours stay in registers.
template <uint32_t distance>
void undo_paeth(uint8_t *__restrict row, const uint8_t *__restrict above, uint32_t length, Distance<distance>) {
    int32_t left[distance] = {};
    int32_t above_left[distance] = {};
    uint32_t i = 0;
    for (; i + distance <= length; i += distance)
        for (uint32_t k = 0; k < distance; ++k) {
            const int32_t up = above[i + k];
            left[k] = static_cast<uint8_t>(row[i + k] + paeth(left[k], up, above_left[k]));
            above_left[k] = up;
            row[i + k] = static_cast<uint8_t>(left[k]);
        }
    undo_paeth_from(i, row, above, length, Distance<distance>());
}

// Pixels of four bytes and more, all channels of one at a time.
template <uint32_t distance>
requires(lanes_are_fast &&distance >= 4) void undo_average(uint8_t *row, const uint8_t *above, uint32_t length,
                                                           Distance<distance>) {
    Lanes left{};
    uint32_t i = 0;
    for (; i + distance <= length; i += distance) {
        left = low_byte(load_lanes<distance>(row + i) + ((left + load_lanes<distance>(above + i)) >> 1));
        store_lanes<distance>(row + i, left);
    }
    undo_average_from(i, row, above, length, Distance<distance>());
}

template <uint32_t distance>
requires(lanes_are_fast &&distance >= 4) void undo_paeth(uint8_t *row, const uint8_t *above, uint32_t length,
                                                         Distance<distance>) {
    Lanes left{};
    Lanes above_left{};
    uint32_t i = 0;
    for (; i + distance <= length; i += distance) {
        const Lanes up = load_lanes<distance>(above + i);
        left = low_byte(load_lanes<distance>(row + i) + paeth(left, up, above_left));
        above_left = up;
        store_lanes<distance>(row + i, left);
    }
    undo_paeth_from(i, row, above, length, Distance<distance>());
}

template <class D>
void undo(uint8_t filter, uint8_t *row, const uint8_t *above, uint32_t length, D distance) {
    switch (filter) {
    case 0: return;
    case 1: return undo_sub(row, length, distance);
    case 2: return undo_up(row, above, length);
    case 3: return undo_average(row, above, length, distance);
    case 4: return undo_paeth(row, above, length, distance);
    default:
        // Required: an unknown filter is no error (docs/oddities.md, "Unknown filters").
        if (length > 0) row[0] = 0;
    }
}

} // namespace

void __PELMI_PngReadFilterRow(const PngDecodeState *state, uint8_t *row, const uint8_t *previousRow,
                              uint32_t rowLength) {
    const uint8_t filter = row[-1];
    switch (state->bytesPerPixel) {
    case 1: return undo(filter, row, previousRow, rowLength, Distance<1>());
    case 2: return undo(filter, row, previousRow, rowLength, Distance<2>());
    case 3: return undo(filter, row, previousRow, rowLength, Distance<3>());
    case 4: return undo(filter, row, previousRow, rowLength, Distance<4>());
    case 6: return undo(filter, row, previousRow, rowLength, Distance<6>());
    case 8: return undo(filter, row, previousRow, rowLength, Distance<8>());
    default: return undo(filter, row, previousRow, rowLength, uint32_t{state->bytesPerPixel});
    }
}

// Undoing filters byte by byte: the definition that the other code is held against, and the one for processors without
// vectors, for odd pixel sizes and for what is left of a row.
#pragma once

#include <algorithm>
#include <cstdint>

namespace pelm {

enum PngFilter : uint8_t { FILTER_NONE, FILTER_SUB, FILTER_UP, FILTER_AVERAGE, FILTER_PAETH };

// A whole row in place; `distance` is that to the byte on the left, at least 1.
void unfilter_plain(uint8_t filter, uint8_t *row, const uint8_t *above, uint32_t length, uint32_t distance);

inline int32_t distance_between(int32_t a, int32_t b) {
    return a < b ? b - a : a - b;
}

inline uint8_t paeth_predictor(int32_t left, int32_t up, int32_t up_left) {
    const int32_t from_left = distance_between(up, up_left);
    const int32_t from_up = distance_between(left, up_left);
    const int32_t from_up_left = distance_between(left + up, 2 * up_left);
    const int32_t up_or_up_left = from_up <= from_up_left ? up : up_left;
    return static_cast<uint8_t>(((from_left <= from_up) & (from_left <= from_up_left)) != 0 ? left : up_or_up_left);
}

// From byte `i` on.
template <class D>
inline void undo_sub_from(uint32_t i, uint8_t *row, uint32_t length, D distance) {
    for (i = std::max<uint32_t>(i, distance); i < length; ++i)
        row[i] = static_cast<uint8_t>(row[i] + row[i - distance]);
}

inline void undo_up_from(uint32_t i, uint8_t *__restrict row, const uint8_t *__restrict above, uint32_t length) {
    for (; i < length; ++i)
        row[i] = static_cast<uint8_t>(row[i] + above[i]);
}

template <class D>
inline void undo_average_from(uint32_t i, uint8_t *__restrict row, const uint8_t *__restrict above, uint32_t length,
                              D distance) {
    const uint32_t first = std::min<uint32_t>(distance, length);
    for (; i < first; ++i)
        row[i] = static_cast<uint8_t>(row[i] + (above[i] >> 1));
    for (; i < length; ++i)
        row[i] = static_cast<uint8_t>(row[i] + ((row[i - distance] + above[i]) >> 1));
}

template <class D>
inline void undo_paeth_from(uint32_t i, uint8_t *__restrict row, const uint8_t *__restrict above, uint32_t length,
                            D distance) {
    const uint32_t first = std::min<uint32_t>(distance, length);
    for (; i < first; ++i)
        row[i] = static_cast<uint8_t>(row[i] + above[i]);
    for (; i < length; ++i)
        row[i] = static_cast<uint8_t>(row[i] + paeth_predictor(row[i - distance], above[i], above[i - distance]));
}

} // namespace pelm

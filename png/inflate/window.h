// The bytes that were inflated last: 32768 of them for matches to reach back to, and room behind them for new ones, so
// that matches and runs never wrap. What fills up is handed over, and the history slides back to the front.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace pelm {

constexpr uint32_t window_size = 32768; // how far matches reach
constexpr uint32_t window_room = 65536; // for new bytes, before the history slides
constexpr uint32_t window_full = window_size + window_room;

constexpr uint32_t longest_match = 258;

// A window that is not full has room for a match of any length and for what wide copies write beyond its end.
constexpr uint32_t window_slack = longest_match + 46;
constexpr uint32_t window_allocation = window_full + window_slack;

struct Window {
    uint8_t *bytes;
    uint32_t write;     // index of the next byte
    uint32_t delivered; // bytes from here to `write` have not been handed over yet
    uint32_t total;     // bytes that have ever been produced, modulo 2^32
};

inline bool is_full(const Window &window) {
    return window.write >= window_full;
}

inline void produced(Window &window, uint32_t count) {
    window.write += count;
    window.total += count;
}

// Makes room again, once everything has been handed over.
inline void slide(Window &window) {
    if (!is_full(window)) return;
    std::memcpy(window.bytes, window.bytes + window.write - window_size, window_size);
    window.write = window.delivered = window_size;
}

// Bytes that were never produced read as zeros, without the window having been cleared. Only two matches can meet them:
// one at distance 0, which names the very place that it writes to, and one before the first byte.
inline uint8_t first_byte(const Window &window) {
    return window.write == 0 ? uint8_t{0} : window.bytes[0];
}

// Writes as much of a match of `length` bytes at `distance` as is of one kind, and returns how much that was. The
// window is not full.
// Required: a distance beyond the stream's start yields the stream's first byte until it is in reach
// (docs/oddities.md, "Matches before the beginning").
inline uint32_t copy_match_part(Window &window, uint32_t length, uint32_t distance) {
    uint32_t count = length;
    uint8_t *const out = window.bytes + window.write;
    if (window.write < distance) {
        count = std::min(count, distance - window.write);
        std::memset(out, first_byte(window), count);
    } else if (distance == 0 && window.write < window_size) {
        count = std::min(count, window_size - window.write);
        std::memset(out, 0, count);
    } else {
        const uint8_t *const in = out - (distance == 0 ? window_size : distance);
        for (uint32_t i = 0; i < count; ++i)
            out[i] = in[i]; // the match may repeat itself
    }
    produced(window, count);
    return count;
}

inline void copy_match(Window &window, uint32_t length, uint32_t distance) {
    while (length != 0)
        length -= copy_match_part(window, length, distance);
}

} // namespace pelm

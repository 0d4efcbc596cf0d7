// The last 32768 bytes that were inflated, and the way they leave: in runs that never wrap.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace pelm {

constexpr uint32_t window_size = 32768;

struct Window {
    uint8_t *bytes;
    uint32_t write;     // index of the next byte; window_size when the window is full and must be emptied
    uint32_t delivered; // bytes from here to `write` have not been handed over yet
    uint32_t history;   // bytes that have ever been produced, window_size at most
    uint32_t total;     // bytes that have ever been produced, modulo 2^32
};

inline uint32_t room(const Window &window) {
    return window_size - window.write;
}

inline void produced(Window &window, uint32_t count) {
    window.write += count;
    window.total += count;
    window.history = std::min(window.history + count, window_size);
}

// Makes room again once everything has been handed over.
inline void wrap(Window &window) {
    if (window.write == window_size && window.delivered == window_size) window.write = window.delivered = 0;
}

// Bytes that were never produced read as zeros, without the window having been cleared. Only two matches can meet them:
// one at distance 0, which names the very place that it writes to, and one before the first byte.
inline uint8_t first_byte(const Window &window) {
    return window.history == 0 ? uint8_t{0} : window.bytes[0];
}

// Copies what a match of `length` bytes at `distance` has, as far as there is room, and returns how much it was.
// Required: a distance beyond the stream's start yields the stream's first byte until it is in reach
// (docs/oddities.md, "Matches before the beginning").
inline uint32_t copy_match(Window &window, uint32_t length, uint32_t distance) {
    uint32_t count = std::min(length, room(window));
    uint8_t *const out = window.bytes + window.write;
    if (window.history < distance) {
        count = std::min(count, distance - window.history);
        std::memset(out, first_byte(window), count);
    } else if (distance == 0) {
        if (window.history < window_size) std::memset(out, 0, count);
    } else {
        const uint32_t from = (window.write + window_size - distance) % window_size;
        count = std::min(count, window_size - from);
        const uint8_t *const in = window.bytes + from;
        if (distance >= count || from >= window.write)
            std::memmove(out, in, count);
        else
            for (uint32_t i = 0; i < count; ++i)
                out[i] = in[i]; // the match repeats itself
    }
    produced(window, count);
    return count;
}

} // namespace pelm

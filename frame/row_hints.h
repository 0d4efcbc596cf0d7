// What a few bytes of a row, eight at a time, tell about the whole: flat pictures are full of runs of one sample, and
// some have only few colours.
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace pelm {

inline uint64_t eight_samples(const uint8_t *samples) {
    uint64_t bytes;
    std::memcpy(&bytes, samples, sizeof bytes);
    return bytes;
}

inline bool are_eight_alike(const uint8_t *samples) {
    const uint64_t bytes = eight_samples(samples);
    return bytes == std::rotl(bytes, 8);
}

// What may pay for a row, judged by its whole bytes.
struct RowHints {
    bool has_runs = false;     // of eight bytes that are all alike
    bool is_all_small = false; // no byte is above 15
};

inline RowHints hints_of_row(const uint8_t *samples, int64_t bytes) {
    constexpr int64_t probes = 8;
    const int64_t eights = bytes / 8;
    if (eights < 4 * probes) return {}; // would not repay the looking
    int32_t alike = 0;
    uint64_t any = 0;
    for (int64_t i = 0; i < probes; ++i) {
        const uint64_t eight = eight_samples(samples + static_cast<ptrdiff_t>(8 * (eights * i / probes)));
        alike += eight == std::rotl(eight, 8) ? 1 : 0;
        any |= eight;
    }
    return {4 * alike >= probes, (any & 0xF0F0F0F0F0F0F0F0) == 0};
}

} // namespace pelm

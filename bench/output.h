// What the benchmarks decode to: a box, and pixels of a format.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "PelmImageDecoder.h"

namespace bench {

struct Box {
    int32_t width, height;
};

struct Format {
    const char *name;
    uint32_t code;
    size_t pixel_bytes;
};

inline constexpr Format rgba = {"rgba", PELM_FORMAT_RGBA8888, 4};
inline constexpr Format rgb565 = {"rgb565", PELM_FORMAT_RGB565, 2};

inline size_t bytes_of(const Format &format, Box box) {
    return static_cast<size_t>(box.width) * static_cast<size_t>(box.height) * format.pixel_bytes;
}

// One buffer for all, so that none finds it cold.
inline uint8_t *output_of(size_t size) {
    static std::vector<uint8_t> output;
    output.resize(std::max(output.size(), size));
    return output.data();
}

} // namespace bench

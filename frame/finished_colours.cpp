#include "frame/finished_colours.h"

namespace pelm {

RowOfSamples row_of_samples(uint32_t depth) {
    RowOfSamples row = {};
    for (uint32_t sample = 0; sample < 1u << depth; ++sample) {
        const uint32_t bit = sample * depth;
        row.bytes[bit / 8] = static_cast<uint8_t>(row.bytes[bit / 8] | sample << (8 - depth - bit % 8));
    }
    return row;
}

void fill_finished_colours(FinishedColours &colours, const uint8_t (&pixels)[4 * 256], uint32_t depth, uint32_t size) {
    std::memcpy(colours.pixels, pixels, sizeof pixels);
    if (depth > 2) return;
    const uint32_t in_group = 4 / depth;
    for (uint32_t group = 0; group < 16; ++group)
        for (uint32_t i = 0; i < in_group; ++i) {
            const uint32_t sample = group >> (4 - depth * (i + 1)) & ((1u << depth) - 1);
            std::memcpy(colours.groups[group] + i * size, &colours.pixels[sample], size);
        }
}

} // namespace pelm

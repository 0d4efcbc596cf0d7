// Reduced (or stretched): every output pixel is the sum of four samples, two from each of two source rows.
#include <utility>

#include "frame/packed.h"
#include "frame/sampling.h"
#include "frame/write_row.h"
#include "wbmp/draw.h"

namespace pelm {
namespace {

// What a white sample adds to each channel of 0x00RRGGBB. Required: four of them make 252, not 255 (docs/oddities.md,
// "Reduced WBMP white").
constexpr uint32_t white_sample = 0x3F3F3F;

// The two samples that each output column has in this source row.
void sum_samples(const uint8_t *row, int32_t width, uint32_t *__restrict sums, int32_t scaled_width) {
    const SamplePoints points = quarter_points(width);
    SampleWalk left(points.first, width, scaled_width);
    SampleWalk right(points.second, width, scaled_width);
    for (int32_t i = 0; i < scaled_width; ++i) {
        const uint32_t whites = packed_sample<1>(row, static_cast<int32_t>(left.at)) +
                                packed_sample<1>(row, static_cast<int32_t>(right.at));
        sums[i] = whites * white_sample;
        left.advance();
        right.advance();
    }
}

// The sums of one source row. Sample lines never go back, so what both lines of an output row, or of two that follow
// each other, have in common is summed once.
struct SampledRow {
    uint32_t *sums;
    int32_t index; // of the source row; -1: none yet
};

struct SampledRows {
    SampledRow newest, previous;
};

// nullptr when the row is not delivered. Valid until the call after the next.
const uint32_t *sums_of(SampledRows &sampled, WbmpDrawing &drawing, int32_t index) {
    if (sampled.newest.index == index) return sampled.newest.sums;
    const uint8_t *const row = read_row(drawing.rows, index);
    if (row == nullptr) return nullptr;
    std::swap(sampled.newest, sampled.previous);
    sampled.newest.index = index;
    sum_samples(row, drawing.image.width, sampled.newest.sums, drawing.scaled.width);
    return sampled.newest.sums;
}

// A finished row as a layout of its own. All channels of a sum are equal.
struct GreyRow {
    const uint32_t *upper, *lower;

    Rgb operator()(int32_t x) const {
        const auto grey = static_cast<uint8_t>(upper[x] + lower[x]);
        return {grey, grey, grey};
    }
};

} // namespace

bool reduce_rows(WbmpDrawing &drawing, uint32_t *const (&sums)[2]) {
    const int32_t height = drawing.image.height;
    const int32_t scaled_height = drawing.scaled.height;
    const SamplePoints points = quarter_points(height);
    const int64_t pixel_step = wbmp_pixel_bytes(drawing.format);
    SampledRows sampled = {{sums[0], -1}, {sums[1], -1}};
    int64_t position = drawing.position;
    for (int32_t j = 0; j < scaled_height; ++j, position += drawing.row_step) {
        const auto *const upper = sums_of(sampled, drawing, sampled_at(j, points.first, height, scaled_height));
        if (upper == nullptr) return false;
        const auto *const lower = sums_of(sampled, drawing, sampled_at(j, points.second, height, scaled_height));
        if (lower == nullptr) return false;
        write_row_clipped(drawing.output, position, pixel_step, drawing.format, GreyRow{upper, lower}, 0,
                          drawing.scaled.width);
    }
    return true;
}

} // namespace pelm

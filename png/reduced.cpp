// Reduced (and stretched) output of all other layouts: each output pixel is made of four samples at the quarter points
// of its footprint, weighted by their alpha (png/weighted.h).
#include <algorithm>

#include "frame/host.h"
#include "frame/sampling.h"
#include "frame/write_row.h"
#include "png/loads.h"
#include "png/pixels.h"
#include "png/placing.h"
#include "png/weighted.h"

namespace pelm {
namespace {

void clear_sums(const PngDecodeState &state) {
    ZOTARPELM_OsMemset(state.resizeOutAccum, 0, state.scaledWidth * 4);
}

void unpack_row(const PngDecodeState &state) {
    uint32_t *const words = state.resizeRowAccum;
    const auto width = static_cast<int32_t>(state.imageWidth);
    visit_row(state, [&](const auto &load) {
        for (int32_t x = 0; x < width; ++x)
            words[x] = weighted_word(load(x));
    });
}

// Line 0 of an output row brings samples 0 and 1 of each column, line 1 samples 2 and 3.
void add_sample_line(const PngDecodeState &state, uint32_t line) {
    const auto width = static_cast<int32_t>(state.imageWidth);
    const auto scaled = static_cast<int32_t>(state.scaledWidth);
    SampleWalk left(state.samplePoints[2 * line].x, width, scaled);
    SampleWalk right(state.samplePoints[2 * line + 1].x, width, scaled);
    for (int32_t j = 0; j < scaled; ++j) {
        state.resizeOutAccum[j] +=
            share(state.resizeRowAccum[left.at], 2 * line) + share(state.resizeRowAccum[right.at], 2 * line + 1);
        left.advance();
        right.advance();
    }
}

void write_finished_row(const PngDecodeState &state) {
    const int64_t row = int64_t{state.rowsDone} - state.bandBase;
    const OutputSteps steps = output_steps(state);
    const int64_t position = first_pixel_position(state) + row * steps.row;
    write_row_clipped(state.output, position, steps.pixel, state.outputFormat, WeightedRow{state.resizeOutAccum}, 0,
                      static_cast<int32_t>(state.scaledWidth));
    clear_sums(state);
}

void bring_sums_up_to_date(PngDecodeState &state) {
    if (state.sums == PNG_SUMS_HOLD) return;
    clear_sums(state);
    if (state.sums == PNG_SUMS_LACK_A_LINE) add_sample_line(state, 0);
    state.sums = PNG_SUMS_HOLD;
}

// The source row that holds the sample line that comes next.
uint64_t next_sampled_row(const PngDecodeState &state) {
    const uint64_t point = state.samplePoints[2 * state.resizeState].y;
    return (uint64_t{state.rowsDone} * state.imageHeight + point) / state.scaledHeight;
}

// How far the sample lines get with the source rows up to this one, when none of them can be seen.
void count_sampled_rows(PngDecodeState &state, uint64_t source_row) {
    const uint64_t limit = (source_row + 1) * state.scaledHeight; // lines below this belong to rows so far
    const auto lines_of = [&](uint64_t point) {
        return limit > point ? (limit - point - 1) / state.imageHeight + 1 : 0;
    };
    const uint64_t started = std::min<uint64_t>(lines_of(state.samplePoints[0].y), state.scaledHeight);
    const uint64_t finished = std::min<uint64_t>(lines_of(state.samplePoints[2].y), state.scaledHeight);
    state.rowsDone = static_cast<uint32_t>(finished);
    state.resizeState = started > finished ? 1 : 0;
}

// Passes over a source row of which nothing can be seen, without walking through the output rows that it finishes, or
// along them. What the row in progress needs of it is kept: a later call may show it.
void pass_over_row(PngDecodeState &state) {
    const uint32_t finished_before = state.rowsDone;
    const uint32_t line_before = state.resizeState;
    count_sampled_rows(state, state.rowsWritten);
    if (state.resizeRowAccum == nullptr || state.resizeOutAccum == nullptr) return;
    const bool finished_some = state.rowsDone != finished_before;
    if (finished_some) state.sums = PNG_SUMS_ARE_OLD;
    if (state.resizeState == 0 || (line_before != 0 && !finished_some)) return;
    unpack_row(state);
    state.sums = PNG_SUMS_LACK_A_LINE;
}

} // namespace

void reduce_row(PngDecodeState &state) {
    const uint32_t source_row = state.rowsWritten;
    if (state.output.size == 0 || state.resizeRowAccum == nullptr || state.resizeOutAccum == nullptr)
        return pass_over_row(state);
    if (state.rowsDone >= state.scaledHeight || next_sampled_row(state) != source_row) return;

    bring_sums_up_to_date(state);
    unpack_row(state);
    do {
        add_sample_line(state, state.resizeState);
        if (state.resizeState != 0) {
            write_finished_row(state);
            ++state.rowsDone;
        }
        state.resizeState ^= 1;
    } while (state.rowsDone < state.scaledHeight && next_sampled_row(state) == source_row);
}

} // namespace pelm

// What the row writers share: where a row goes, and which of a row's pixels a reduced one shows.
#pragma once

#include <algorithm>

#include "frame/sampling.h"
#include "gif/colours.h"

namespace pelm {

// In bytes of the output buffer.
struct OutputRow {
    int64_t position; // of its first pixel
    int64_t step;     // from pixel to pixel
};

// The output rows that show the screen's row `sourceRow`: none or one, and several where the image is enlarged.
struct ShownRows {
    int64_t first, end;
};

ShownRows shown_rows(const GifDecoderState &state);

constexpr bool is_shown(ShownRows rows) {
    return rows.first < rows.end;
}

inline OutputRow output_row(const GifDecoderState &state, intptr_t start, int64_t row) {
    const int32_t unit = gif_step_unit(state.outputFormat);
    return {start + row * state.rowStep * unit, int64_t{state.pixelStep} * unit};
}

template <class Load>
struct GatheredRow {
    using Formats = typename Load::Formats;
    const typename Load::Pixel *row;

    typename Load::Pixel operator()(int32_t x) const { return row[x]; }
};

// Writes the samples at the centres of the output's pixels: output pixel j shows column (j x screenWidth +
// screenWidth / 2) / scaledWidth. At most `limit` of them, and those only whose column is below `pixels`.
template <class Load>
void write_samples(const GifDecoderState &state, int64_t position, int64_t step, const Load &load, int32_t pixels,
                   int32_t limit) {
    constexpr int32_t at_once = 256; // keeps the sampling loop apart from the conversion's
    if (state.output.size == 0 || state.scaledWidth <= 0 || pixels <= 0) return;
    typename Load::Pixel gathered[at_once];
    SampleWalk column(state.screenWidth >> 1, state.screenWidth, state.scaledWidth);
    const auto end = static_cast<uint32_t>(pixels);
    for (int32_t done = 0; done < limit && column.at < end;) {
        const int32_t wanted = std::min(at_once, limit - done);
        int32_t count = 0;
        for (; count < wanted && column.at < end; ++count) {
            gathered[count] = load(static_cast<int32_t>(column.at));
            column.advance();
        }
        write_row_clipped(state.output, position, step, state.outputFormat, GatheredRow<Load>{gathered}, 0, count);
        done += count;
        position += count * step;
    }
}

} // namespace pelm

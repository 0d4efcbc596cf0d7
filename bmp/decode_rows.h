// The row decoder that all depths share: where a band's rows lie in the file and in the output, and the two ways to
// write them, pixel for pixel and scaled. Rows come from a reader: plain ones (bmp/row_reader.h) or expanded codes
// (bmp/run_length.h).
#pragma once

#include <algorithm>

#include "bmp/loads.h"
#include "bmp/row_reader.h"
#include "frame/host.h"
#include "frame/sampling.h"
#include "frame/write_row.h"

namespace pelm {

// A band of output rows: `count` rows from row `first` of the scaled image on. Never empty.
struct Band {
    int32_t first, count;
};

// Where the rows of a band go, in the order in which they are finished.
struct OutputRows {
    int64_t position; // byte offset of the next row's first pixel
    int64_t row_step;
    int64_t pixel_step;
};

OutputRows output_rows(const BmpState &state, intptr_t cursor, int32_t count);

// The first and the last stored row that a band needs, counted in the file.
int32_t first_file_row(const BmpState &state, Band band);
int32_t last_file_row(const BmpState &state, Band band);

inline void advance(OutputRows &rows) {
    rows.position += rows.row_step;
}

template <class Reader, class Load>
int32_t copy_rows(const BmpState &state, Band band, Reader &reader, OutputRows to, Load load) {
    const int32_t first = first_file_row(state, band);
    for (int32_t i = 0; i < band.count; ++i) {
        load.row = read_row(reader, first + i);
        if (load.row == nullptr) return reader.result;
        write_row_clipped(state.output.buffer, to.position, to.pixel_step, state.outputFormat, load, 0, state.width);
        advance(to);
    }
    return PELM_RESULT_DONE;
}

// Adds the two samples that each output column has on one sample line.
template <class Load>
void add_sample_line(const Load &load, uint32_t *sums, int32_t width, int32_t scaled_width) {
    const SamplePoints points = quarter_points(width);
    SampleWalk left(points.first, width, scaled_width);
    SampleWalk right(points.second, width, scaled_width);
    for (int32_t j = 0; j < scaled_width; ++j) {
        sums[j] += load.sample(static_cast<int32_t>(left.at)) + load.sample(static_cast<int32_t>(right.at));
        left.advance();
        right.advance();
    }
}

// Scans the band's sample lines in the order in which their rows are stored; rows without one are passed over.
template <class Reader, class Load>
int32_t reduce_rows(const BmpState &state, Band band, Reader &reader, OutputRows to, Load load) {
    const bool downwards = state.topDown != 0;
    const SamplePoints points = quarter_points(state.height);
    const int64_t lines[2] = {downwards ? points.first : points.second, downwards ? points.second : points.first};
    const uint32_t sums_bytes = static_cast<uint32_t>(state.scaledWidth) * 4;
    uint32_t *const sums = state.accumulators;

    ZOTARPELM_OsMemset(sums, 0, sums_bytes);
    for (int32_t i = 0; i < band.count; ++i) {
        const int32_t output_row = downwards ? band.first + i : band.first + band.count - 1 - i;
        for (const int64_t line : lines) {
            const int32_t image_row = sampled_at(output_row, line, state.height, state.scaledHeight);
            load.row = read_row(reader, downwards ? image_row : state.height - 1 - image_row);
            if (load.row == nullptr) return reader.result;
            add_sample_line(load, sums, state.width, state.scaledWidth);
        }
        write_row_clipped(state.output.buffer, to.position, to.pixel_step, state.outputFormat,
                          SumsRow<typename Load::Sum>{sums}, 0, state.scaledWidth);
        ZOTARPELM_OsMemset(sums, 0, sums_bytes);
        advance(to);
    }
    return PELM_RESULT_DONE;
}

// Where nothing can be written the rows are only read, as far as the band needs them.
template <class Reader>
int32_t pass_over_rows(const BmpState &state, Band band, Reader &reader) {
    return read_row(reader, last_file_row(state, band)) != nullptr ? PELM_RESULT_DONE : reader.result;
}

// Decodes `rows` output rows from `state.rowsDone` on. `load` is the layout of the rows that the reader gives; its row
// is filled in here.
template <class Reader, class Load>
int32_t decode_rows_from(const BmpState &state, intptr_t cursor, int32_t rows, const Load &load) {
    const Band band = {state.rowsDone, std::min(rows, state.scaledHeight - state.rowsDone)};
    if (band.count <= 0 || state.scaledWidth <= 0 || state.height == 0) return PELM_RESULT_DONE;

    Reader reader;
    int32_t result = PELM_RESULT_FAILED;
    if (open_rows(reader, state, first_file_row(state, band))) {
        const OutputRows to = output_rows(state, cursor, band.count);
        if (state.output.buffer.size == 0)
            result = pass_over_rows(state, band, reader);
        else if (state.oneToOne != 0)
            result = copy_rows(state, band, reader, to, load);
        else if constexpr (requires { typename Load::Sum; }) // finished pixels cannot be added
            result = reduce_rows(state, band, reader, to, load);
    }
    close_rows(reader);
    return result;
}

// The same for plain rows. Nothing is decoded of a record whose rows are laid out otherwise.
template <class Load>
int32_t decode_rows(const BmpState &state, intptr_t cursor, int32_t rows, const Load &load) {
    if (state.bitsPerPixel != Load::bits) return PELM_RESULT_DONE;
    return decode_rows_from<RowReader>(state, cursor, rows, load);
}

} // namespace pelm

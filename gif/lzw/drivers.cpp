// The three drivers of the decoding loop. They differ in what takes a row and in how long a call lasts.
#include <limits>

#include "frame/sizes.h"
#include "gif/colours.h"
#include "gif/composition.h"
#include "gif/input.h"
#include "gif/line_rows.h"
#include "gif/lzw/loop.h"
#include "gif/working.h"

namespace pelm {
namespace {

constexpr int32_t cycles_per_call = 16;

// What became of a row that was handed on.
enum class Taken {
    next,    // used up
    enough,  // used up, and the call ends
    suspend, // the call ends, and the next one goes on with the same row
    failed
};

struct WholeImage {
    intptr_t start;

    Taken take_row(GifDecoderState &state) const {
        if (state.animated != 0) compose_to_be_shown(state);
        return PELMI_WriteTheLine(&state, start) != 0 ? Taken::next : Taken::failed;
    }
    // Whether the call ends once the buffer holds no complete row.
    bool ends_cycle() { return false; }
    static constexpr int32_t suspended = PELM_RESULT_DONE;
};

struct Slice : WholeImage {
    int32_t cycles;

    bool ends_cycle() { return ++cycles == cycles_per_call; }
    static constexpr int32_t suspended = PELM_RESULT_MORE;
};

struct Lines {
    int32_t wanted;

    Taken take_row(GifDecoderState &state) const {
        for (uint32_t consumed = 0; state.rowsOut < wanted;) {
            if (state.interlaced == 0 && next_row_is_outside(state)) {
                pass_over_output_rows(state, wanted);
                if (state.rowsOut >= wanted) break;
            }
            if (PELMI_GIFMakeOut1Row(&state, 0, &consumed) == 0) return Taken::failed;
            if (consumed != 0) return state.rowsOut < wanted ? Taken::next : Taken::enough;
        }
        return Taken::suspend;
    }
    bool ends_cycle() { return false; }
    static constexpr int32_t suspended = PELM_RESULT_DONE;
};

int32_t result_of(GifEnding ending) {
    return ending == GIF_ENDED ? PELM_RESULT_DONE : PELM_RESULT_FAILED;
}

template <class Driver>
int32_t decode_rows(GifDecoderState &state, Lzw &lzw, Driver &driver) {
    const int32_t width = state.imageWidth;
    while (state.savedRowsDone < state.imageHeight) {
        if (!fill_row(lzw, width)) {
            state.ending = lzw.ending;
            return result_of(lzw.ending);
        }
        do {
            const Taken taken = driver.take_row(state);
            if (taken == Taken::failed) return PELM_RESULT_FAILED;
            if (taken == Taken::suspend) return Driver::suspended;
            drop_row(lzw, width);
            ++state.savedRowsDone;
            if (taken == Taken::enough) return Driver::suspended;
            // Rows without pixels are always complete: only their number ends them.
        } while (width > 0 ? lzw.pixel_count >= width : state.savedRowsDone < state.imageHeight);
        if (driver.ends_cycle()) return Driver::suspended;
    }
    return PELM_RESULT_DONE;
}

// Everything of the image before, up to and including the first code. False when the image ends with it.
bool begin_image(GifDecoderState &state, InputSource *source) {
    GifInput &input = *state.input;
    state.savedCodeSize = state.lzwMinCodeSize + 1;
    state.savedNextCode = (1u << state.lzwMinCodeSize) + 2;
    state.savedBitBuffer = state.savedBitCount = 0;
    state.savedBlockLeft = state.savedPixelCount = state.savedRowsDone = 0;
    state.ending = GIF_FAILED;
    if (state.lzwMinCodeSize >= widest_code || !have_bytes(input, source, 1)) return false;
    begin_strings(state);
    input.bytesLeft = gif_top_up(source, input.buffer, input.cursor, input.bytesLeft);
    input.cursor = input.buffer;

    Lzw lzw = restore(state, source);
    const bool goes_on = read_first_code(lzw);
    save(lzw, state);
    state.ending = lzw.ending;
    return goes_on;
}

template <class Driver>
int32_t go_on(GifDecoderState &state, InputSource *source, Driver driver) {
    if (state.savedRowsDone >= state.imageHeight) return PELM_RESULT_DONE;
    if (state.ending != GIF_GOES_ON) return result_of(state.ending);
    Lzw lzw = restore(state, source);
    const int32_t result = decode_rows(state, lzw, driver);
    save(lzw, state);
    return result;
}

// The rows of a line call; impossible numbers of them are cut to what can be addressed.
OutputBuffer rows_buffer(const GifDecoderState &state, void *buffer, int32_t rows) {
    constexpr auto most = static_cast<size_t>(std::numeric_limits<ptrdiff_t>::max());
    size_t bytes = 0;
    const bool fits = buffer_bytes(state.requestedWidth, rows, GifFormats::size(state.outputFormat), bytes);
    return {static_cast<uint8_t *>(buffer), buffer == nullptr ? 0 : fits ? bytes : most};
}

} // namespace
} // namespace pelm

int32_t PELMI_DecodeGIFImage(InputSource *source, GifDecoderState *state, intptr_t outBuffer) {
    if (!pelm::begin_image(*state, source)) return pelm::result_of(state->ending);
    return pelm::go_on(*state, source, pelm::WholeImage{outBuffer});
}

int32_t PELMI_DecodeGIFImageIter(InputSource *source, GifDecoderState *state, intptr_t outBuffer, uint32_t first) {
    if (first == 0) return pelm::go_on(*state, source, pelm::Slice{{outBuffer}, 0});
    return pelm::begin_image(*state, source) ? PELM_RESULT_MORE : pelm::result_of(state->ending);
}

int32_t PELMI_DecodeGIFImageLine(InputSource *source, GifDecoderState *state, void *outBuffer, int32_t rowsWanted,
                                 uint32_t first) {
    state->rowsOut = 0;
    state->output = pelm::rows_buffer(*state, outBuffer, rowsWanted);
    int32_t result = PELM_RESULT_DONE;
    if (first != 0 && !pelm::begin_image(*state, source))
        result = pelm::result_of(state->ending);
    else if (rowsWanted > 0)
        result = pelm::go_on(*state, source, pelm::Lines{rowsWanted});
    // The end of the data is told once; a call for the rows that are missing fails.
    if (state->ending == GIF_ENDED) state->ending = GIF_FAILED;
    return result;
}

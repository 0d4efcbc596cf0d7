// Tables of the colours that an image's samples stand for, as they lie in the output: for palettes and narrow grey.
#pragma once

#include "frame/finished.h"
#include "png/loads.h"

namespace pelm {

struct FinishedColours {
    uint32_t pixels[256];   // by sample
    uint8_t groups[16][16]; // 1 and 2 bits: by half a byte, the pixels of its samples one behind the other
};

// Fills the state's table in its output format, or makes it NULL: where colours blend with what is in the buffer, and
// for small images.
void finish_colours(PngDecodeState &state);

// A row of samples that the table has.
template <int32_t depth>
struct FinishedRow {
    using Formats = Finished<FullColourFormats>;
    const uint8_t *row;
    const FinishedColours *colours;

    FinishedPixel operator()(int32_t x) const { return {colours->pixels[packed_sample<depth>(row, x)]}; }

    // Group by group, 16 bytes each, however few of them count.
    template <int32_t size>
    requires(depth <= 2) int32_t write_some(int32_t from, int32_t count, uint8_t *out)
    const {
        constexpr int32_t in_byte = 8 / depth;
        if (from % in_byte != 0) return 0;
        const uint8_t *bytes = row + from / in_byte;
        int32_t done = 0;
        for (; (count - done) * size >= in_byte / 2 * size + 16; done += in_byte) {
            std::memcpy(out, colours->groups[*bytes >> 4], 16);
            std::memcpy(out + in_byte / 2 * size, colours->groups[*bytes & 15], 16);
            out += in_byte * size;
            ++bytes;
        }
        return done;
    }
};

// Calls `visit` with the load for the state's current row that is to be written: a finished one where there is.
template <class Visit>
void visit_written_row(const PngDecodeState &state, Visit &&visit) {
    if (state.finished == nullptr) return visit_row(state, visit);
    switch (state.bitDepth) {
    case 1: return visit(FinishedRow<1>{state.currentRow, state.finished});
    case 2: return visit(FinishedRow<2>{state.currentRow, state.finished});
    case 4: return visit(FinishedRow<4>{state.currentRow, state.finished});
    default: return visit(FinishedRow<8>{state.currentRow, state.finished});
    }
}

} // namespace pelm

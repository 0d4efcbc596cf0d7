#include "gif/colours.h"

#include "gif/working.h"

namespace pelm {

const uint32_t *finished_colours(GifDecoderState &state) {
    if (state.coloursAreFinished != 0) return state.finishedTable;
    state.coloursAreFinished = 1;
    uint8_t pixels[256 * 4] = {};
    GifFormats::write_row(state.outputFormat, PackedRow{state.activeTable}, 0, 256, pixels, 4);
    std::memcpy(state.finishedTable, pixels, sizeof pixels);
    return state.finishedTable;
}

} // namespace pelm

void PELMI_MakeColorTable(const uint8_t *raw, int32_t count, uint32_t *table) {
    for (int32_t i = 0; i < count; ++i)
        table[i] = pelm::packed_colour(raw[3 * i], raw[3 * i + 1], raw[3 * i + 2]);
}

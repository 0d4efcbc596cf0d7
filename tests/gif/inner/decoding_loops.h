// A still image's data decoded by the library's working functions, with the fast loop or without, and what is left
// behind.
#pragma once

#include "tests/gif/inner/decoding_record.h"

namespace pelm::test {

struct LoopEnd {
    int32_t result, rows, pixels_waiting, bytes_left;
    uint32_t code_size, next_code, previous, first_pixel;
    Bytes output;

    bool operator==(const LoopEnd &) const = default;
};

enum class Loop { fast, careful };

inline LoopEnd decode_by(Loop loop, const Bytes &file, const GifRequest &request, uint32_t slices) {
    Bytes output(static_cast<size_t>(request.box_width * request.box_height) * 3, 0x5A);
    DecodingRecord record(file, request, false, output.data());
    GifDecoderState &state = *record.state;
    if (loop == Loop::careful) state.fastStrings = nullptr;
    EXPECT_EQ(record.seek(), 1);
    state.sourceRow = state.imageTop;
    InputSource *const source = &record.source.source;
    int32_t result = 4;
    if (slices == 0)
        result = PELMI_DecodeGIFImage(source, &state, state.outputStart);
    else
        for (uint32_t first = 1; result == 4; first = 0)
            result = PELMI_DecodeGIFImageIter(source, &state, state.outputStart, first);
    return {result,
            state.savedRowsDone,
            state.savedPixelCount,
            state.input->bytesLeft,
            state.savedCodeSize,
            state.savedNextCode,
            state.savedPrevCode,
            state.savedFirstPixel,
            output};
}

// What both loops leave behind is the same, in one call and in slices. Empty when it is.
inline std::string loop_difference(const Bytes &file, const GifRequest &request) {
    for (const uint32_t slices : {0u, 1u}) {
        const LoopEnd fast = decode_by(Loop::fast, file, request, slices);
        const LoopEnd careful = decode_by(Loop::careful, file, request, slices);
        if (fast != careful) return std::string("the loops differ") + (slices != 0 ? " in slices" : "");
    }
    return "";
}

} // namespace pelm::test

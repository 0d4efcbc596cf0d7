// A decoder record over a file, made ready by the library and freed at the end.
#pragma once

#include "gif/working.h"
#include "tests/gif/support/gif_check.h"

namespace pelm::test {

struct DecodingRecord {
    DecodingRecord(const Bytes &file, const GifRequest &request, bool animated = false, void *output = nullptr)
        : source(PELM_SOURCE_STREAM, file) {
        info.input = &source.source;
        info.outputFormat = request.format;
        info.flags = request.flags();
        state = PELMI_InitializeGIF(&info, request.box_width, request.box_height, animated ? 1 : 0, output);
    }
    ~DecodingRecord() { PELMI_DelGIFDecoderInfo(state); }
    DecodingRecord(const DecodingRecord &) = delete;
    DecodingRecord &operator=(const DecodingRecord &) = delete;

    int32_t seek() { return PELMI_SeekImageData(&source.source, state); }

    TestSource source;
    ImageDecodeInfo info{};
    GifDecoderState *state;
};

} // namespace pelm::test

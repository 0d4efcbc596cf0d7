#include "tests/bounds/ways.h"

#include <gtest/gtest.h>

#include <algorithm>

#include "tests/support/test_host.h"
#include "tests/support/two_step.h"

namespace pelm::test {
namespace {

constexpr int32_t most_calls = 100000;

int32_t call(Way way, ImageDecodeInfo &info, uint8_t *output, const Asking &asking) {
    const int32_t width = asking.width, height = asking.height, rows = asking.rows != 0 ? asking.rows : height;
    switch (way) {
    case Way::bmp: return ZOTARPELMI_DecodeBMP(&info, output, width, height);
    case Way::bmp_iterative: return ZOTARPELMI_DecodeBMPIter(&info, output, width, height);
    case Way::bmp_bands: return ZOTARPELMI_DecodeBMPIterLine(&info, output, width, height, rows);
    case Way::bmp_lines: return ZOTARPELMI_DecodeBMPLine(&info, output, width, height, rows);
    case Way::bmp_two_steps:
        if (ZOTARPELMI_PreInitBMP(&info, 1) != PELM_RESULT_DONE) return PELM_RESULT_FAILED;
        give_staging(*info.input);
        return ZOTARPELMI_DecodeBMPSKIA(&info, output, width, height);
    case Way::wbmp: return ZOTARPELMI_DecodeWBMP(&info, output, width, height);
    case Way::png: return ZOTARPELMI_DecodePNG(&info, output, width, height);
    case Way::png_iterative: return ZOTARPELMI_DecodePNGIter(&info, output, width, height);
    case Way::png_lines: return ZOTARPELMI_DecodePNGLine(&info, output, width, height, rows);
    case Way::gif: return ZOTARPELMI_DecodeGIF(&info, output, width, height);
    case Way::gif_iterative: return ZOTARPELMI_DecodeGIFIter(&info, output, width, height);
    case Way::gif_lines: return ZOTARPELMI_DecodeGIFLine(&info, output, width, height, rows);
    case Way::frames: return ZOTARPELMI_DecodeAGIF(&info, output, width, height);
    case Way::frames_iterative: return ZOTARPELMI_DecodeAGIFIter(&info, output, width, height);
    }
    return -1;
}

bool goes_on(Way way, const ImageDecodeInfo &info, int32_t result) {
    if (way == Way::bmp_two_steps) return false; // a refusal leaves a pointer that means nothing
    return result != PELM_RESULT_FAILED && info.decoderState != nullptr;
}

// So that one file after the other can be decoded, whatever has become of the last one.
void give_back(ImageDecodeInfo &info) {
    for (void *const table : {info.globalColorTable, info.localColorTable})
        if (table != nullptr) ZOTARPELM_OsFree(table);
}

} // namespace

std::string name_of(Way way) {
    constexpr const char *names[] = {"DecodeBMP",     "DecodeBMPIter", "DecodeBMPIterLine", "DecodeBMPLine",
                                     "DecodeBMPSKIA", "DecodeWBMP",    "DecodePNG",         "DecodePNGIter",
                                     "DecodePNGLine", "DecodeGIF",     "DecodeGIFIter",     "DecodeGIFLine",
                                     "DecodeAGIF",    "DecodeAGIFIter"};
    return names[static_cast<int>(way)];
}

Decoded decode(const Bytes &file, Way way, const Asking &asking) {
    TestSource source(asking.kind, file);
    ImageDecodeInfo info{};
    info.input = &source.source;
    info.outputFormat = asking.format;
    info.flags = asking.flags;
    GuardedBuffer memory;
    const size_t size = asking.has_output ? static_cast<size_t>(std::max(asking.width, 0)) *
                                                static_cast<size_t>(std::max(asking.height, 0)) * 4
                                          : 0;
    uint8_t *const output = memory.take(size, Edge::end);
    std::fill_n(output, size, uint8_t{0});

    Decoded decoded;
    do {
        if (decoded.calls == most_calls) {
            decoded.result = -1;
            break;
        }
        decoded.result = call(way, info, asking.has_output ? output : nullptr, asking);
        ++decoded.calls;
    } while (goes_on(way, info, decoded.result));
    give_back(info);
    decoded.output_width = info.outputWidth;
    decoded.output_height = info.outputHeight;
    decoded.output.assign(output, output + size);
    EXPECT_TRUE(memory.intact()) << name_of(way);
    return decoded;
}

} // namespace pelm::test

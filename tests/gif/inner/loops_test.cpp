// The fast loop and the careful one: the same pixels, the same end and the same place in the file, whatever the codes.
#include "tests/gif/inner/decoding_record.h"

namespace pelm::test {
namespace {

struct LoopEnd {
    int32_t result, rows, pixels_waiting, bytes_left;
    uint32_t code_size, next_code, previous, first_pixel;
    Bytes output;

    bool operator==(const LoopEnd &) const = default;
};

enum class Loop { fast, careful };

LoopEnd decode(const Bytes &file, const GifRequest &request, Loop loop, uint32_t slices) {
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

GifFile file_of(uint16_t width, uint16_t height, int size, const Bytes &data, uint8_t largest) {
    GifFile file;
    file.screen(width, height, distinct_table(256)).descriptor({0, 0, width, height});
    return file.data(size, data, largest).trailer();
}

void expect_same_end(const GifFile &file, const GifRequest &request, const std::string &what) {
    for (const uint32_t slices : {0u, 1u}) {
        const LoopEnd fast = decode(file.bytes, request, Loop::fast, slices);
        const LoopEnd careful = decode(file.bytes, request, Loop::careful, slices);
        ASSERT_TRUE(fast == careful) << what << (slices != 0 ? ", in slices" : "");
    }
}

using GifLoops = GifTest;

TEST_F(GifLoops, agree_on_every_sequence_of_codes) {
    constexpr int size = 2;
    constexpr uint32_t codes = 5;
    const uint32_t sequences = quick_gif_run() ? 1u << 9 : 1u << (3 * codes);
    for (uint32_t sequence = 0; sequence < sequences; ++sequence) {
        Codes list = {clear_code(size)};
        for (uint32_t i = 0; i < codes; ++i)
            list.push_back(sequence >> (3 * i) & 7);
        const GifFile file = file_of(3, 5, size, packed_codes(list, size), 255);
        expect_same_end(file, own_size(3, 5, 1), "sequence " + std::to_string(sequence));
        if (HasFatalFailure()) return;
    }
}

TEST_F(GifLoops, agree_on_streams_that_break_somewhere) {
    const uint32_t seeds = quick_gif_run() ? 40 : 600;
    for (uint32_t seed = 0; seed < seeds; ++seed) {
        Noise noise(seed + 77);
        const auto below = [&noise](uint32_t limit) { return (noise.next() >> 6) % limit; };
        const int size = static_cast<int>(2 + below(7));
        const auto width = static_cast<uint16_t>(1 + below(200));
        const auto height = static_cast<uint16_t>(1 + below(100));
        Codes codes =
            lzw_codes(pixel_runs(size_t{width} * height, 1u << size, 1 + below(60), noise), size,
                      {.clear_every = below(2) == 0 ? 0 : 20 + below(900), .clears_full_table = below(3) > 0});
        const size_t at = below(static_cast<uint32_t>(codes.size()));
        if (below(4) > 0) codes[at] = below(1u << code_widths(codes, size)[at]);
        const GifFile file =
            file_of(width, height, size, packed_codes(codes, size), static_cast<uint8_t>(1 + below(255)));
        expect_same_end(file, own_size(width, height, 1), "seed " + std::to_string(seed));
        if (HasFatalFailure()) return;
    }
}

} // namespace
} // namespace pelm::test

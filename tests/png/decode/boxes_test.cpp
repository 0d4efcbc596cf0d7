// Boxes that no buffer can have: their sizes wrap 32 and 64 bits. Without a buffer every call ends at once, whatever
// the sizes that follow from the box, and nothing is kept.
#include <cstdint>
#include <limits>

#include <sys/mman.h>

#include "png/placing.h"
#include "tests/png/decode/decoding.h"

namespace pelm::test {
namespace {

constexpr int32_t sides[] = {std::numeric_limits<int32_t>::min(), -65536, -1, 0, 1, 65535, 65536, 1 << 30,
                             std::numeric_limits<int32_t>::max()};
constexpr uint32_t placements[] = {PELM_PLACE_FIT, PELM_PLACE_EXACT, PELM_PLACE_STRETCH,
                                   PELM_PLACE_STRETCH | PELM_INTERLACE_FRAME};

Bytes small_png(uint8_t colour_type, uint8_t interlace) {
    Png png;
    png.width = 5;
    png.height = 7;
    png.colour_type = colour_type;
    png.interlace = interlace;
    return build(png);
}

// The request as a one-shot call that succeeds leaves it.
ImageDecodeInfo decode(Bytes &file, void *output, uint32_t flags, uint32_t format, int32_t width, int32_t height) {
    InputSource source{};
    source.kind = PELM_SOURCE_MEMORY;
    source.data = file.data();
    source.size = static_cast<int32_t>(file.size());
    ImageDecodeInfo info{};
    info.input = &source;
    info.flags = flags;
    info.outputFormat = format;
    EXPECT_EQ(ZOTARPELMI_DecodePNG(&info, output, width, height), 1)
        << width << "x" << height << ", flags " << flags << ", format " << format;
    EXPECT_EQ(info.decoderState, nullptr);
    info.input = nullptr; // it ends here
    return info;
}

class PngBoxes : public PngDecoding {};

TEST_F(PngBoxes, that_no_buffer_can_have_end_at_once) {
    for (const uint8_t colour_type : {uint8_t{0}, uint8_t{2}, uint8_t{6}})
        for (const uint8_t interlace : {uint8_t{0}, uint8_t{1}}) {
            const Bytes file = small_png(colour_type, interlace);
            for (const uint32_t placement : placements)
                for (const uint32_t rotation : {PELM_ROTATE_0, PELM_ROTATE_90, PELM_ROTATE_270})
                    for (const int32_t width : sides)
                        for (const int32_t height : sides) {
                            Bytes copy = file;
                            for (const uint32_t format : {PELM_FORMAT_RGB565, PELM_FORMAT_RGBA8888})
                                decode(copy, nullptr, placement | rotation, format, width, height);
                        }
        }
    EXPECT_TRUE(host.live_blocks().empty());
}

// Both sides are reduced alike in single precision, although the height is not: the scaled image is a row too high.
TEST_F(PngBoxes, that_the_scaled_image_outgrows_by_rounding_bound_an_exact_buffer) {
    constexpr int32_t box_height = 16777216;
    PngDecodeState state{};
    state.imageWidth = 2;
    state.imageHeight = 33554434;
    state.outputFormat = PELM_FORMAT_RGB888;
    uint8_t pixel = 0;
    scale_png(state, PELM_PLACE_EXACT, 1, 1, box_height);
    place_png(state, PELM_PLACE_EXACT, 1, box_height);
    use_output(state, &pixel, 1, box_height);
    EXPECT_EQ(state.scaledWidth, 1u);
    EXPECT_EQ(state.scaledHeight, 16777217u);
    EXPECT_EQ(state.output.size, size_t{box_height} * 3);
}

#if UINTPTR_MAX > UINT32_MAX // only large address spaces have such buffers
TEST_F(PngBoxes, whose_rows_exceed_32_bits_are_written_through_the_frame_too) {
    constexpr int32_t width = 600000000;
    constexpr size_t bytes = size_t{width} * 2 * 4;
    void *const memory =
        mmap(nullptr, bytes, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS | MAP_NORESERVE, -1, 0);
    ASSERT_NE(memory, MAP_FAILED);
    Bytes file = small_png(2, 1);
    const ImageDecodeInfo info = decode(file, memory, PELM_INTERLACE_FRAME, PELM_FORMAT_RGBA8888, width, 2);
    ASSERT_EQ(info.outputWidth, 1);
    ASSERT_EQ(info.outputHeight, 2);
    const auto *const pixels = static_cast<const uint8_t *>(memory);
    const size_t column = (size_t{width} - 1) / 2;
    for (const size_t row : {size_t{0}, size_t{1}})
        EXPECT_EQ(pixels[(row * width + column) * 4 + 3], 255) << "alpha of the pixel in row " << row;
    munmap(memory, bytes);
}
#endif

} // namespace
} // namespace pelm::test

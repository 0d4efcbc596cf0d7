// The frame writer alone: words of R, G, B, A through a cursor and steps, as it finds them.
#include "png/frame_buffer.h"
#include "tests/png/interlaced/passes.h"

namespace pelm::test {
namespace {

class PngFrameWriter : public PngDecoding {
protected:
    // A frame of one row, left to right.
    void set_up(uint32_t format, std::vector<uint32_t> frame, Bytes content) {
        words = std::move(frame);
        bytes = std::move(content);
        state = PngDecodeState{};
        state.outputFormat = format;
        state.scaledWidth = static_cast<uint32_t>(words.size());
        state.scaledHeight = 1;
        state.outputStride = state.scaledWidth;
        state.interlaceFrame = words.data();
        state.interlaceFrameUsed = 1;
        const auto size = static_cast<int32_t>(pixel_size(format));
        state.outputPixelStep = format == 0 ? 1 : size;
        state.outputRowStep = static_cast<int32_t>(state.scaledWidth) * size;
        state.output = {bytes.data(), bytes.size()};
    }

    Bytes written(uint32_t format, uint32_t word, bool has_transparency, Bytes content) {
        set_up(format, {word}, std::move(content));
        state.ancillaryFlags = has_transparency ? uint32_t{PNG_HAS_TRNS} : 0u;
        __PELMI_WriteOutputDataFromINTBuffer(&state);
        return bytes;
    }

    PngDecodeState state{};
    std::vector<uint32_t> words;
    Bytes bytes;
};

TEST_F(PngFrameWriter, formats_with_alpha_carry_it) {
    for (const bool has_transparency : {false, true}) {
        EXPECT_EQ(written(7, 0xFF000080, has_transparency, Bytes(4, 9)), (Bytes{255, 0, 0, 128}));
        EXPECT_EQ(written(8, 0xFF000080, has_transparency, Bytes(4, 9)), (Bytes{0, 0, 255, 128}));
        EXPECT_EQ(written(5, 0xFF000080, has_transparency, Bytes(4, 9)), (Bytes{128, 255, 0, 0}));
        EXPECT_EQ(written(6, 0xFF000080, has_transparency, Bytes(3, 9)), (Bytes{0x00, 0xF8, 128}));
        EXPECT_EQ(written(6, 0x12345678, has_transparency, Bytes(3, 9)), (Bytes{0xAA, 0x11, 0x78}));
    }
}

TEST_F(PngFrameWriter, without_a_transparency_chunk_colours_cover_the_buffer) {
    for (const uint32_t alpha : {0u, 1u, 128u, 255u}) {
        EXPECT_EQ(written(1, 0x12345600 | alpha, false, Bytes(3, 9)), (Bytes{0x12, 0x34, 0x56}));
        EXPECT_EQ(written(0, 0x12345600 | alpha, false, Bytes(2, 9)), (Bytes{0xAA, 0x11}));
    }
}

TEST_F(PngFrameWriter, alpha_0_keeps_255_parts_of_256) {
    EXPECT_EQ(written(1, 0xFFFFFF00, true, {255, 128, 1}), (Bytes{254, 127, 0}));
}

TEST_F(PngFrameWriter, alpha_255_gives_255_parts_of_256) {
    EXPECT_EQ(written(1, 0xFF8001FF, true, {9, 9, 9}), (Bytes{254, 127, 0}));
}

TEST_F(PngFrameWriter, every_weight_of_bytes_is_the_alpha_and_255_less_the_alpha) {
    for (uint32_t alpha = 0; alpha < 256; ++alpha)
        for (uint32_t over = 0; over < 256; over += 5)
            for (uint32_t old = 0; old < 256; old += 3) {
                const auto wanted = static_cast<uint8_t>(((old * (255 - alpha)) >> 8) + ((over * alpha) >> 8));
                const auto below = static_cast<uint8_t>(old);
                ASSERT_EQ(written(1, over << 24 | over << 16 | over << 8 | alpha, true, Bytes(3, below)),
                          Bytes(3, wanted))
                    << over << " over " << old << ", alpha " << alpha;
            }
}

TEST_F(PngFrameWriter, every_weight_of_rgb565_is_the_alpha_and_255_less_the_alpha) {
    for (uint32_t alpha = 0; alpha < 256; alpha += 3)
        for (uint32_t old = 0; old < 65536; old += 251)
            for (const uint32_t colour : {0x000000u, 0xFFFFFFu, 0x80C040u, 0x1234FEu}) {
                const auto mix = [&](uint32_t over, uint32_t under) {
                    return (((under * (255 - alpha)) >> 8) + ((over * alpha) >> 8)) & 255;
                };
                const uint32_t r = mix(colour >> 16, (old >> 11) << 3);
                const uint32_t g = mix(colour >> 8 & 255, (old >> 5 & 63) << 2);
                const uint32_t b = mix(colour & 255, (old & 31) << 3);
                const uint32_t wanted = (r >> 3) << 11 | (g >> 2) << 5 | b >> 3;
                const Bytes got =
                    written(0, colour << 8 | alpha, true, {static_cast<uint8_t>(old), static_cast<uint8_t>(old >> 8)});
                ASSERT_EQ(got[0] | got[1] << 8, static_cast<int>(wanted))
                    << colour << " over " << old << ", alpha " << alpha;
            }
}

TEST_F(PngFrameWriter, the_cursor_is_used_as_it_stands_and_left_behind_the_last_row) {
    for (const uint32_t format : written_formats) {
        const auto size = static_cast<int32_t>(pixel_size(format));
        set_up(format, {0x010203FF, 0x040506FF, 0x070809FF, 0x0A0B0CFF}, Bytes(static_cast<size_t>(size) * 20, 0x77));
        state.scaledWidth = state.scaledHeight = 2;
        state.outputRowStep = size * 5;
        state.outputCursor = size * 6;
        __PELMI_WriteOutputDataFromINTBuffer(&state);
        EXPECT_EQ(state.outputCursor, size * 16) << format;
        Bytes expected(static_cast<size_t>(size) * 20, 0x77);
        Canvas canvas(format, expected);
        const Pixel pixels[] = {{1, 2, 3, 255, Coverage::opaque},
                                {4, 5, 6, 255, Coverage::opaque},
                                {7, 8, 9, 255, Coverage::opaque},
                                {10, 11, 12, 255, Coverage::opaque}};
        canvas.put(6, pixels[0]), canvas.put(7, pixels[1]), canvas.put(11, pixels[2]), canvas.put(12, pixels[3]);
        EXPECT_EQ(bytes, expected) << format;
    }
}

TEST_F(PngFrameWriter, steps_may_go_backwards) {
    set_up(7, {0x010203FF, 0x040506FF}, Bytes(8));
    state.outputPixelStep = -4;
    state.outputRowStep = -8;
    state.outputCursor = 4;
    __PELMI_WriteOutputDataFromINTBuffer(&state);
    EXPECT_EQ(bytes, (Bytes{4, 5, 6, 255, 1, 2, 3, 255}));
    EXPECT_EQ(state.outputCursor, -4);
}

TEST_F(PngFrameWriter, steps_of_rgb565_are_in_pixels_along_and_in_bytes_down) {
    set_up(0, {0xFFFFFFFF, 0xFFFFFFFF}, Bytes(8));
    state.outputPixelStep = 2;
    state.outputRowStep = 6;
    __PELMI_WriteOutputDataFromINTBuffer(&state);
    EXPECT_EQ(bytes, (Bytes{255, 255, 0, 0, 255, 255, 0, 0}));
    EXPECT_EQ(state.outputCursor, 6);
}

TEST_F(PngFrameWriter, other_formats_write_nothing) {
    for (const uint32_t format : {2u, 3u, 4u, 9u, 10u, 11u, 12u, 0xFFFFFFFFu})
        EXPECT_EQ(written(format, 0xFFFFFFFF, false, Bytes(8, 9)), Bytes(8, 9));
}

TEST_F(PngFrameWriter, pixels_outside_the_buffer_are_left_out) {
    set_up(1, {0x010101FF, 0x020202FF, 0x030303FF}, Bytes(5, 9));
    state.outputCursor = -3;
    __PELMI_WriteOutputDataFromINTBuffer(&state);
    EXPECT_EQ(bytes, (Bytes{2, 2, 2, 9, 9})) << "the third pixel is one byte short";
}

TEST_F(PngFrameWriter, without_a_frame_nothing_is_written) {
    set_up(7, {0xFFFFFFFF}, Bytes(4, 9));
    state.interlaceFrame = nullptr;
    __PELMI_WriteOutputDataFromINTBuffer(&state);
    EXPECT_EQ(bytes, Bytes(4, 9));
}

} // namespace
} // namespace pelm::test

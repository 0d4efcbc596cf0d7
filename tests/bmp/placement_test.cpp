// Scaled size, placement in the box, and the cursor and steps of every rotation.
#include "bmp/working.h"
#include "tests/bmp/expectations.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

const BmpVariant &rgb24 = variant_named("twenty_four_bits");

class BmpPlacement : public HostedTest {
protected:
    // The record of a decode of a file that holds only a header.
    template <class Check>
    void with_state(int32_t width, int32_t height, const BmpRequest &request, Check check) {
        host.reset();
        BmpFile file;
        file.width = width;
        file.height = height;
        TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
        ImageDecodeInfo info = marked_info(&source.source, request);
        std::vector<uint8_t> output(1 << 16);
        BmpState *const state = PELMI_BMP_Initialize(&info, request.box_width, request.box_height, output.data());
        ASSERT_NE(state, nullptr) << described(request);
        EXPECT_EQ(info.outputWidth, state->scaledWidth);
        EXPECT_EQ(info.outputHeight, state->scaledHeight);
        check(*state);
        PELMI_BMP_DeleteDecInfo(state);
    }
};

TEST_F(BmpPlacement, the_scaled_size_follows_the_box) {
    struct Case {
        int32_t width, height, box_width, box_height;
        uint32_t placement;
        int32_t scaled_width, scaled_height;
        bool one_to_one;
    };
    const Case cases[] = {
        {10, 10, 10, 10, 0, 10, 10, true},      // fits exactly
        {10, 10, 500, 400, 0, 10, 10, true},    // never enlarged
        {10, 10, 10, 10, 0x700, 10, 10, false}, // stretching to the same size still scales
        {10, 10, 25, 3, 0x700, 25, 3, false},   // stretched as asked
        {100, 50, 50, 25, 0, 50, 25, false},    // exact half
        {100, 50, 50, 50, 0, 50, 25, false},    // limited by the width
        {100, 50, 100, 25, 0, 50, 25, false},   // limited by the height
        {100, 50, 200, 25, 0, 50, 25, false},   // a box that is too wide but too low
        {100, 50, 50, 200, 0, 50, 25, false},   // a box that is too high but too narrow
        {100, 51, 50, 26, 0, 50, 26, false},    // 100 * 26 / 51 = 50 is the box's width: the box is taken whole
        {99, 33, 10, 3, 0, 10, 3, false},       // 3.33 -> 3 equals the box
        {33, 99, 3, 10, 0, 3, 10, false},       // the same turned
        {7, 5, 3, 3, 0, 3, 2, false},           // 15 / 7 = 2
        {5, 7, 3, 3, 0, 2, 3, false},           // 15 / 7 = 2
        {640, 480, 320, 200, 0, 266, 200, false},
        {640, 480, 300, 300, 0, 300, 225, false},
        {1000, 10, 100, 100, 0, 100, 1, false},
        {1000, 10, 99, 100, 0, 99, 0, false}, // 0.99 is truncated to nothing
        {10, 1000, 100, 99, 0, 0, 99, false},
        {3, 2, 2, 2, 0x100, 2, 1, false},
        {3, 2, 2, 2, 0x200, 2, 1, false},
    };
    for (const Case &c : cases) {
        with_state(c.width, c.height, {1, 0, c.placement, c.box_width, c.box_height}, [&](const BmpState &state) {
            const std::string what = std::to_string(c.width) + " x " + std::to_string(c.height) + " into " +
                                     std::to_string(c.box_width) + " x " + std::to_string(c.box_height);
            EXPECT_EQ(state.scaledWidth, c.scaled_width) << what;
            EXPECT_EQ(state.scaledHeight, c.scaled_height) << what;
            EXPECT_EQ(state.oneToOne, c.one_to_one ? 1u : 0u) << what;
        });
    }
}

TEST_F(BmpPlacement, the_scaled_size_of_every_small_pair_follows_the_arithmetic) {
    const int32_t most = quick() ? 9 : 17;
    for (int32_t width = 1; width <= most; ++width)
        for (int32_t height = 1; height <= most; ++height)
            for (int32_t bw = 1; bw <= most + 2; ++bw)
                for (int32_t bh = 1; bh <= most + 2; ++bh)
                    with_state(width, height, {1, 0, 0, bw, bh}, [&](const BmpState &state) {
                        const ScaledSize size = scaled_size(width, height, bw, bh, 0);
                        ASSERT_EQ(state.scaledWidth, size.width) << width << "x" << height << " " << bw << "x" << bh;
                        ASSERT_EQ(state.scaledHeight, size.height) << width << "x" << height << " " << bw << "x" << bh;
                        ASSERT_EQ(state.oneToOne, size.one_to_one ? 1u : 0u);
                    });
}

TEST_F(BmpPlacement, the_box_is_turned_with_the_image) {
    for (int turns = 0; turns < 4; ++turns)
        with_state(100, 50, {1, turns, 0, 40, 100}, [&](const BmpState &state) {
            const bool turned = turns % 2 == 1;
            EXPECT_EQ(state.scaledWidth, turned ? 80 : 40) << turns;
            EXPECT_EQ(state.scaledHeight, turned ? 40 : 20) << turns;
            EXPECT_EQ(state.requestedWidth, 40);
            EXPECT_EQ(state.rotation, 90 * turns);
        });
}

struct Geometry {
    int quarter_turns;
    uint32_t format;
    int64_t cursor; // in pixels
    int32_t row_step, pixel_step;
};

TEST_F(BmpPlacement, cursor_and_steps_centre_the_image_in_the_box) {
    // An image of 3 x 2 in a box of 10 x 8: margins of 7 and 6, or turned of 8 and 5.
    const Geometry cases[] = {
        {0, 1, 3 + 10 * 3, 30, 3},        {0, 0, 3 + 10 * 3, 20, 1},
        {0, 5, 3 + 10 * 3, 40, 4},        {0, 6, 3 + 10 * 3, 30, 3},
        {1, 1, 1 + 4 + 10 * 2, -3, 30},   {1, 0, 1 + 4 + 10 * 2, -2, 10},
        {1, 7, 1 + 4 + 10 * 2, -4, 40},   {2, 1, 2 + 3 + 10 * (1 + 3), -30, -3},
        {2, 0, 2 + 3 + 10 * 4, -20, -1},  {2, 8, 2 + 3 + 10 * 4, -40, -4},
        {3, 1, 4 + 10 * (2 + 2), 3, -30}, {3, 0, 4 + 10 * 4, 2, -10},
        {3, 5, 4 + 10 * 4, 4, -40},
    };
    for (const bool top_down : {false, true})
        for (const uint32_t placement : {0u, 0x200u, 0x300u, 0x400u, 0x500u, 0x600u})
            for (const Geometry &c : cases)
                with_state(3, top_down ? -2 : 2, {c.format, c.quarter_turns, placement, 10, 8},
                           [&](const BmpState &state) {
                               const std::string what = "turned " + std::to_string(90 * c.quarter_turns) + ", format " +
                                                        std::to_string(c.format);
                               EXPECT_EQ(state.outputCursor, c.cursor * bytes_per_pixel(c.format)) << what;
                               EXPECT_EQ(state.rowStep, top_down ? -c.row_step : c.row_step) << what;
                               EXPECT_EQ(state.pixelStep, c.pixel_step) << what;
                           });
}

TEST_F(BmpPlacement, an_exact_buffer_has_the_unturned_row_length) {
    // An image of 3 x 2: rows of 3 pixels and 2 of them, also when turned.
    const Geometry cases[] = {
        {0, 1, 0, 9, 3},   {0, 0, 0, 6, 1},   {1, 1, 1 + 0 + 3 * -1, -3, 9}, // (3 - 2) >> 1 = 0, (2 - 3) >> 1 = -1
        {1, 0, -2, -2, 3}, {2, 1, 5, -9, -3}, {3, 1, 0 + 3 * (2 - 1), 3, -9}, {3, 7, 3, 4, -12},
    };
    for (const Geometry &c : cases)
        with_state(3, 2, {c.format, c.quarter_turns, 0x100, 10, 8}, [&](const BmpState &state) {
            EXPECT_EQ(state.outputCursor, c.cursor * bytes_per_pixel(c.format)) << "turned " << 90 * c.quarter_turns;
            EXPECT_EQ(state.rowStep, c.row_step) << "turned " << 90 * c.quarter_turns;
            EXPECT_EQ(state.pixelStep, c.pixel_step) << "turned " << 90 * c.quarter_turns;
        });
}

TEST_F(BmpPlacement, centring_rounds_towards_the_top_left) {
    // A single pixel in a box of 4 x 4 lies at (1, 1) whichever way it is turned.
    for (int turns = 0; turns < 4; ++turns) {
        BmpSubject subject(flat_bmp(rgb24, 1, 1, 0x102030));
        TestSource source(PELM_SOURCE_MEMORY, file_bytes(subject.file()));
        const BmpDecode decode = decode_bmp(source, {1, turns, 0, 4, 4}, 48);
        Bytes expected(48, background);
        expected[15] = 0x10;
        expected[16] = 0x20;
        expected[17] = 0x30;
        EXPECT_EQ(decode.output, expected) << "turned " << 90 * turns;
    }
}

TEST_F(BmpPlacement, only_the_placement_bits_0x700_and_0x100_mean_something) {
    for (uint32_t placement = 0; placement <= 0x700; placement += 0x100)
        for (int turns = 0; turns < 4; ++turns)
            for (const bool top_down : {false, true}) {
                BmpSubject subject(noise_bmp(rgb24, 7, 4, top_down));
                for (const int32_t more : {-3, 0, 5})
                    EXPECT_TRUE(decodes_as_computed_at_both_edges(
                        subject, request_for(7, 4, 7, turns, placement, more, more + 1)));
            }
}

TEST_F(BmpPlacement, other_bits_of_the_flags_are_not_looked_at) {
    const Bytes bytes = file_bytes(noise_bmp(rgb24, 7, 4, false));
    for (uint32_t bit = 0; bit < 32; ++bit) {
        const uint32_t flag = 1u << bit;
        if ((flag & (PELM_ROTATE_MASK | PELM_PLACE_MASK)) != 0) continue;
        Bytes outputs[2];
        for (int with = 0; with < 2; ++with) {
            TestSource source(PELM_SOURCE_MEMORY, bytes);
            ImageDecodeInfo info{};
            info.input = &source.source;
            info.outputFormat = 1;
            info.flags = PELM_ROTATE_90 | (with != 0 ? flag : 0);
            outputs[with].assign(9 * 9 * 3, background);
            EXPECT_EQ(ZOTARPELMI_DecodeBMP(&info, outputs[with].data(), 9, 9), 1);
        }
        EXPECT_EQ(outputs[0], outputs[1]) << "bit " << bit;
    }
}

TEST_F(BmpPlacement, a_turned_picture_is_the_picture_turned) {
    const BmpFile file = noise_bmp(rgb24, 5, 3, false);
    const auto decoded = [&](int turns) {
        TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
        return decode_bmp(source, request_for(5, 3, 1, turns, 0), 45).output;
    };
    const auto pixel = [](const Bytes &output, int width, int x, int y) {
        const auto at = output.begin() + 3 * (y * width + x);
        return Bytes(at, at + 3);
    };
    const Bytes upright = decoded(0), quarter = decoded(1), half = decoded(2), three_quarters = decoded(3);
    for (int y = 0; y < 3; ++y)
        for (int x = 0; x < 5; ++x) {
            const Bytes color = pixel(upright, 5, x, y);
            EXPECT_EQ(pixel(quarter, 3, 2 - y, x), color) << "(" << x << ", " << y << ") turned 90";
            EXPECT_EQ(pixel(half, 5, 4 - x, 2 - y), color) << "(" << x << ", " << y << ") turned 180";
            EXPECT_EQ(pixel(three_quarters, 3, y, 4 - x), color) << "(" << x << ", " << y << ") turned 270";
        }
}

TEST_F(BmpPlacement, the_first_file_row_is_the_lowest_unless_the_height_is_negative) {
    BmpFile file;
    file.width = 1;
    file.height = 2;
    file.rows = {{1, 2, 3}, {4, 5, 6}};
    TestSource bottom_up(PELM_SOURCE_MEMORY, file_bytes(file));
    EXPECT_EQ(decode_bmp(bottom_up, {1, 0, 0, 1, 2}, 6).output, (Bytes{6, 5, 4, 3, 2, 1}));
    file.height = -2;
    TestSource top_down(PELM_SOURCE_MEMORY, file_bytes(file));
    EXPECT_EQ(decode_bmp(top_down, {1, 0, 0, 1, 2}, 6).output, (Bytes{3, 2, 1, 6, 5, 4}));
}

TEST_F(BmpPlacement, offsets_beyond_32_bits_still_meet_the_buffer) {
    // Turned in an exact buffer, most of a very wide line lies outside it, far before and far behind; the pixel in the
    // middle lies inside.
    const int32_t width = 100000;
    for (const int turns : {1, 3})
        for (const uint32_t format : {0u, 1u, 7u}) {
            const BmpRequest request{format, turns, 0x100, 1, width};
            BmpSubject subject(noise_bmp(variant_named("one_bit"), width, 1, false));
            EXPECT_EQ(subject.expect(request).pixels_landed, 1u);
            if (sizeof(void *) > 4) {
                EXPECT_TRUE(decodes_as_computed_at_both_edges(subject, request));
                continue;
            }
            // The record's word for the cursor cannot hold such a place on a 32-bit system: refused.
            TestSource source(PELM_SOURCE_MEMORY, file_bytes(subject.file()));
            const BmpDecode decode = decode_bmp(source, request, subject.expect(request).output.size());
            EXPECT_EQ(decode.result, 0);
            EXPECT_EQ(decode.output, Bytes(decode.output.size(), background));
            EXPECT_EQ(decode.misbehaviour, "");
            EXPECT_TRUE(decode.live_blocks.empty());
        }
}

} // namespace
} // namespace pelm::test

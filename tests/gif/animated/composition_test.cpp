// What a frame shows and what it leaves for the next one: disposal, transparency and place, one by one with colours
// worked out by hand, and all together against the model.
#include "tests/gif/animated/frames.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

constexpr uint16_t width = 10, height = 8;
using Pixel = std::array<uint8_t, 4>;
constexpr Pixel never = {0, 0, 0, 0}; // in format 7

Pixel opaque(const ColourTable &table, size_t index) {
    return {table[index * 3], table[index * 3 + 1], table[index * 3 + 2], 255};
}

Pixel at(const Bytes &output, size_t x, size_t y) {
    const uint8_t *const pixel = &output[(y * width + x) * 4];
    return {pixel[0], pixel[1], pixel[2], pixel[3]};
}

Frame plain(const ImagePlace &place, uint8_t index, const GraphicControl &control) {
    return {place, control, {}, true, Bytes(size_t{place.width} * place.height, index)};
}

class GifComposition : public GifTest {
protected:
    // First a whole screen of index 2, then the frame, then one pixel: what the third call shows where the frame was is
    // what the frame left on the canvas.
    static std::vector<DeliveredFrame> over_a_screen(const Frame &frame) {
        Animation animation{width, height, 3, 5, {}, true, 1};
        animation.frames = {plain({0, 0, width, height}, 2, {1, -1}), frame, plain({0, 0, 1, 1}, 0, {1, -1})};
        for (const DeliveredFrame &other : frames_of(animation.file(), request, GifCall::frame_iterative))
            EXPECT_NE(other.result, 0);
        return frames_of(animation.file(), request);
    }
    static constexpr GifRequest request{7, 0, 0, width, height};
    const ColourTable table = Animation{}.table();
};

TEST_F(GifComposition, a_frame_that_stays_is_shown_by_the_next) {
    for (const uint8_t disposal : std::initializer_list<uint8_t>{0, 1, 4, 5, 6, 7}) {
        const auto frames = over_a_screen(plain({3, 2, 4, 3}, 6, {disposal, -1}));
        ASSERT_EQ(frames.size(), 3u);
        EXPECT_EQ(at(frames[1].output, 3, 2), opaque(table, 6));
        EXPECT_EQ(at(frames[1].output, 2, 2), opaque(table, 2));
        EXPECT_EQ(at(frames[2].output, 6, 4), opaque(table, 6));
        EXPECT_EQ(at(frames[2].output, 7, 4), opaque(table, 2));
    }
}

TEST_F(GifComposition, disposal_2_leaves_the_background_colour_without_transparency) {
    const auto frames = over_a_screen(plain({3, 2, 4, 3}, 6, {2, -1}));
    ASSERT_EQ(frames.size(), 3u);
    EXPECT_EQ(at(frames[1].output, 3, 2), opaque(table, 6));
    EXPECT_EQ(at(frames[2].output, 3, 2), opaque(table, 5));
    EXPECT_EQ(at(frames[2].output, 2, 2), opaque(table, 2));
}

TEST_F(GifComposition, disposal_2_with_transparency_leaves_pixels_that_were_never_painted) {
    const auto frames = over_a_screen(plain({3, 2, 4, 3}, 6, {2, 0}));
    ASSERT_EQ(frames.size(), 3u);
    EXPECT_EQ(at(frames[1].output, 3, 2), opaque(table, 6));
    EXPECT_EQ(at(frames[2].output, 3, 2), never);
    const auto transparent = over_a_screen(plain({3, 2, 4, 3}, 6, {2, 6}));
    EXPECT_EQ(at(transparent[1].output, 3, 2), opaque(table, 2)) << "the old canvas is shown";
    EXPECT_EQ(at(transparent[2].output, 3, 2), never) << "and cleared";
}

TEST_F(GifComposition, disposal_3_leaves_the_canvas_as_it_was) {
    for (const int transparent : {-1, 0, 6}) {
        const auto frames = over_a_screen(plain({3, 2, 4, 3}, 6, {3, transparent}));
        ASSERT_EQ(frames.size(), 3u);
        EXPECT_EQ(at(frames[1].output, 3, 2), opaque(table, transparent == 6 ? 2 : 6));
        EXPECT_EQ(at(frames[2].output, 3, 2), opaque(table, 2));
    }
}

TEST_F(GifComposition, transparent_pixels_show_the_canvas) {
    const auto frames = over_a_screen(plain({3, 2, 4, 3}, 6, {1, 6}));
    EXPECT_EQ(at(frames[1].output, 3, 2), opaque(table, 2));
    EXPECT_EQ(at(frames[2].output, 3, 2), opaque(table, 2));
}

TEST_F(GifComposition, what_no_frame_painted_is_transparent_in_format_7_and_white_in_all_others) {
    Animation animation{20, 20, 3, 5, {}, true, 1};
    animation.frames = {plain({5, 5, 10, 10}, 6, {1, -1})};
    for (const uint32_t format : gif_formats)
        for (const int32_t side : {20, 7}) { // one to one and reduced
            const auto frames = frames_of(animation.file(), {format, 0, 0, side, side});
            ASSERT_EQ(frames.size(), 1u);
            const size_t size = static_cast<size_t>(gif_pixel_bytes(format));
            const uint8_t expected = format == 7 ? 0 : 255;
            const Bytes &output = frames[0].output;
            EXPECT_EQ(Bytes(output.begin(), output.begin() + static_cast<ptrdiff_t>(size)), Bytes(size, expected));
            EXPECT_EQ(Bytes(output.end() - static_cast<ptrdiff_t>(size), output.end()), Bytes(size, expected));
            const size_t centre = static_cast<size_t>(side) / 2 * (static_cast<size_t>(side) + 1) * size;
            const auto pixel = output.begin() + static_cast<ptrdiff_t>(centre);
            EXPECT_NE(Bytes(pixel, pixel + static_cast<ptrdiff_t>(size)), Bytes(size, expected));
        }
}

TEST_F(GifComposition, a_frame_without_its_own_control_inherits_the_one_before) {
    Animation animation{width, height, 3, 5, {}, true, 1};
    Frame heir = plain({0, 0, width, height}, 6, {});
    heir.has_control = false;
    animation.frames = {plain({0, 0, width, height}, 2, {1, 6, 7}), heir};
    const auto frames = frames_of(animation.file(), request);
    ASSERT_EQ(frames.size(), 2u);
    EXPECT_EQ(at(frames[1].output, 4, 4), opaque(table, 2)) << "index 6 is still transparent";
    EXPECT_EQ(frames[1].words.frame_delay, 70u);
}

// Every place that a frame can have: inside, touching the edges, outside, empty, larger than the screen.
constexpr ImagePlace places[] = {
    {2, 3, 4, 3},       {0, 0, width, height}, {0, 0, 3, 2},        {7, 6, 3, 2},        {7, 0, 3, 8},
    {0, 7, 10, 1},      {8, 6, 5, 5},          {10, 2, 3, 3},       {12, 2, 3, 3},       {3, 8, 3, 3},
    {3, 20, 3, 3},      {65535, 65535, 3, 2},  {0, 0, 0, 0},        {4, 4, 0, 3},        {4, 4, 3, 0},
    {10, 8, 0, 0},      {0, 0, 13, 11},        {3, 2, 30, 3},       {2, 3, 3, 30},       {9, 7, 1, 1},
    {1, 2, 5, 5, true}, {0, 0, 10, 8, true},   {2, 0, 4, 4, true},  {2, 3, 4, 3, true},  {1, 5, 3, 2, true},
    {0, 7, 4, 5, true}, {0, 1, 5, 17, true},   {6, 0, 9, 12, true}, {3, 30, 3, 9, true},
};

TEST_F(GifComposition, every_disposal_transparency_and_place_together) {
    uint32_t seed = 0;
    for (const ImagePlace &place : places)
        for (uint8_t disposal = 0; disposal < 8; ++disposal)
            for (const int transparent : {-1, 0, 3}) {
                ++seed;
                if (quick() && seed % 5 != 0) continue;
                Animation animation{width, height, 2, static_cast<uint8_t>(seed % 5), {}, true, seed};
                animation.frames = {{{0, 0, width, height}, {1, -1, 3}},
                                    {place, {disposal, transparent, 5}},
                                    {{1, 1, 7, 5}, {static_cast<uint8_t>(seed % 4), transparent}},
                                    {place, {static_cast<uint8_t>(seed % 3 + 1), 2}, distinct_table(8, seed)},
                                    {{0, 0, width, height}, {1, 1}}};
                for (const GifCall call : frame_calls)
                    EXPECT_EQ(gif_difference(animation.file(), request, call), "")
                        << place.left << " " << place.top << " " << place.width << " x " << place.height;
            }
}

TEST_F(GifComposition, every_format_rotation_and_size) {
    for (const ImagePlace &place : places)
        for (const uint32_t format : {0u, 1u, 5u, 7u, 8u, 10u, 11u, 12u, 6u}) {
            const uint32_t seed = format + place.left;
            if (quick() && seed % 4 != 0) continue;
            Animation animation{width, height, 2, 2, {}, true, seed};
            animation.frames = {{{3, 2, 4, 4}, {2, 1, 3}},
                                {place, {2, 2, 5}},
                                {{1, 1, 7, 5}, {3, -1}},
                                {{0, 0, width, height}, {1, 1}}};
            for (uint32_t turns = 0; turns < 4; ++turns)
                for (const GifRequest &box :
                     {GifRequest{format, turns, 0, turns % 2 ? height : width, turns % 2 ? width : height},
                      GifRequest{format, turns, 0, 13, 17}, GifRequest{format, turns, 0, 6, 6},
                      GifRequest{format, turns, 0x100, 7, 5}, GifRequest{format, turns, 0x700, 4, 15},
                      GifRequest{format, turns, 0x700, 25, 21}})
                    EXPECT_EQ(gif_difference(animation.file(), box, frame_calls[turns % 2]), "");
        }
}

TEST_F(GifComposition, rows_above_an_interlaced_frame_move_its_passes_on) {
    // Rows above are counted like rows of the frame: a frame far enough down starts in a later pass.
    for (uint16_t top = 0; top < 24; ++top)
        for (uint16_t rows = 1; rows < 20; ++rows) {
            Animation animation{4, 30, 2, 2, {}, true, top};
            animation.frames = {{{0, top, 4, rows, true}, {1, -1}}, {{1, 0, 2, 30}, {1, 1}}};
            for (const GifCall call : frame_calls)
                EXPECT_EQ(gif_difference(animation.file(), {1, 0, 0, 4, 30}, call), "") << rows << " from " << top;
        }
}

} // namespace
} // namespace pelm::test

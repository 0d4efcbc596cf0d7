// Where the pixels land: boxes, centring, rotation at the image's own size, exact placement.
#include "tests/png/decode/decoding.h"

namespace pelm::test {
namespace {

class PngPlacement : public PngDecoding {
protected:
    // The words that the caller reads, after a one-shot call into no buffer at all.
    static std::pair<int32_t, int32_t> scaled_size(uint32_t width, uint32_t height, const Request &request) {
        const Picture picture = noise_picture(grey, 1, width, height);
        Decode decode(file_of(picture), PELM_SOURCE_MEMORY, request);
        EXPECT_EQ(decode.one_shot(nullptr), 1);
        EXPECT_EQ(decode.info.decodeStarted, 1u);
        EXPECT_EQ(decode.info.iterative, 0u);
        return {decode.info.outputWidth, decode.info.outputHeight};
    }
    // The first pixel of the buffer that differs from the background.
    static std::pair<int32_t, int32_t> first_written(const Picture &picture, const Request &request) {
        const size_t size = buffer_size(picture, request);
        const Outcome outcome = run(file_of(picture), PELM_SOURCE_MEMORY, request, size);
        EXPECT_EQ(flaws(outcome), "");
        const Bytes before = background(size);
        for (size_t i = 0; i < size; ++i)
            if (outcome.output[i] != before[i]) {
                const int32_t pixel = static_cast<int32_t>(i / pixel_size(request.format));
                return {pixel % request.box_width, pixel / request.box_width};
            }
        return {-1, -1};
    }
};

using Pair = std::pair<int32_t, int32_t>;

TEST_F(PngPlacement, an_image_is_never_enlarged_and_centred) {
    EXPECT_EQ(scaled_size(100, 50, {7, 0, 400, 400}), Pair(100, 50));
    const Picture white{100, 50, grey, 8, Bytes(5000, 255), {}, {}};
    EXPECT_EQ(first_written(white, {7, 0, 400, 400}), Pair(150, 175));
    EXPECT_EQ(first_written(white, {7, 0, 401, 399}), Pair(150, 174));
}

TEST_F(PngPlacement, a_large_image_is_fitted_with_its_aspect) {
    EXPECT_EQ(scaled_size(400, 100, {7, 0, 200, 200}), Pair(200, 50));
    EXPECT_EQ(scaled_size(100, 400, {7, 0, 200, 200}), Pair(50, 200));
    EXPECT_EQ(scaled_size(100, 10, {7, 0, 50, 50}), Pair(50, 5));
    EXPECT_EQ(scaled_size(100, 100, {7, 0, 99, 1000}), Pair(99, 99));
    EXPECT_EQ(scaled_size(31, 17, {7, 0, 30, 17}), Pair(30, 16));
}

TEST_F(PngPlacement, a_turned_image_is_fitted_against_the_turned_box) {
    EXPECT_EQ(scaled_size(400, 100, {7, PELM_ROTATE_90, 200, 100}), Pair(100, 25));
    EXPECT_EQ(scaled_size(100, 400, {7, PELM_ROTATE_90, 200, 100}), Pair(50, 200));
    EXPECT_EQ(scaled_size(100, 400, {7, PELM_ROTATE_270, 200, 100}), Pair(50, 200));
    EXPECT_EQ(scaled_size(100, 400, {7, PELM_ROTATE_180, 200, 100}), Pair(25, 100));
}

TEST_F(PngPlacement, stretching_takes_the_box_whatever_the_aspect) {
    EXPECT_EQ(scaled_size(10, 10, {7, 0x700, 40, 5}), Pair(40, 5));
    EXPECT_EQ(scaled_size(10, 10, {7, 0x700, 10, 10}), Pair(10, 10));
    EXPECT_EQ(scaled_size(10, 10, {7, 0x700 | PELM_ROTATE_90, 40, 5}), Pair(5, 40));
}

TEST_F(PngPlacement, other_placement_bits_fit_and_centre) {
    for (const uint32_t placement : {0x200u, 0x300u, 0x400u, 0x500u, 0x600u}) {
        EXPECT_EQ(scaled_size(20, 10, {7, placement, 10, 10}), Pair(10, 5));
        const Picture picture = noise_picture(rgb, 8, 5, 3);
        EXPECT_EQ(one_shot_difference(picture, file_of(picture), PELM_SOURCE_MEMORY, {7, placement, 9, 9}), "");
    }
}

TEST_F(PngPlacement, no_other_flag_changes_anything) {
    const Picture picture = noise_picture(rgb_alpha, 8, 9, 6);
    for (const uint32_t flags : {0x1u, 0x2u, 0x10u, 0x80u, 0x800u, 0x1000u, 0x2000u, 0x3000u, 0xFFFFC000u})
        for (const int32_t side : {12, 4}) {
            const Request plain{1, 0, side, side};
            Bytes expected = background(buffer_size(picture, plain));
            draw(picture, plain, expected);
            const Outcome outcome = run(file_of(picture), PELM_SOURCE_MEMORY, {1, flags, side, side}, expected.size());
            EXPECT_EQ(flaws(outcome), "");
            EXPECT_EQ(difference(expected, outcome.output, picture, plain), "") << "flags " << flags;
        }
}

TEST_F(PngPlacement, boxes_as_large_or_larger_hold_the_image_at_its_own_size) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{indexed, 2}, Layout{grey, 8}, Layout{grey_alpha, 8}}) {
        const Picture picture = with_transparency(noise_picture(layout.colour_type, layout.depth, 6, 4));
        const Bytes file = file_of(picture);
        for (int32_t width = 6; width < 11; ++width)
            for (int32_t height = 4; height < 9; ++height)
                for (const uint32_t format : written_formats)
                    for (const uint32_t placement : {0x000u, 0x100u})
                        EXPECT_EQ(
                            one_shot_difference(picture, file, PELM_SOURCE_MEMORY, {format, placement, width, height}),
                            "");
    }
}

// Rows keep their direction. They are placed as if they had been turned: they run on into the next line of the buffer,
// and what falls out of it is dropped.
TEST_F(PngPlacement, rotation_at_the_images_own_size_places_rows_for_the_turned_size) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{grey, 8}, Layout{indexed, 4}, Layout{rgb_alpha, 16}})
        for (const auto &[width, height] : {std::pair(9u, 4u), std::pair(4u, 9u), std::pair(6u, 6u)}) {
            const Picture picture = with_transparency(noise_picture(layout.colour_type, layout.depth, width, height));
            const Bytes file = file_of(picture);
            for (const uint32_t turn : {PELM_ROTATE_90, PELM_ROTATE_180, PELM_ROTATE_270})
                for (const uint32_t placement : {0x000u, 0x100u})
                    for (const int32_t box_width : {9, 10, 13})
                        for (const int32_t box_height : {9, 12})
                            for (const uint32_t format : written_formats)
                                EXPECT_EQ(one_shot_difference(picture, file, PELM_SOURCE_MEMORY,
                                                              {format, turn | placement, box_width, box_height}),
                                          "");
        }
}

TEST_F(PngPlacement, a_turned_row_runs_on_into_the_next_line) {
    // 3 x 2 turned by 90 degrees in a box of 2 x 3: placed at (0, 0), rows of 3 pixels on lines of 2.
    const Picture picture{3, 2, grey, 8, {1, 2, 3, 4, 5, 6}, {}, {}};
    Output output(2 * 3 * 3);
    Decode decode(file_of(picture), PELM_SOURCE_MEMORY, {1, PELM_ROTATE_90, 2, 3});
    EXPECT_EQ(decode.one_shot(output.data()), 1);
    // Row 0 covers pixels 0 to 2, row 1 begins at pixel 2 and overwrites it.
    const Bytes before = background(18);
    EXPECT_EQ(output.bytes(), (Bytes{1, 1, 1, 2, 2, 2, 4, 4, 4, 5, 5, 5, 6, 6, 6, before[15], before[16], before[17]}));
}

TEST_F(PngPlacement, what_a_turned_image_drops_below_the_box_is_not_written) {
    // 2 x 6 turned by 90 degrees in a box of 6 x 2: six rows from line 0 on, of which two fit.
    const Picture picture = noise_picture(rgb, 8, 2, 6);
    const Request request{7, PELM_ROTATE_90, 6, 2};
    const Outcome outcome = run(file_of(picture), PELM_SOURCE_MEMORY, request, 6 * 2 * 4);
    EXPECT_EQ(flaws(outcome), "");
    Bytes expected = background(48);
    for (uint32_t y = 0; y < 2; ++y)
        for (uint32_t x = 0; x < 2; ++x) {
            const Pixel p = picture.pixel(x, y);
            const size_t at = (y * 6 + x) * 4;
            expected[at] = p.r, expected[at + 1] = p.g, expected[at + 2] = p.b, expected[at + 3] = 255;
        }
    EXPECT_EQ(outcome.output, expected);
}

TEST_F(PngPlacement, exact_placement_uses_the_scaled_width_as_the_row_length) {
    for (const Layout layout : all_layouts) {
        const Picture picture = noise_picture(layout.colour_type, layout.depth, 14, 9);
        const Bytes file = file_of(picture);
        for (const uint32_t turn : {0u, 4u, 8u, 12u})
            for (const int32_t side : {30, 14, 9, 8, 5})
                EXPECT_EQ(one_shot_difference(picture, file, PELM_SOURCE_MEMORY, {7, turn | 0x100, side, side}), "");
    }
}

TEST_F(PngPlacement, an_empty_box_succeeds_before_anything_more_is_allocated) {
    for (const uint32_t placement : {0x000u, 0x100u, 0x700u})
        for (const auto &[width, height] : {Pair(0, 0), Pair(0, 5), Pair(5, 0)}) {
            reset();
            const Picture picture = noise_picture(rgb, 8, 8, 8);
            const Outcome outcome = run(file_of(picture), PELM_SOURCE_MEMORY, {7, placement, width, height}, 100);
            EXPECT_EQ(flaws(outcome), "");
            EXPECT_EQ(outcome.output, background(100));
            EXPECT_EQ(host.allocations.size(), 3u) << "state, reader, index";
        }
}

TEST_F(PngPlacement, a_side_that_scales_to_nothing_succeeds_and_is_reported) {
    EXPECT_EQ(scaled_size(100, 1, {7, 0, 50, 50}), Pair(50, 0));
    EXPECT_EQ(scaled_size(1, 100, {7, 0, 50, 50}), Pair(0, 50));
    for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
        const Outcome outcome =
            run(file_of(noise_picture(rgb, 8, 100, 1)), PELM_SOURCE_STREAM, {7, 0, 50, 50}, 10000, call, 1);
        EXPECT_EQ(flaws(outcome), "") << name_of(call);
        EXPECT_EQ(outcome.output, background(10000)) << name_of(call);
    }
}

TEST_F(PngPlacement, a_scaled_size_of_zero_never_touches_the_image_data) {
    Png png = png_of(noise_picture(rgb, 8, 100, 1));
    png.stream = Bytes{0, 0, 0};
    png.idat_sizes = {1, 1, 1};
    const Bytes file = build(png);
    Decode decode(file, PELM_SOURCE_MEMORY, {7, 0, 50, 50});
    EXPECT_EQ(decode.one_shot(nullptr), 1);
    EXPECT_TRUE(decode.source.unchanged());
}

TEST_F(PngPlacement, negative_boxes_are_not_written) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{grey, 8}, Layout{indexed, 1}})
        for (const uint32_t flags : {0x000u, 0x700u, 0x004u, 0x008u, 0x00Cu, 0x704u, 0x708u, 0x70Cu})
            for (const auto &[width, height] :
                 {Pair(-1, 10), Pair(10, -1), Pair(-5, -5), Pair(INT32_MIN, INT32_MIN), Pair(INT32_MIN, 7),
                  Pair(7, INT32_MIN), Pair(-1, -1), Pair(-1, 0), Pair(0, -1)}) {
                reset();
                const Picture picture = noise_picture(layout.colour_type, layout.depth, 8, 8);
                const Outcome outcome = run(file_of(picture), PELM_SOURCE_MEMORY, {7, flags, width, height}, 400);
                const std::string what = picture.described() + ", flags " + std::to_string(flags) + ", box " +
                                         std::to_string(width) + "x" + std::to_string(height);
                EXPECT_EQ(flaws(outcome), "") << what;
                EXPECT_EQ(outcome.output, background(400)) << what;
            }
}

TEST_F(PngPlacement, an_exact_buffer_is_not_left_when_the_box_is_negative) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{grey, 8}}) {
        const Picture picture = noise_picture(layout.colour_type, layout.depth, 8, 8);
        EXPECT_EQ(flaws(run(file_of(picture), PELM_SOURCE_MEMORY, {7, 0x100, -1, -1}, 8 * 8 * 4)), "");
    }
}

TEST_F(PngPlacement, without_a_buffer_every_decode_runs_and_writes_nothing) {
    for (const Layout layout : all_layouts)
        for (const int32_t side : {20, 5})
            for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
                reset();
                const Picture picture = with_transparency(noise_picture(layout.colour_type, layout.depth, 20, 20));
                for (const uint32_t format : written_formats) {
                    Decode decode(file_of(picture), PELM_SOURCE_MEMORY, {format, 0, side, side});
                    int32_t result = 4;
                    for (int calls = 0; result == 4 && calls < 50; ++calls)
                        result = decode.call(call, nullptr, 3);
                    EXPECT_EQ(result, 1) << picture.described() << ", " << name_of(call);
                    EXPECT_EQ(decode.info.decoderState, nullptr);
                }
            }
}

} // namespace
} // namespace pelm::test

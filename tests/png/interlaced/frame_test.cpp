// Interlaced pictures in another size, through the frame: four samples to a pixel, written at the end.
#include "tests/png/interlaced/passes.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

constexpr uint32_t frame = PELM_INTERLACE_FRAME;

using PngInterlacedFrame = PngDecoding;

TEST_F(PngInterlacedFrame, every_layout_is_reduced_in_every_format) {
    EXPECT_EQ(reduced_noise_difference(frame), "");
}

TEST_F(PngInterlacedFrame, formats_with_alpha_are_those_of_the_picture_without_interlacing) {
    for (const Layout layout : all_layouts) {
        if (layout.colour_type == grey && layout.depth == 8) continue; // reduced in another way
        for (const bool transparent : {false, true})
            for (const auto &[width, height] : {std::pair(30u, 14u), std::pair(9u, 31u), std::pair(64u, 64u)}) {
                if (quick() && width == 64) continue;
                const Picture picture = interlaced_noise(layout, transparent, width, height);
                for (const uint32_t turn : {0u, 4u, 8u, 12u})
                    for (const uint32_t placement : {0x000u, 0x100u, 0x700u})
                        for (const uint32_t format : {5u, 6u, 7u, 8u}) {
                            const Request request{format, turn | placement | frame, 13, 8};
                            const size_t size = buffer_size(picture, request);
                            const Outcome plain = run(file_of(picture), PELM_SOURCE_MEMORY, request, size);
                            const Outcome passes = run(interlaced_file_of(picture), PELM_SOURCE_MEMORY, request, size);
                            ASSERT_EQ(flaws(passes), "");
                            ASSERT_EQ(difference(plain.output, passes.output, picture, request), "");
                        }
            }
    }
}

TEST_F(PngInterlacedFrame, opaque_pictures_are_those_without_interlacing_in_every_format) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{rgb, 16}, Layout{grey, 4}, Layout{grey, 16}, Layout{indexed, 8}})
        for (const uint32_t format : written_formats) {
            const Picture picture = interlaced_noise(layout, false, 33, 27);
            const Request request{format, frame | 8, 16, 16};
            const size_t size = buffer_size(picture, request);
            EXPECT_EQ(run(file_of(picture), PELM_SOURCE_MEMORY, request, size).output,
                      run(interlaced_file_of(picture), PELM_SOURCE_MEMORY, request, size).output)
                << picture.described();
        }
}

TEST_F(PngInterlacedFrame, every_rotation_and_placement_is_honoured) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{rgb_alpha, 8}, Layout{indexed, 4}, Layout{grey, 8}})
        for (const bool transparent : {false, true})
            for (const auto &[width, height] : {std::pair(30u, 14u), std::pair(14u, 30u), std::pair(20u, 20u)}) {
                const Picture picture = interlaced_noise(layout, transparent, width, height);
                const Bytes file = interlaced_file_of(picture);
                for (const uint32_t turn : {0u, 4u, 8u, 12u})
                    for (const uint32_t placement : {0x000u, 0x100u, 0x700u})
                        for (const auto &[box_width, box_height] :
                             {std::pair(12, 9), std::pair(9, 12), std::pair(11, 11), std::pair(5, 40)})
                            for (const uint32_t format : written_formats) {
                                const Request request{format, turn | placement | frame, box_width, box_height};
                                ASSERT_EQ(interlaced_difference(picture, file, PELM_SOURCE_MEMORY, request,
                                                                Call::one_shot, 48),
                                          "");
                            }
            }
}

// Turned by 270 degrees a flat picture begins where its width reaches down to, far behind a buffer of its height:
// beyond what 32 bits count.
TEST_F(PngInterlacedFrame, a_picture_that_begins_far_outside_is_that_without_interlacing) {
    const struct {
        uint32_t width, height;
        Request request;
    } pictures[] = {{40000, 8, {7, frame | 0x10C, 8, 32769}}, {10, 50000, {0, frame | 0xC, 46341, 10}}};
    for (const auto &[width, height, request] : pictures) {
        const Picture picture = interlaced_noise({grey, 4}, false, width, height);
        const size_t size = buffer_size(picture, request);
        const Outcome plain = run(file_of(picture), PELM_SOURCE_MEMORY, request, size);
        const Outcome passes = run(interlaced_file_of(picture), PELM_SOURCE_MEMORY, request, size);
        EXPECT_EQ(passes.result, 1);
        EXPECT_TRUE(passes.output == plain.output) << picture.described();
    }
}

TEST_F(PngInterlacedFrame, stretching_goes_up_and_down) {
    for (const auto &[image_width, image_height] : {std::pair(7u, 5u), std::pair(1u, 1u), std::pair(3u, 9u)})
        for (const Layout layout : {Layout{rgb, 8}, Layout{grey_alpha, 8}, Layout{indexed, 1}, Layout{grey, 2}}) {
            const Picture picture = interlaced_noise(layout, true, image_width, image_height);
            const Bytes file = interlaced_file_of(picture);
            for (int32_t width = 1; width < 30; width += 3)
                for (int32_t height = 1; height < 30; height += quick() ? 7 : 4)
                    for (const uint32_t turn : {0u, 4u, 8u, 12u})
                        ASSERT_EQ(interlaced_difference(picture, file, PELM_SOURCE_MEMORY,
                                                        {turn == 4 ? 0u : 7u, frame | 0x700 | turn, width, height}),
                                  "");
        }
}

TEST_F(PngInterlacedFrame, an_alpha_channel_alone_covers_what_was_there) {
    // Alpha 128 everywhere: the colour goes out as if opaque in the formats without alpha.
    Picture picture{8, 8, rgb_alpha, 8, {}, {}, {}};
    for (int i = 0; i < 64; ++i)
        picture.rows.insert(picture.rows.end(), {255, 0, 0, 128});
    const Bytes file = interlaced_file_of(picture);
    EXPECT_EQ(run(file, PELM_SOURCE_MEMORY, {1, frame, 1, 1}, 3).output, (Bytes{255, 0, 0}));
    EXPECT_EQ(run(file, PELM_SOURCE_MEMORY, {0, frame, 1, 1}, 2).output, (Bytes{0x00, 0xF8}));
    EXPECT_EQ(run(file, PELM_SOURCE_MEMORY, {7, frame, 1, 1}, 4).output, (Bytes{255, 0, 0, 128}));
}

TEST_F(PngInterlacedFrame, a_transparent_colour_darkens_even_opaque_pixels_where_there_is_no_alpha) {
    Picture picture{8, 8, rgb, 8, Bytes(8 * 8 * 3, 255), {}, Bytes{0, 1, 0, 2, 0, 3}};
    const Bytes file = interlaced_file_of(picture);
    EXPECT_EQ(run(file, PELM_SOURCE_MEMORY, {1, frame, 1, 1}, 3).output, (Bytes{254, 254, 254}));
    EXPECT_EQ(run(file, PELM_SOURCE_MEMORY, {7, frame, 1, 1}, 4).output, (Bytes{255, 255, 255, 255}));
    // Transparent everywhere: the buffer keeps 255 parts of 256.
    picture.transparency = Bytes{0, 255, 0, 255, 0, 255};
    Output output(3);
    output.fill({255, 128, 1});
    Decode decode(interlaced_file_of(picture), PELM_SOURCE_MEMORY, {1, frame, 1, 1});
    EXPECT_EQ(decode.one_shot(output.data()), 1);
    EXPECT_EQ(output.bytes(), (Bytes{254, 127, 0}));
}

TEST_F(PngInterlacedFrame, a_file_that_ends_in_a_bad_code_leaves_the_frame_unwritten) {
    const Picture picture = interlaced_noise({rgb, 8}, false, 16, 16);
    Deflate deflate;
    const Bytes data = scanlines_of(interlaced_png_of(picture));
    deflate.stored({data.begin(), data.end() - 5}, Last::no);
    deflate.fixed({symbol(286)}, Last::yes);
    Png png = interlaced_png_of(picture);
    png.stream = zlib_stream(deflate.bytes(), data);
    for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM})
        for (const Request &request : {Request{7, frame, 8, 8}, Request{7, 0, 8, 8}, Request{7, 0, 16, 16}}) {
            reset();
            const size_t size = buffer_size(picture, request);
            const Outcome outcome = run(build(png), kind, request, size);
            EXPECT_EQ(flaws(outcome), "");
            const Bytes expected = expected_after(picture, request, pass_rows_of(picture).size() - 1);
            EXPECT_EQ(difference(expected, outcome.output, picture, request), "");
        }
}

TEST_F(PngInterlacedFrame, missing_rows_leave_their_share_out) {
    // White, without pass 7: a reduced pixel lacks the samples in its odd row, and so half of its alpha.
    const Picture white{8, 8, rgb, 8, Bytes(8 * 8 * 3, 255), {}, {}};
    std::vector<Bytes> parts = scanlines_by_pass(white);
    parts.pop_back();
    const Bytes file = interlaced_file_of_parts(white, parts, Blocks::stored);
    const Outcome outcome = run(file, PELM_SOURCE_MEMORY, {7, frame, 2, 2}, 16);
    EXPECT_EQ(flaws(outcome), "");
    // Into 2 x 2 the samples lie in the rows and columns 1 and 3, 5 and 7: nothing of them is there.
    EXPECT_EQ(outcome.output, Bytes(16));
    // Into 3 x 3 they lie in (8m + 2) / 3 and (8m + 6) / 3, which are 0, 2; 3, 4; 6, 7.
    const Outcome thirds = run(file, PELM_SOURCE_MEMORY, {7, frame | 0x700, 3, 3}, 36);
    EXPECT_EQ(Bytes(thirds.output.begin(), thirds.output.begin() + 4), (Bytes{255, 255, 255, 255}));
    const unsigned lower = (255 + 2) / 4 + (255 + 3) / 4, upper = 255 / 4 + (255 + 1) / 4;
    EXPECT_EQ(thirds.output[12 + 3], lower);
    EXPECT_EQ(thirds.output[24 + 3], upper);
}

} // namespace
} // namespace pelm::test

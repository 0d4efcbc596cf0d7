// Interlaced pictures at their own size: every pixel at its place, whatever was asked for.
#include "tests/png/interlaced/passes.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

using PngInterlaced = PngDecoding;

std::vector<uint32_t> sides() {
    if (quick()) return {1, 2, 3, 5, 8, 9, 16};
    return {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16, 17};
}

TEST_F(PngInterlaced, every_layout_of_every_small_size_is_decoded_in_every_format) {
    for (const Layout layout : all_layouts)
        for (const bool transparent : {false, true})
            for (const uint32_t width : sides())
                for (const uint32_t height : sides()) {
                    reset();
                    const Picture picture = interlaced_noise(layout, transparent, width, height, width + height);
                    const Bytes file = interlaced_file_of(picture);
                    const uint32_t kind = all_source_kinds[(width + height) % 4];
                    for (const uint32_t format : written_formats)
                        ASSERT_EQ(interlaced_difference(picture, file, kind, own_size(picture, format)), "");
                }
}

TEST_F(PngInterlaced, the_bytes_are_those_of_the_same_picture_without_interlacing) {
    for (const Layout layout : all_layouts)
        for (const bool transparent : {false, true})
            for (const auto &[width, height] :
                 {std::pair(1u, 1u), std::pair(2u, 5u), std::pair(17u, 3u), std::pair(31u, 33u), std::pair(40u, 8u)}) {
                reset();
                const Picture picture = interlaced_noise(layout, transparent, width, height);
                for (const uint32_t format : written_formats) {
                    const Request request{format, 0, static_cast<int32_t>(width + 3), static_cast<int32_t>(height + 2)};
                    const size_t size = buffer_size(picture, request);
                    const Outcome plain = run(file_of(picture), PELM_SOURCE_MEMORY, request, size);
                    const Outcome passes = run(interlaced_file_of(picture), PELM_SOURCE_MEMORY, request, size);
                    EXPECT_EQ(flaws(passes), "");
                    ASSERT_EQ(difference(plain.output, passes.output, picture, request), "");
                }
            }
}

TEST_F(PngInterlaced, every_source_and_every_kind_of_block_gives_the_picture) {
    for (const Layout layout : all_layouts) {
        const Picture picture = interlaced_noise(layout, true, 21, 19);
        for (const Blocks blocks : {Blocks::stored, Blocks::fixed, Blocks::dynamic, Blocks::mixed}) {
            const Bytes file = interlaced_file_of_blocks(picture, blocks, 60);
            for (const uint32_t kind : all_source_kinds)
                for (const uint32_t format : {0u, 5u}) {
                    reset();
                    EXPECT_EQ(interlaced_difference(picture, file, kind, own_size(picture, format)), "");
                }
        }
    }
}

TEST_F(PngInterlaced, the_first_row_of_every_pass_has_a_row_of_zeros_above) {
    for (const Layout layout : all_layouts)
        for (const uint8_t filter : {uint8_t{1}, uint8_t{2}, uint8_t{3}, uint8_t{4}})
            for (const auto &[width, height] : {std::pair(1u, 1u), std::pair(5u, 5u), std::pair(17u, 9u)}) {
                const Picture picture = interlaced_noise(layout, false, width, height, filter);
                Png png = interlaced_png_of(picture);
                png.filters = {filter};
                for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM}) {
                    reset();
                    EXPECT_EQ(interlaced_difference(picture, build(png), kind, own_size(picture)), "")
                        << "filter " << int{filter};
                }
            }
}

TEST_F(PngInterlaced, an_up_filter_on_the_first_row_of_each_pass_copies_the_row) {
    const Picture picture = interlaced_noise({rgb, 8}, false, 16, 1);
    Png with_up = interlaced_png_of(picture), without = with_up;
    with_up.filters = {2};
    without.filters = {0};
    const Bytes up = scanlines_of(with_up), none = scanlines_of(without);
    size_t differing = 0;
    for (size_t i = 0; i < up.size(); ++i)
        differing += up[i] != none[i] ? 1 : 0;
    EXPECT_EQ(differing, 4u) << "only the filter bytes of the passes 1, 2, 4 and 6";
    EXPECT_EQ(interlaced_difference(picture, build(with_up), PELM_SOURCE_MEMORY, own_size(picture)), "");
}

TEST_F(PngInterlaced, an_unknown_filter_clears_the_first_byte_of_each_pass_row) {
    for (const uint8_t filter : {uint8_t{5}, uint8_t{255}}) {
        Picture picture = interlaced_noise({rgb, 8}, false, 17, 13);
        Png png = interlaced_png_of(picture);
        png.filters = {filter};
        const Bytes file = build(png);
        for (const PassRow &row : pass_rows_of(picture))
            picture.set_sample(row.columns[0], row.y, 0, 0);
        EXPECT_EQ(interlaced_difference(picture, file, PELM_SOURCE_MEMORY, own_size(picture)), "");
    }
}

TEST_F(PngInterlaced, rows_are_not_turned_and_lie_where_the_turned_size_would) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{rgb_alpha, 8}, Layout{indexed, 4}, Layout{grey, 1}})
        for (const auto &[width, height] : {std::pair(13u, 5u), std::pair(5u, 13u), std::pair(9u, 9u)})
            for (const uint32_t turn : {0u, 4u, 8u, 12u})
                for (const uint32_t placement : {0x000u, 0x100u, 0x200u})
                    for (const auto &[box_width, box_height] :
                         {std::pair(13, 13), std::pair(14, 17), std::pair(5, 13), std::pair(13, 5), std::pair(30, 16)})
                        for (const uint32_t format : written_formats) {
                            const Picture picture = interlaced_noise(layout, true, width, height);
                            const Request request{format, turn | placement, box_width, box_height};
                            if (!geometry_of(picture, request).one_to_one) continue;
                            ASSERT_EQ(interlaced_difference(picture, interlaced_file_of(picture), PELM_SOURCE_MEMORY,
                                                            request, Call::one_shot, 64),
                                      "");
                        }
}

// Turned by 90 degrees into a box of 2 x 4: rows of four pixels, two to a line, each over the end of the one before.
TEST_F(PngInterlaced, later_passes_lie_over_earlier_ones_where_rows_run_on) {
    Picture picture{4, 2, grey, 8, {10, 20, 30, 40, 50, 60, 70, 80}, {}, {}};
    const Request request{1, PELM_ROTATE_90, 2, 4};
    const Outcome outcome = run(interlaced_file_of(picture), PELM_SOURCE_MEMORY, request, 24);
    EXPECT_EQ(flaws(outcome), "");
    // Passes 1, 4, 6 write row 0 at the pixels 0 to 3; pass 7 writes row 1 at 2 to 5.
    Bytes expected = background(24);
    const uint8_t shown[] = {10, 20, 50, 60, 70, 80};
    for (size_t i = 0; i < 6; ++i)
        expected[i * 3] = expected[i * 3 + 1] = expected[i * 3 + 2] = shown[i];
    EXPECT_EQ(outcome.output, expected);
}

TEST_F(PngInterlaced, a_frame_asked_for_at_the_own_size_changes_nothing) {
    for (const Layout layout : all_layouts)
        for (const uint32_t format : written_formats)
            for (const uint32_t turn : {0u, 4u}) {
                reset();
                const Picture picture = interlaced_noise(layout, true, 11, 7);
                const Request request{format, PELM_INTERLACE_FRAME | turn, 13, 12};
                EXPECT_EQ(interlaced_difference(picture, interlaced_file_of(picture), PELM_SOURCE_MEMORY, request), "");
            }
}

TEST_F(PngInterlaced, formats_that_are_not_written_leave_the_buffer) {
    for (const uint32_t format : {2u, 3u, 4u, 9u, 10u, 11u, 12u, 100u})
        for (const uint32_t flags : {0u, 0x1000u})
            for (const int32_t side : {20, 9, 4}) {
                reset();
                const Picture picture = interlaced_noise({rgb_alpha, 8}, false, 9, 9);
                const Outcome outcome =
                    run(interlaced_file_of(picture), PELM_SOURCE_MEMORY, {format, flags, side, side}, 1600);
                EXPECT_EQ(flaws(outcome), "");
                EXPECT_EQ(outcome.output, background(1600));
                EXPECT_EQ(polling.polls, static_cast<int>(pass_rows_of(picture).size()));
            }
}

TEST_F(PngInterlaced, the_words_of_the_request_tell_the_scaled_size) {
    const Picture picture = interlaced_noise({rgb, 8}, false, 40, 10);
    for (const uint32_t flags : {0u, 0x1000u}) {
        const Outcome outcome = run(interlaced_file_of(picture), PELM_SOURCE_MEMORY, {7, flags, 20, 20}, 1600);
        EXPECT_EQ(outcome.info.outputWidth, 20);
        EXPECT_EQ(outcome.info.outputHeight, 5);
        EXPECT_EQ(outcome.info.imageHeight, 0) << "the caller's word";
    }
}

TEST_F(PngInterlaced, a_file_larger_than_the_read_buffer_gives_the_picture_from_every_source) {
    for (const Layout layout : {Layout{rgb_alpha, 16}, Layout{rgb, 8}, Layout{indexed, 8}}) {
        const Picture picture = interlaced_noise(layout, true, 131, 190);
        const Bytes file = interlaced_file_of(picture);
        EXPECT_GT(file.size(), 20000u);
        for (const uint32_t kind : all_source_kinds)
            EXPECT_EQ(interlaced_difference(picture, file, kind, own_size(picture)), "");
    }
}

TEST_F(PngInterlaced, every_split_of_the_image_data_gives_the_picture) {
    const Picture picture = interlaced_noise({rgb, 8}, true, 17, 15);
    Png png = interlaced_png_of(picture);
    for (const size_t size : {1u, 2u, 3u, 7u, 100u, 500u}) {
        png.idat_size = size;
        const Bytes file = build(png);
        if (file.size() > 16000) continue; // a chunk header may lie across the end of the read buffer
        for (const uint32_t kind : all_source_kinds)
            for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
                reset();
                EXPECT_EQ(interlaced_difference(picture, file, kind, own_size(picture, 1), call), "") << size;
            }
    }
}

TEST_F(PngInterlaced, without_a_buffer_the_decode_runs_and_writes_nothing) {
    const Picture picture = interlaced_noise({rgb, 8}, false, 17, 15);
    for (const uint32_t flags : {0u, 0x1000u})
        for (const int32_t side : {20, 5}) {
            reset();
            Decode decode(interlaced_file_of(picture), PELM_SOURCE_MEMORY, {7, flags, side, side});
            EXPECT_EQ(decode.one_shot(nullptr), 1);
            EXPECT_EQ(polling.polls, static_cast<int>(pass_rows_of(picture).size()));
            EXPECT_TRUE(host.live_blocks().empty());
        }
}

} // namespace
} // namespace pelm::test

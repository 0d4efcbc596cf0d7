// Iterative calls: a block of rows each, over what the caller's buffer held before.
#include "tests/png/interlaced/passes.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

class PngInterlacedIterative : public PngDecoding {
protected:
    // One call per part. `rows[i]` is how many pass rows are complete after part i.
    void expect_progress(const Picture &picture, const std::vector<Bytes> &parts, const std::vector<size_t> &rows,
                         Blocks blocks, uint32_t kind, const Request &request) {
        reset();
        const Bytes file = interlaced_file_of_parts(picture, parts, blocks);
        Output output(buffer_size(picture, request));
        Decode decode(file, kind, request);
        for (size_t call = 0; call < parts.size(); ++call) {
            const bool last = call + 1 == parts.size();
            const std::string what =
                "call " + std::to_string(call) + ", kind " + std::to_string(kind) + ", " + name_of(blocks) + " blocks";
            ASSERT_EQ(decode.iterative(output.data()), last ? 1 : 4) << what;
            const Bytes expected =
                last ? expected_bytes(picture, request) : expected_after(picture, request, rows[call]);
            ASSERT_EQ(difference(expected, output.bytes(), picture, request), "") << what;
            ASSERT_EQ(polling.polls, static_cast<int>(rows[call] + call)) << what << ": rows, and one per resumption";
            ASSERT_EQ(decode.started(), !last) << what;
        }
        EXPECT_TRUE(output.intact());
        EXPECT_TRUE(host.live_blocks().empty());
        EXPECT_TRUE(host.violations.empty());
    }

    static std::vector<size_t> one_each(size_t count) {
        std::vector<size_t> rows;
        for (size_t i = 1; i <= count; ++i)
            rows.push_back(i);
        return rows;
    }

    static std::vector<size_t> ends_of_passes(const Picture &picture) {
        std::vector<size_t> ends;
        const std::vector<PassRow> rows = pass_rows_of(picture);
        for (size_t i = 0; i < rows.size(); ++i)
            if (i + 1 == rows.size() || rows[i + 1].pass != rows[i].pass) ends.push_back(i + 1);
        return ends;
    }
};

TEST_F(PngInterlacedIterative, each_block_of_one_row_shows_that_row_and_keeps_the_gaps) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{grey, 2}, Layout{indexed, 4}, Layout{rgb_alpha, 16}})
        for (const Blocks blocks : {Blocks::stored, Blocks::mixed})
            for (const uint32_t kind : all_source_kinds)
                for (const uint32_t format : {0u, 1u, 7u}) {
                    const Picture picture = interlaced_noise(layout, true, 13, 11);
                    const std::vector<Bytes> parts = scanlines_by_pass_row(picture);
                    for (const Request &request : {Request{format, 0, 15, 13}, Request{format, 0, 13, 11}})
                        expect_progress(picture, parts, one_each(parts.size()), blocks, kind, request);
                }
}

TEST_F(PngInterlacedIterative, each_block_of_one_pass_shows_that_pass_and_keeps_the_gaps) {
    for (const Layout layout : all_layouts)
        for (const Blocks blocks : {Blocks::fixed, Blocks::dynamic})
            for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_SEQUENTIAL})
                for (const uint32_t format : written_formats) {
                    const Picture picture = interlaced_noise(layout, true, 18, 17);
                    expect_progress(picture, scanlines_by_pass(picture), ends_of_passes(picture), blocks, kind,
                                    {format, 0, 18, 17});
                }
}

TEST_F(PngInterlacedIterative, scaled_output_fills_pass_by_pass_without_a_frame) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{grey, 8}, Layout{rgb_alpha, 8}, Layout{indexed, 2}})
        for (const uint32_t turn : {0u, 4u, 8u, 12u})
            for (const uint32_t format : {0u, 1u, 7u}) {
                const Picture picture = interlaced_noise(layout, true, 19, 13);
                for (const Request &request : {Request{format, turn, 9, 9}, Request{format, turn | 0x700, 23, 8}})
                    expect_progress(picture, scanlines_by_pass(picture), ends_of_passes(picture), Blocks::mixed,
                                    PELM_SOURCE_MEMORY, request);
            }
}

TEST_F(PngInterlacedIterative, a_frame_shows_nothing_before_the_last_call) {
    for (const Layout layout : all_layouts)
        for (const uint32_t turn : {0u, 4u, 8u, 12u})
            for (const uint32_t format : {0u, 1u, 8u}) {
                const Picture picture = interlaced_noise(layout, true, 19, 13);
                const Request request{format, turn | PELM_INTERLACE_FRAME, 9, 10};
                const std::vector<Bytes> parts = scanlines_by_pass_row(picture);
                expect_progress(picture, parts, one_each(parts.size()), Blocks::mixed, PELM_SOURCE_STREAM, request);
            }
}

TEST_F(PngInterlacedIterative, many_blocks_resumed_at_every_one_give_the_one_shot_picture) {
    for (const Layout layout : all_layouts)
        for (const Blocks blocks : {Blocks::stored, Blocks::fixed, Blocks::dynamic, Blocks::mixed}) {
            const Picture picture = interlaced_noise(layout, true, 29, 23);
            const size_t first = pass_rows_of(picture)[0].bytes;
            for (const size_t block_size : {first, first + 1, first + 7, size_t{300}}) {
                if (quick() && block_size == first + 1) continue;
                const Bytes file = interlaced_file_of_blocks(picture, blocks, block_size);
                for (const uint32_t kind : all_source_kinds)
                    for (const Request &request :
                         {Request{0, 0, 30, 23}, Request{7, 0, 14, 14}, Request{7, PELM_INTERLACE_FRAME | 4, 14, 14}}) {
                        reset();
                        ASSERT_EQ(interlaced_difference(picture, file, kind, request, Call::iterative), "")
                            << name_of(blocks) << " blocks of " << block_size;
                    }
            }
        }
}

TEST_F(PngInterlacedIterative, matches_reach_over_the_ends_of_rows_and_passes) {
    Picture picture{33, 21, rgb, 8, {}, {}, {}};
    picture.rows.resize(picture.row_bytes() * picture.height, 77);
    Png png = interlaced_png_of(picture);
    png.filters = {0};
    const Bytes data = scanlines_of(png);
    for (const size_t block_size : {20u, 100u, 700u}) {
        png.stream = stream_of_blocks(data, Blocks::mixed, block_size, 16);
        for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM})
            EXPECT_EQ(interlaced_difference(picture, build(png), kind, own_size(picture), Call::iterative), "");
    }
}

TEST_F(PngInterlacedIterative, a_pause_at_any_byte_is_resumed_at_that_byte) {
    const Picture picture = interlaced_noise({rgb, 8}, true, 9, 9);
    const Bytes data = scanlines_of(interlaced_png_of(picture));
    const size_t first = pass_rows_of(picture)[0].bytes;
    for (size_t at = first; at < data.size(); ++at) {
        const auto middle = data.begin() + static_cast<ptrdiff_t>(at);
        const std::vector<Bytes> parts = {{data.begin(), middle}, {middle, data.end()}};
        for (const Blocks blocks : {Blocks::stored, Blocks::fixed}) {
            reset();
            const Bytes file = interlaced_file_of_parts(picture, parts, blocks);
            ASSERT_EQ(interlaced_difference(picture, file, PELM_SOURCE_STREAM, own_size(picture, 1), Call::iterative),
                      "")
                << "pause after " << at << " bytes";
        }
    }
}

TEST_F(PngInterlacedIterative, every_call_may_bring_a_buffer_of_its_own) {
    for (const Request &base : {Request{1, 0, 15, 14}, Request{1, 4, 7, 9}, Request{0, 12, 9, 6},
                                Request{0, 12 | PELM_INTERLACE_FRAME, 9, 6}, Request{7, 8 | 0x1000, 6, 9}})
        for (const Layout layout : {Layout{rgb, 8}, Layout{grey_alpha, 8}, Layout{indexed, 8}}) {
            const Picture picture = interlaced_noise(layout, true, 13, 11);
            const std::vector<Bytes> parts = scanlines_by_pass_row(picture);
            Decode decode(interlaced_file_of_parts(picture, parts, Blocks::stored), PELM_SOURCE_MEMORY, base);
            for (size_t call = 0; call < parts.size(); ++call) {
                Output output(buffer_size(picture, base));
                ASSERT_EQ(decode.iterative(output.data()), call + 1 == parts.size() ? 1 : 4);
                Bytes expected = background(buffer_size(picture, base));
                draw_pass_rows(picture, base, call, call + 1, expected);
                if (call + 1 == parts.size()) draw_frame(picture, base, expected);
                ASSERT_EQ(difference(expected, output.bytes(), picture, base), "") << "call " << call;
                ASSERT_TRUE(output.intact());
            }
        }
}

// The geometry stays that of the first call; what lies outside the later call's box is left out.
TEST_F(PngInterlacedIterative, a_smaller_box_in_later_calls_clips) {
    for (const Request &base : {Request{1, 0, 15, 14}, Request{7, 4, 7, 9}, Request{7, 8, 7, 9}, Request{0, 12, 9, 6},
                                Request{7, 12 | PELM_INTERLACE_FRAME, 9, 6}}) {
        const Picture picture = interlaced_noise({rgb, 8}, true, 13, 11);
        const std::vector<Bytes> parts = scanlines_by_pass(picture);
        Decode decode(interlaced_file_of_parts(picture, parts, Blocks::stored), PELM_SOURCE_MEMORY, base);
        const std::vector<size_t> ends = ends_of_passes(picture);
        for (size_t call = 0; call < parts.size(); ++call) {
            const int32_t lines = call % 2 == 0 ? base.box_height : 3;
            decode.request.box_height = lines;
            const size_t size = static_cast<size_t>(base.box_width * lines) * pixel_size(base.format);
            Output output(size);
            ASSERT_EQ(decode.iterative(output.data()), call + 1 == parts.size() ? 1 : 4);
            Bytes expected = background(size);
            draw_pass_rows(picture, base, call == 0 ? 0 : ends[call - 1], ends[call], expected);
            if (call + 1 == parts.size()) draw_frame(picture, base, expected);
            ASSERT_EQ(output.bytes(), expected) << "call " << call << ", " << base.described();
            ASSERT_TRUE(output.intact());
        }
    }
}

} // namespace
} // namespace pelm::test

// Line and one-shot calls of interlaced pictures, which are decoded whole or not at all, and decodes that start over.
#include "png/state.h"
#include "tests/png/interlaced/passes.h"

namespace pelm::test {
namespace {

class PngInterlacedCalls : public PngDecoding {
protected:
    Picture picture = interlaced_noise({rgb, 8}, true, 13, 11);
    Request request{1, 0, 13, 11};
    Bytes untouched() const { return background(buffer_size(picture, request)); }
    Bytes paused_file() const { return interlaced_file_of_parts(picture, scanlines_by_pass(picture), Blocks::mixed); }
    void expect_nothing_left(const Decode &decode) const {
        EXPECT_FALSE(decode.started());
        EXPECT_TRUE(host.live_blocks().empty());
        EXPECT_TRUE(host.violations.empty());
    }
};

TEST_F(PngInterlacedCalls, a_line_call_for_some_rows_is_refused) {
    for (const uint32_t kind : all_source_kinds)
        for (const int32_t word : {0, 5, 11})
            for (const int32_t rows : {1, 4, 6, 10, 11, 12, -1, INT32_MAX, INT32_MIN}) {
                if (rows == word) continue;
                reset();
                Output output(untouched().size());
                Decode decode(interlaced_file_of(picture), kind, request);
                decode.info.imageHeight = word;
                EXPECT_EQ(decode.line(output.data(), rows), 0) << rows << " rows, word " << word;
                EXPECT_EQ(output.bytes(), untouched());
                EXPECT_EQ(polling.polls, 0);
                expect_nothing_left(decode);
            }
}

TEST_F(PngInterlacedCalls, a_line_call_for_as_many_rows_as_the_request_says_decodes_all) {
    for (const uint32_t kind : all_source_kinds)
        for (const int32_t rows : {0, 1, 5, 10, 11, 12, 1000, -1, INT32_MIN})
            for (const bool many_blocks : {false, true}) {
                reset();
                Output output(untouched().size());
                Decode decode(many_blocks ? paused_file() : interlaced_file_of(picture), kind, request);
                decode.info.imageHeight = rows;
                EXPECT_EQ(decode.line(output.data(), rows), 1) << rows;
                EXPECT_EQ(difference(expected_bytes(picture, request), output.bytes(), picture, request), "");
                expect_nothing_left(decode);
            }
}

TEST_F(PngInterlacedCalls, no_rows_asked_for_means_all_whatever_the_request_says) {
    for (const int32_t word : {0, 3, 11, -7}) {
        reset();
        Output output(untouched().size());
        Decode decode(paused_file(), PELM_SOURCE_MEMORY, request);
        decode.info.imageHeight = word;
        EXPECT_EQ(decode.line(output.data(), 0), 1);
        EXPECT_EQ(output.bytes(), expected_bytes(picture, request));
    }
}

TEST_F(PngInterlacedCalls, a_one_shot_call_ignores_the_number_of_rows) {
    for (const int32_t word : {0, 1, 3, 11, 500, -1}) {
        reset();
        Output output(untouched().size());
        Decode decode(paused_file(), PELM_SOURCE_STREAM, request);
        decode.info.imageHeight = word;
        EXPECT_EQ(decode.one_shot(output.data()), 1) << word;
        EXPECT_EQ(output.bytes(), expected_bytes(picture, request));
        expect_nothing_left(decode);
    }
}

TEST_F(PngInterlacedCalls, a_later_line_call_for_some_rows_ends_the_decode) {
    for (const uint32_t kind : all_source_kinds)
        for (const int32_t rows : {1, 7, -3})
            for (const int32_t word : {0, 11}) {
                reset();
                Output output(untouched().size());
                Decode decode(paused_file(), kind, request);
                ASSERT_EQ(decode.iterative(output.data()), 4);
                const Bytes before = output.bytes();
                const int polls = polling.polls;
                decode.info.imageHeight = word;
                EXPECT_EQ(decode.line(output.data(), rows), 0);
                EXPECT_EQ(output.bytes(), before);
                EXPECT_EQ(polling.polls, polls) << "refused before the host is asked";
                expect_nothing_left(decode);
            }
}

TEST_F(PngInterlacedCalls, other_later_calls_finish_what_an_iterative_call_began) {
    for (const uint32_t kind : all_source_kinds)
        for (const Call call : {Call::one_shot, Call::line})
            for (const int32_t rows : {0, 4, 11})
                for (int paused = 1; paused <= 5; ++paused) {
                    reset();
                    Output output(untouched().size());
                    Decode decode(paused_file(), kind, request);
                    for (int i = 0; i < paused; ++i)
                        ASSERT_EQ(decode.iterative(output.data()), 4);
                    decode.info.imageHeight = rows;
                    EXPECT_EQ(decode.call(call, output.data(), rows), 1);
                    EXPECT_EQ(output.bytes(), expected_bytes(picture, request));
                    expect_nothing_left(decode);
                }
}

TEST_F(PngInterlacedCalls, an_abandoned_decode_leaves_nothing) {
    for (const uint32_t flags : {0u, 0x1000u})
        for (const int32_t side : {13, 5}) {
            reset();
            Decode decode(paused_file(), PELM_SOURCE_STREAM, {7, flags, side, side});
            Output output(13 * 13 * 4);
            ASSERT_EQ(decode.iterative(output.data()), 4);
            EXPECT_EQ(ZOTARPELMI_AbortPNGIter(&decode.info), 1);
            expect_nothing_left(decode);
        }
}

TEST_F(PngInterlacedCalls, a_box_without_room_is_a_success_whatever_rows_are_asked_for) {
    for (const uint32_t flags : {0u, 0x1000u}) {
        Decode decode(interlaced_file_of(picture), PELM_SOURCE_MEMORY, {7, flags, 0, 0});
        EXPECT_EQ(decode.line(nullptr, 5), 1);
        EXPECT_EQ(decode.one_shot(nullptr), 1);
        EXPECT_EQ(decode.iterative(nullptr), 1);
        expect_nothing_left(decode);
    }
}

TEST_F(PngInterlacedCalls, a_pause_before_the_first_row_starts_over_for_ever) {
    const Bytes data = scanlines_of(interlaced_png_of(picture));
    const size_t first = pass_rows_of(picture)[0].bytes;
    for (const uint32_t kind : all_source_kinds)
        for (const size_t at : {size_t{0}, size_t{1}, first - 1})
            for (const uint32_t flags : {0u, 0x1000u})
                for (const int32_t side : {13, 6}) {
                    reset();
                    const auto middle = data.begin() + static_cast<ptrdiff_t>(at);
                    Png png = interlaced_png_of(picture);
                    png.stream = stream_of_parts({{data.begin(), middle}, {middle, data.end()}}, Blocks::stored);
                    png.idat_size = 50;
                    const Request scaled{1, flags, side, side};
                    Output output(buffer_size(picture, scaled));
                    Decode decode(build(png), kind, scaled);
                    for (int call = 0; call < 5; ++call)
                        ASSERT_EQ(decode.iterative(output.data()), 4) << at;
                    EXPECT_EQ(polling.polls, 0);
                    const size_t allocations = host.allocations.size();
                    EXPECT_EQ(decode.one_shot(output.data()), 1);
                    EXPECT_EQ(host.allocations.size(), allocations);
                    EXPECT_EQ(polling.polls, static_cast<int>(pass_rows_of(picture).size()));
                    EXPECT_EQ(difference(expected_bytes(picture, scaled), output.bytes(), picture, scaled), "");
                    expect_nothing_left(decode);
                }
}

TEST_F(PngInterlacedCalls, any_resume_point_but_a_block_end_starts_over) {
    for (const uint32_t kind : all_source_kinds)
        for (const uint32_t point : {0u, 1u, 2u, 3u, 4u, 6u, 100u})
            for (const uint32_t flags : {0u, 0x1000u})
                for (const int32_t side : {13, 6}) {
                    reset();
                    Png png = interlaced_png_of(picture);
                    png.stream = stream_of_parts(scanlines_by_pass(picture), Blocks::mixed);
                    png.idat_size = 60;
                    const Request scaled{1, flags, side, side};
                    Decode decode(build(png), kind, scaled);
                    for (int call = 0; call < 4; ++call)
                        ASSERT_EQ(decode.iterative(nullptr), 4);
                    static_cast<PngDecodeState *>(decode.info.decoderState)->resumePoint = point;
                    // Everything is written once more, into a fresh buffer.
                    const int polls = polling.polls;
                    Output output(buffer_size(picture, scaled));
                    int32_t result = 4;
                    int calls = 0;
                    while (result == 4 && calls < 100) {
                        result = decode.iterative(output.data());
                        ++calls;
                    }
                    EXPECT_EQ(result, 1);
                    EXPECT_EQ(calls, 7) << "blocks, one per pass";
                    EXPECT_EQ(polling.polls - polls, static_cast<int>(pass_rows_of(picture).size()) + 6);
                    EXPECT_EQ(difference(expected_bytes(picture, scaled), output.bytes(), picture, scaled), "");
                    expect_nothing_left(decode);
                }
}

} // namespace
} // namespace pelm::test

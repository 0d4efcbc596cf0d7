// The host is asked after every row whether to go on: it can stop a decode and slow it down.
#include "png/state.h"
#include "tests/png/decode/calls_model.h"
#include "tests/png/decode/decoding.h"

namespace pelm::test {
namespace {

class PngHost : public PngDecoding {
protected:
    Picture picture = with_transparency(noise_picture(rgb, 8, 11, 12));
    Request request{7, 0, 12, 13};
    size_t size = 12 * 13 * 4;

    Bytes after_rows(uint32_t rows) const {
        Bytes expected = background(size);
        draw_rows(picture, request, rows, expected);
        return expected;
    }
    // Scanlines of the picture, without the last rows or with more.
    Bytes file_with_rows(uint32_t rows, uint8_t extra_filter = 0) const {
        Png png = png_of(picture);
        Bytes data = scanlines_of(png);
        const size_t whole = data.size();
        data.resize((picture.row_bytes() + 1) * rows, 0xEE);
        for (size_t at = whole; at < data.size(); at += picture.row_bytes() + 1)
            data[at] = extra_filter;
        png.scanlines = data;
        return build(png);
    }
};

TEST_F(PngHost, every_row_is_written_before_the_poll_that_follows_it) {
    for (const uint32_t kind : all_source_kinds)
        for (const Blocks blocks : {Blocks::stored, Blocks::dynamic})
            for (const Layout layout : {Layout{rgb, 8}, Layout{grey, 8}, Layout{rgb_alpha, 16}})
                for (const int32_t side : {13, 7}) {
                    reset();
                    picture = noise_picture(layout.colour_type, layout.depth, 11, 12);
                    request = {1, 0, side, side};
                    size = buffer_size(picture, request);
                    Output output(size);
                    Decode decode(file_of_blocks(picture, blocks, 100), kind, request);
                    polling.at_poll = [&](int poll) {
                        ASSERT_EQ(difference(after_rows(static_cast<uint32_t>(poll)), output.bytes(), picture, request),
                                  "")
                            << "poll " << poll;
                    };
                    EXPECT_EQ(decode.one_shot(output.data()), 1);
                    EXPECT_EQ(polling.polls, 12);
                    EXPECT_TRUE(polling.sleeps.empty());
                }
}

TEST_F(PngHost, a_negative_status_stops_the_decode_at_any_row) {
    for (const uint32_t kind : all_source_kinds)
        for (const Call call : {Call::one_shot, Call::iterative, Call::line})
            for (int stop = 1; stop <= 12; ++stop)
                for (const int32_t status : {-1, INT32_MIN}) {
                    reset();
                    polling.statuses.assign(static_cast<size_t>(stop), 0);
                    polling.statuses.back() = status;
                    const Outcome outcome = run(file_of(picture), kind, request, size, call);
                    EXPECT_EQ(flaws(outcome, 0), "") << name_of(call) << ", poll " << stop;
                    EXPECT_EQ(polling.polls, stop);
                    EXPECT_EQ(difference(after_rows(static_cast<uint32_t>(stop)), outcome.output, picture, request),
                              "");
                }
}

TEST_F(PngHost, a_positive_status_sleeps_once_and_goes_on) {
    for (const uint32_t kind : all_source_kinds) {
        reset();
        polling.statuses = {0, 5, 0, 7, 7, 0, 0, INT32_MAX, 0, 0, 0, 1};
        const Outcome outcome = run(file_of(picture), kind, request, size);
        EXPECT_EQ(flaws(outcome), "");
        EXPECT_EQ(outcome.output, after_rows(12));
        EXPECT_EQ(polling.polls, 12);
        const std::vector<Polling::Sleep> sleeps = {{2, 5}, {4, 7}, {5, 7}, {8, INT32_MAX}, {12, 1}};
        EXPECT_EQ(polling.sleeps, sleeps);
    }
}

TEST_F(PngHost, pausing_and_stopping_mix) {
    polling.statuses = {3, 0, 4, -1};
    EXPECT_EQ(flaws(run(file_of(picture), PELM_SOURCE_MEMORY, request, size), 0), "");
    const std::vector<Polling::Sleep> sleeps = {{1, 3}, {3, 4}};
    EXPECT_EQ(polling.sleeps, sleeps);
    EXPECT_EQ(polling.polls, 4);
}

TEST_F(PngHost, a_line_call_leaves_the_poll_of_its_last_row_to_the_next_call) {
    for (const uint32_t kind : all_source_kinds) {
        reset();
        Output output(size);
        Decode decode(file_of(picture), kind, request);
        ASSERT_EQ(decode.line(output.data(), 1), 4);
        EXPECT_EQ(polling.polls, 0) << "the only row is the one that stopped";
        polling.at_poll = [&](int poll) {
            ASSERT_EQ(output.bytes(), after_rows(static_cast<uint32_t>(poll))) << "poll " << poll;
        };
        ASSERT_EQ(decode.line(output.data(), 3), 4);
        EXPECT_EQ(polling.polls, 3) << "on coming back, and after two of three rows";
        ASSERT_EQ(decode.line(output.data(), 0), 1);
        EXPECT_EQ(polling.polls, 12);
    }
}

TEST_F(PngHost, a_resumed_call_can_be_stopped_and_paused_before_anything_is_written) {
    for (const uint32_t kind : all_source_kinds)
        for (const Call call : {Call::iterative, Call::line}) {
            reset();
            Output output(size);
            Decode decode(file_of_blocks(picture, Blocks::stored, 34 * 3), kind, request);
            ASSERT_EQ(decode.call(call, output.data(), 3), 4);
            const int before = polling.polls;
            EXPECT_EQ(before, call == Call::iterative ? 3 : 2);
            polling.statuses.assign(static_cast<size_t>(before), 0);
            polling.statuses.push_back(9);
            ASSERT_EQ(decode.call(call, output.data(), 1), 4);
            ASSERT_EQ(polling.sleeps.size(), 1u);
            EXPECT_EQ(polling.sleeps[0], (Polling::Sleep{before + 1, 9}));
            const Bytes then = output.bytes();
            polling.statuses.assign(static_cast<size_t>(polling.polls), 0);
            polling.statuses.push_back(-1);
            EXPECT_EQ(decode.call(call, output.data(), 3), 0);
            EXPECT_EQ(output.bytes(), then);
            EXPECT_FALSE(decode.started());
            EXPECT_TRUE(host.live_blocks().empty());
        }
}

TEST_F(PngHost, an_iterative_decode_polls_after_every_row_and_at_every_return) {
    for (const uint32_t kind : all_source_kinds) {
        reset();
        Output output(size);
        Decode decode(file_of_blocks(picture, Blocks::stored, 34 * 2), kind, request);
        for (int call = 1; call <= 6; ++call) {
            ASSERT_EQ(decode.iterative(output.data()), call == 6 ? 1 : 4);
            EXPECT_EQ(polling.polls, 2 * call + (call - 1));
        }
    }
}

TEST_F(PngHost, a_restarted_call_does_not_poll_first) {
    Png png = png_of(picture);
    const Bytes data = scanlines_of(png);
    Deflate deflate;
    deflate.stored({data.begin(), data.begin() + 30}, Last::no);
    deflate.stored({data.begin() + 30, data.end()}, Last::yes);
    png.stream = zlib_stream(deflate.bytes(), data);
    polling.statuses = {-1};
    Decode decode(build(png), PELM_SOURCE_MEMORY, request);
    for (int call = 0; call < 5; ++call)
        EXPECT_EQ(decode.iterative(nullptr), 4);
    EXPECT_EQ(polling.polls, 0);
    polling.statuses = {};
    EXPECT_EQ(decode.line(nullptr, 0), 1);
    EXPECT_EQ(polling.polls, 12);
}

TEST_F(PngHost, a_decode_told_to_skip_the_check_never_polls) {
    for (const uint32_t kind : all_source_kinds)
        for (const Call call : {Call::iterative, Call::line}) {
            reset();
            Output output(size);
            Decode decode(file_of_blocks(picture, Blocks::stored, 34 * 3), kind, request);
            ASSERT_EQ(decode.call(call, output.data(), 3), 4);
            const int before = polling.polls;
            static_cast<PngDecodeState *>(decode.info.decoderState)->skipStatusCheck = 1;
            polling.statuses.assign(100, -1);
            int32_t result = 4;
            while (result == 4)
                result = decode.call(call, output.data(), 3);
            EXPECT_EQ(result, 1);
            EXPECT_EQ(polling.polls, before);
            EXPECT_EQ(output.bytes(), after_rows(12));
        }
}

TEST_F(PngHost, rows_behind_the_last_are_polled_and_not_written) {
    for (const uint32_t kind : all_source_kinds)
        for (const uint8_t filter : {uint8_t{0}, uint8_t{4}})
            for (const Layout layout : {Layout{rgb, 8}, Layout{grey, 8}, Layout{rgb_alpha, 8}})
                for (const int32_t side : {13, 7}) {
                    reset();
                    picture = noise_picture(layout.colour_type, layout.depth, 11, 12);
                    request = {7, 0, side, side};
                    size = buffer_size(picture, request);
                    const Outcome outcome = run(file_with_rows(17, filter), kind, request, size);
                    EXPECT_EQ(flaws(outcome), "");
                    EXPECT_EQ(polling.polls, 17);
                    EXPECT_EQ(difference(after_rows(12), outcome.output, picture, request), "");
                }
}

TEST_F(PngHost, rows_behind_the_last_are_counted) {
    for (const uint32_t kind : all_source_kinds) {
        reset();
        Output output(size);
        Decode decode(file_with_rows(17), kind, request);
        EXPECT_EQ(decode.line(output.data(), 14), 4) << "the second row too many is the fourteenth";
        EXPECT_EQ(polling.polls, 13);
        EXPECT_EQ(decode.line(output.data(), 2), 4);
        EXPECT_EQ(decode.line(output.data(), 2), 1);
        EXPECT_EQ(polling.polls, 17);
        EXPECT_EQ(output.bytes(), after_rows(12));
    }
}

TEST_F(PngHost, rows_behind_the_last_can_stop_the_decode) {
    polling.statuses.assign(15, 0);
    polling.statuses.push_back(-1);
    EXPECT_EQ(flaws(run(file_with_rows(17), PELM_SOURCE_MEMORY, request, size), 0), "");
    EXPECT_EQ(polling.polls, 16);
}

TEST_F(PngHost, missing_rows_succeed_and_leave_the_rest_of_the_buffer) {
    for (const uint32_t kind : all_source_kinds)
        for (const Call call : {Call::one_shot, Call::iterative, Call::line})
            for (uint32_t rows = 0; rows < 12; ++rows) {
                reset();
                const Outcome outcome = run(file_with_rows(rows), kind, request, size, call, 50);
                EXPECT_EQ(flaws(outcome), "") << rows;
                EXPECT_EQ(polling.polls, static_cast<int>(rows));
                EXPECT_EQ(difference(after_rows(rows), outcome.output, picture, request), "");
            }
}

TEST_F(PngHost, an_incomplete_last_row_is_neither_written_nor_polled) {
    Png png = png_of(picture);
    Bytes data = scanlines_of(png);
    data.resize(data.size() - 1);
    png.scanlines = data;
    const Outcome outcome = run(build(png), PELM_SOURCE_MEMORY, request, size);
    EXPECT_EQ(flaws(outcome), "");
    EXPECT_EQ(polling.polls, 11);
    EXPECT_EQ(outcome.output, after_rows(11));
}

TEST_F(PngHost, one_byte_behind_the_last_row_changes_nothing) {
    Png png = png_of(picture);
    Bytes data = scanlines_of(png);
    data.push_back(9);
    png.scanlines = data;
    const Outcome outcome = run(build(png), PELM_SOURCE_STREAM, request, size);
    EXPECT_EQ(flaws(outcome), "");
    EXPECT_EQ(polling.polls, 12);
    EXPECT_EQ(outcome.output, after_rows(12));
}

TEST_F(PngHost, rows_that_scaling_drops_are_polled) {
    picture = noise_picture(grey, 8, 30, 30);
    request = {7, 0, 10, 10};
    size = 400;
    EXPECT_EQ(flaws(run(file_of(picture), PELM_SOURCE_MEMORY, request, size)), "");
    EXPECT_EQ(polling.polls, 30);
}

TEST_F(PngHost, formats_that_are_not_written_are_polled_too) {
    for (const int32_t side : {13, 7}) {
        reset();
        EXPECT_EQ(flaws(run(file_of(picture), PELM_SOURCE_MEMORY, {3, 0, side, side}, 1000)), "");
        EXPECT_EQ(polling.polls, 12);
    }
}

TEST_F(PngHost, formats_that_are_not_written_count_their_rows_as_others_do) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{grey, 8}})
        for (const int32_t side : {13, 7}) {
            picture = noise_picture(layout.colour_type, layout.depth, 11, 12);
            const Outcome written = run(file_of(picture), PELM_SOURCE_MEMORY, {7, 0, side, side}, 1000, Call::line, 2);
            const Outcome other = run(file_of(picture), PELM_SOURCE_MEMORY, {4, 0, side, side}, 1000, Call::line, 2);
            EXPECT_EQ(written.results, other.results);
        }
}

} // namespace
} // namespace pelm::test

// The host is asked after every pass row; rows behind the last pass, and missing ones.
#include "png/state.h"
#include "tests/png/interlaced/passes.h"

namespace pelm::test {
namespace {

class PngInterlacedHost : public PngDecoding {
protected:
    Picture picture = interlaced_noise({rgb, 8}, true, 11, 12);
    std::vector<Request> requests = {
        {1, 0, 12, 13}, {1, 0, 7, 7}, {1, PELM_INTERLACE_FRAME | 4, 7, 7}, {7, PELM_INTERLACE_FRAME, 12, 12}};
    size_t row_count() const { return pass_rows_of(picture).size(); }
    int all_polls() const { return static_cast<int>(row_count()); }
    // Scanlines of whole rows behind the last pass, each as long as a row of the image.
    Bytes file_with_surplus(size_t rows, size_t bytes = 0) const {
        Png png = interlaced_png_of(picture);
        Bytes data = scanlines_of(png);
        data.resize(data.size() + rows * (picture.row_bytes() + 1) + bytes, 4);
        png.scanlines = data;
        return build(png);
    }
};

TEST_F(PngInterlacedHost, every_pass_row_is_written_before_the_poll_that_follows_it) {
    for (const uint32_t kind : all_source_kinds)
        for (const Request &request : requests) {
            reset();
            Output output(buffer_size(picture, request));
            Decode decode(interlaced_file_of_blocks(picture, Blocks::mixed, 50), kind, request);
            polling.at_poll = [&](int poll) {
                ASSERT_EQ(difference(expected_after(picture, request, static_cast<size_t>(poll)), output.bytes(),
                                     picture, request),
                          "")
                    << "poll " << poll;
            };
            EXPECT_EQ(decode.one_shot(output.data()), 1);
            EXPECT_EQ(polling.polls, all_polls());
            EXPECT_EQ(output.bytes(), expected_bytes(picture, request));
        }
}

TEST_F(PngInterlacedHost, a_negative_status_stops_the_decode_at_any_row) {
    for (const uint32_t kind : all_source_kinds)
        for (const Request &request : requests)
            for (const Call call : {Call::one_shot, Call::iterative, Call::line})
                for (int stop = 1; stop <= all_polls(); ++stop) {
                    reset();
                    polling.statuses.assign(static_cast<size_t>(stop), 0);
                    polling.statuses.back() = -stop;
                    const Outcome outcome =
                        run(interlaced_file_of(picture), kind, request, buffer_size(picture, request), call);
                    ASSERT_EQ(flaws(outcome, 0), "") << "poll " << stop;
                    ASSERT_EQ(polling.polls, stop);
                    ASSERT_EQ(difference(expected_after(picture, request, static_cast<size_t>(stop)), outcome.output,
                                         picture, request),
                              "");
                }
}

TEST_F(PngInterlacedHost, a_positive_status_sleeps_once_and_goes_on) {
    polling.statuses = {0, 5, 0, 7, 7, 0, INT32_MAX};
    const Outcome outcome =
        run(interlaced_file_of(picture), PELM_SOURCE_MEMORY, requests[0], buffer_size(picture, requests[0]));
    EXPECT_EQ(flaws(outcome), "");
    EXPECT_EQ(polling.polls, all_polls());
    const std::vector<Polling::Sleep> sleeps = {{2, 5}, {4, 7}, {5, 7}, {7, INT32_MAX}};
    EXPECT_EQ(polling.sleeps, sleeps);
}

TEST_F(PngInterlacedHost, being_told_to_skip_the_check_changes_nothing) {
    for (const uint32_t kind : all_source_kinds) {
        reset();
        Decode decode(interlaced_file_of_parts(picture, scanlines_by_pass(picture), Blocks::stored), kind, requests[0]);
        Output output(buffer_size(picture, requests[0]));
        ASSERT_EQ(decode.iterative(output.data()), 4);
        const int before = polling.polls;
        static_cast<PngDecodeState *>(decode.info.decoderState)->skipStatusCheck = 1;
        EXPECT_EQ(decode.one_shot(output.data()), 1);
        EXPECT_EQ(polling.polls, all_polls() + 1) << "and once on coming back";
        EXPECT_GT(polling.polls, before);
    }
}

TEST_F(PngInterlacedHost, a_resumed_call_can_be_stopped_before_anything_is_written) {
    for (const uint32_t kind : all_source_kinds) {
        reset();
        Decode decode(interlaced_file_of_parts(picture, scanlines_by_pass(picture), Blocks::stored), kind, requests[0]);
        Output output(buffer_size(picture, requests[0]));
        ASSERT_EQ(decode.iterative(output.data()), 4);
        const Bytes before = output.bytes();
        polling.statuses.assign(static_cast<size_t>(polling.polls), 0);
        polling.statuses.push_back(-1);
        EXPECT_EQ(decode.iterative(output.data()), 0);
        EXPECT_EQ(output.bytes(), before);
        EXPECT_FALSE(decode.started());
        EXPECT_TRUE(host.live_blocks().empty());
    }
}

TEST_F(PngInterlacedHost, rows_behind_the_last_pass_are_polled_and_not_written) {
    for (const uint32_t kind : all_source_kinds)
        for (const Request &request : requests)
            for (const size_t surplus : {1u, 2u, 11u, 12u, 13u, 40u}) {
                reset();
                const Outcome outcome = run(file_with_surplus(surplus), kind, request, buffer_size(picture, request));
                EXPECT_EQ(flaws(outcome), "");
                EXPECT_EQ(polling.polls, all_polls() + static_cast<int>(surplus));
                EXPECT_EQ(difference(expected_bytes(picture, request), outcome.output, picture, request), "");
            }
}

TEST_F(PngInterlacedHost, a_single_pixel_may_be_followed_by_any_number_of_rows) {
    for (const Layout layout : all_layouts) {
        reset();
        picture = interlaced_noise(layout, true, 1, 1);
        const Outcome outcome = run(file_with_surplus(300), PELM_SOURCE_MEMORY, own_size(picture), 4);
        EXPECT_EQ(flaws(outcome), "");
        EXPECT_EQ(polling.polls, 301);
        EXPECT_EQ(outcome.output, expected_bytes(picture, own_size(picture)));
    }
}

TEST_F(PngInterlacedHost, rows_behind_the_last_pass_are_counted) {
    std::vector<Bytes> parts = scanlines_by_pass_row(picture);
    for (int i = 0; i < 15; ++i)
        parts.emplace_back(picture.row_bytes() + 1, uint8_t{1});
    Decode decode(interlaced_file_of_parts(picture, parts, Blocks::stored), PELM_SOURCE_STREAM, requests[0]);
    Output output(buffer_size(picture, requests[0]));
    for (size_t call = 1; call < parts.size(); ++call) {
        ASSERT_EQ(decode.iterative(output.data()), 4);
        const auto &state = *static_cast<const PngDecodeState *>(decode.info.decoderState);
        EXPECT_EQ(state.rowsDone, call);
        if (call >= row_count()) {
            EXPECT_EQ(state.interlaceMethod, 8);
        }
    }
    EXPECT_EQ(decode.iterative(output.data()), 1);
    EXPECT_EQ(output.bytes(), expected_bytes(picture, requests[0]));
}

TEST_F(PngInterlacedHost, missing_rows_succeed_and_leave_the_rest_of_the_buffer) {
    const std::vector<Bytes> parts = scanlines_by_pass_row(picture);
    for (const uint32_t kind : all_source_kinds)
        for (const Request &request : {requests[0], requests[1]})
            for (const Call call : {Call::one_shot, Call::iterative, Call::line})
                for (size_t rows = 0; rows < parts.size(); ++rows)
                    for (const bool begun : {false, true}) { // the next row lacks its last byte
                        reset();
                        Bytes data;
                        for (size_t i = 0; i < rows; ++i)
                            data.insert(data.end(), parts[i].begin(), parts[i].end());
                        if (begun) data.insert(data.end(), parts[rows].begin(), parts[rows].end() - 1);
                        Png png = interlaced_png_of(picture);
                        png.scanlines = data;
                        const Outcome outcome = run(build(png), kind, request, buffer_size(picture, request), call);
                        ASSERT_EQ(flaws(outcome), "") << rows;
                        ASSERT_EQ(polling.polls, static_cast<int>(rows));
                        ASSERT_EQ(difference(expected_after(picture, request, rows), outcome.output, picture, request),
                                  "");
                    }
}

} // namespace
} // namespace pelm::test

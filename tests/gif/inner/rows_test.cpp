// The row writers: the order of rows, what they refuse, and what they use up.
#include "gif/line_rows.h"
#include "tests/gif/inner/decoding_record.h"

namespace pelm::test {
namespace {

class GifRows : public GifTest {
protected:
    // The rows in the order in which they would be written.
    static std::vector<int32_t> order(GifDecoderState &state, size_t count) {
        std::vector<int32_t> rows;
        while (rows.size() < count) {
            rows.push_back(state.sourceRow);
            EXPECT_EQ(PELMI_WriteTheLine(&state, state.outputStart), 1);
        }
        return rows;
    }
};

TEST_F(GifRows, interlaced_rows_go_their_way_from_any_top) {
    for (uint16_t height = 2; height < 40; ++height)
        for (const int32_t top : {0, 3, 100}) {
            DecodingRecord record(still_file({5, height, 2, true}).bytes, own_size(5, height, 99));
            ASSERT_EQ(record.seek(), 1);
            record.state->imageTop = record.state->sourceRow = top;
            std::vector<int32_t> expected;
            for (const uint32_t row : interlaced_order(height))
                expected.push_back(top + static_cast<int32_t>(row));
            EXPECT_EQ(order(*record.state, height), expected);
            EXPECT_EQ(record.state->interlaced, 0u);
            EXPECT_GE(record.state->sourceRow, top + height) << "nothing seems to be missing";
        }
}

TEST_F(GifRows, a_pass_that_there_is_not_is_refused) {
    for (const uint32_t pass : {5u, 6u, 0xFFFFFFFFu})
        for (const uint16_t height : std::initializer_list<uint16_t>{3, 9}) {
            DecodingRecord record(still_file({5, height, 2, true}).bytes, own_size(5, height));
            ASSERT_EQ(record.seek(), 1);
            record.state->interlaced = pass;
            EXPECT_EQ(PELMI_WriteTheLine(record.state, record.state->outputStart), 0) << pass;
        }
}

TEST_F(GifRows, a_refused_row_fails_both_drivers) {
    for (const bool slices : {false, true}) {
        DecodingRecord record(still_file({5, 9, 2, true}).bytes, own_size(5, 9));
        ASSERT_EQ(record.seek(), 1);
        record.state->interlaced = 7;
        InputSource *const source = &record.source.source;
        if (!slices) {
            EXPECT_EQ(PELMI_DecodeGIFImage(source, record.state, record.state->outputStart), 0);
            continue;
        }
        EXPECT_EQ(PELMI_DecodeGIFImageIter(source, record.state, record.state->outputStart, 1), 4);
        EXPECT_EQ(PELMI_DecodeGIFImageIter(source, record.state, record.state->outputStart, 0), 0);
    }
}

TEST_F(GifRows, rows_at_and_below_the_end_of_the_screen_are_not_written) {
    Bytes output(5 * 9 * 4, gif_background);
    DecodingRecord record(still_file({5, 9, 2}).bytes, own_size(5, 9), false, output.data());
    ASSERT_EQ(record.seek(), 1);
    for (const int32_t row : {9, 10, 65535, 131070}) {
        record.state->sourceRow = row;
        EXPECT_EQ(PELMI_WriteTheLine(record.state, record.state->outputStart), 1);
        EXPECT_EQ(record.state->sourceRow, row + 1);
        EXPECT_EQ(output, Bytes(output.size(), gif_background));
    }
    record.state->sourceRow = 8;
    EXPECT_EQ(PELMI_WriteTheLine(record.state, record.state->outputStart), 1);
    EXPECT_EQ(output[8 * 20 - 1], gif_background);
    EXPECT_EQ(output[8 * 20 + 3], 255);
}

TEST_F(GifRows, each_image_has_its_own_colours) {
    GifFile file;
    file.screen(1, 1, {10, 20, 30, 1, 2, 3}).image({0, 0, 1, 1}, {0}, 2);
    file.image({0, 0, 1, 1}, {0}, 2, {40, 50, 60, 4, 5, 6}).image({0, 0, 1, 1}, {1}, 2);
    Bytes output(4);
    DecodingRecord record(file.trailer().bytes, own_size(1, 1), false, output.data());
    for (const Bytes &expected : {Bytes{10, 20, 30, 255}, Bytes{40, 50, 60, 255}, Bytes{1, 2, 3, 255}}) {
        ASSERT_EQ(record.seek(), 1);
        EXPECT_EQ(PELMI_DecodeGIFImage(&record.source.source, record.state, record.state->outputStart), 1);
        EXPECT_EQ(output, expected);
    }
}

TEST_F(GifRows, pixels_behind_an_images_last_one_are_not_the_next_images) {
    GifFile file;
    file.screen(2, 1, {10, 20, 30, 40, 50, 60});
    file.image({0, 0, 2, 1}, {0, 0, 0}, 2).image({0, 0, 2, 1}, {1, 1}, 2); // 0, and the string of two behind it
    Bytes output(8);
    DecodingRecord record(file.trailer().bytes, own_size(2, 1), false, output.data());
    for (const Bytes &expected : {Bytes{10, 20, 30, 255}, Bytes{40, 50, 60, 255}}) {
        ASSERT_EQ(record.seek(), 1);
        EXPECT_EQ(PELMI_DecodeGIFImage(&record.source.source, record.state, record.state->outputStart), 1);
        EXPECT_EQ(Bytes(output.begin(), output.begin() + 4), expected);
    }
}

TEST_F(GifRows, a_line_refuses_interlaced_images_and_says_what_it_used_up) {
    Bytes output(5 * 9 * 4, gif_background);
    DecodingRecord record(still_file({5, 9, 2, true}).bytes, own_size(5, 9), false, output.data());
    ASSERT_EQ(record.seek(), 1);
    uint32_t consumed = 7;
    EXPECT_EQ(PELMI_GIFMakeOut1Row(record.state, 0, &consumed), 0);
    record.state->interlaced = 0;
    EXPECT_EQ(PELMI_GIFMakeOut1Row(record.state, 0, &consumed), 1);
    EXPECT_EQ(consumed, 1u);
    EXPECT_EQ(record.state->rowsOut, 1);
    EXPECT_EQ(record.state->sourceRow, 1);
}

TEST_F(GifRows, rows_below_the_screen_are_not_composed) {
    DecodingRecord record(still_file({5, 9, 2}).bytes, own_size(5, 9), true);
    ASSERT_EQ(record.seek(), 1);
    for (const int32_t row : {9, 65535, 131070}) {
        record.state->sourceRow = row;
        EXPECT_EQ(PELMI_MakeFrameLineBuffer(record.state), 1);
    }
    for (int i = 0; i < 45; ++i)
        EXPECT_EQ(record.state->canvas[i], 0xFFFFFFFFu);
    record.state->sourceRow = 8;
    EXPECT_EQ(PELMI_MakeFrameLineBuffer(record.state), 1);
    EXPECT_EQ(record.state->canvas[8 * 5], record.state->globalTable[0]);
    EXPECT_EQ(record.state->canvas[8 * 5 - 1], 0xFFFFFFFFu);
}

TEST_F(GifRows, a_frame_row_left_of_and_across_the_right_edge_is_cut_and_the_rest_comes_from_the_canvas) {
    DecodingRecord record(still_file({6, 3, 2}).bytes, own_size(6, 3), true);
    ASSERT_EQ(record.seek(), 1);
    GifDecoderState &state = *record.state;
    for (uint32_t i = 0; i < 18; ++i)
        state.canvas[i] = i;
    for (uint8_t i = 0; i < 6; ++i)
        state.pixelBuffer[i] = i % 4;
    for (const int32_t left : {0, 2, 5, 6, 7, 65535}) {
        state.imageLeft = left;
        state.sourceRow = 1;
        EXPECT_EQ(PELMI_MakeFrameLineBuffer(&state), 1);
        for (int32_t x = 0; x < 6; ++x) {
            const uint32_t expected =
                x < left ? static_cast<uint32_t>(6 + x) : state.globalTable[state.pixelBuffer[x - left]];
            EXPECT_EQ(state.rowBuffer[x], expected) << left << ", " << x;
        }
        for (uint32_t i = 6; i < 12; ++i)
            state.canvas[i] = i;
    }
}

// Rows of a line call may be longer than any buffer, and more than can be counted in its bytes.
TEST_F(GifRows, rows_behind_the_buffer_are_known_without_overflow) {
    GifDecoderState state{};
    state.outputFormat = 12;
    const struct {
        int32_t width, rows_before;
        size_t bytes;
        bool outside;
    } cases[] = {{5, 0, 1, false},
                 {5, 1, 20, true},
                 {5, 1, 21, false},
                 {5, 0, 0, true},
                 {INT32_MAX, 0, INT32_MAX, false},
                 {INT32_MAX, 1, INT32_MAX, true},
                 {INT32_MAX, INT32_MAX, PTRDIFF_MAX, true},
                 {0, 0, 0, true}};
    for (const auto &[width, rows_before, bytes, outside] : cases) {
        state.requestedWidth = width;
        state.rowsOut = rows_before;
        state.output.size = bytes;
        EXPECT_EQ(next_row_is_outside(state), outside) << "row " << rows_before << " of " << width << " pixels";
    }
}

} // namespace
} // namespace pelm::test

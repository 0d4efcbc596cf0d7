// Decodes by lines: as many output rows as are asked for, each call into a buffer of its own.
#include "tests/gif/support/gif_check.h"

namespace pelm::test {
namespace {

const ColourTable table = distinct_table(256);

class GifLine : public GifTest {
protected:
    // The rows of all calls together; `rows` are asked for each time.
    static Bytes gathered(const Bytes &file, const GifRequest &request, int32_t rows) {
        SideBySide both(file, request);
        Bytes all;
        int calls = 0;
        do {
            EXPECT_EQ(both.call(GifCall::line, rows), "");
            all.insert(all.end(), both.expected().begin(), both.expected().end());
        } while (both.info().decoderState != nullptr && ++calls < 1000);
        return all;
    }
    static void expect_beginning(const Bytes &all, const Bytes &expected, const std::string &what) {
        ASSERT_GE(all.size(), expected.size()) << what;
        EXPECT_TRUE(std::equal(expected.begin(), expected.end(), all.begin())) << what;
    }
};

TEST_F(GifLine, gives_the_picture_of_the_one_shot_call_however_many_rows_are_asked_for) {
    for (const uint16_t height : std::initializer_list<uint16_t>{1, 2, 13, 40})
        for (const uint32_t format : gif_formats) {
            const Bytes file = still_file({17, height, 6, false, height}).bytes;
            const Bytes expected = checked_decode(file, own_size(17, height, format)).output;
            for (int32_t rows = 1; rows <= height + 2; rows += 1 + rows / 4)
                expect_beginning(gathered(file, own_size(17, height, format), rows), expected,
                                 "format " + std::to_string(format) + ", " + std::to_string(rows) + " rows");
        }
}

TEST_F(GifLine, rows_that_one_string_completes_are_neither_lost_nor_repeated) {
    // Strings of up to 60 pixels in an image 3 pixels wide.
    const Bytes pixels(3 * 200, 1);
    Bytes marked = pixels;
    for (size_t row = 0; row < 200; row += 7)
        marked[row * 3] = static_cast<uint8_t>(row / 7 % 4);
    GifFile file;
    file.screen(3, 200, table).image({0, 0, 3, 200}, marked, 2).trailer();
    for (const int32_t rows : {1, 2, 3, 5, 64, 199, 200})
        expect_beginning(gathered(file.bytes, own_size(3, 200, 1), rows), rgb_of(marked, table), std::to_string(rows));
}

TEST_F(GifLine, reduced_rows_are_those_of_the_one_shot_call_and_one_more_call_ends) {
    const Bytes file = still_file({50, 41, 8}).bytes;
    for (const GifRequest &request :
         {GifRequest{1, 0, 0x100, 20, 16}, GifRequest{8, 0, 0x100, 49, 40}, GifRequest{0, 0, 0x100, 3, 40}}) {
        const GifOutcome whole = checked_decode(file, request);
        GifRequest lines = request;
        lines.box_width = whole.words.output_width; // the same size once more, in rows of just that width
        lines.box_height = whole.words.output_height;
        const int32_t height = whole.words.output_height;
        for (const int32_t rows : {1, 3, height - 1, height, height + 1})
            expect_beginning(gathered(file, lines, rows), checked_decode(file, lines).output, lines.described());
        SideBySide both(file, lines);
        EXPECT_EQ(both.call(GifCall::line, height), "");
        EXPECT_NE(both.info().decoderState, nullptr) << "the last row's source row is not used up";
        EXPECT_EQ(both.call(GifCall::line, height), "");
        EXPECT_EQ(both.result(), 1);
        EXPECT_EQ(both.info().decoderState, nullptr);
        EXPECT_EQ(both.expected(), Bytes(both.expected().size(), gif_background));
    }
}

TEST_F(GifLine, stretched_rows_come_from_their_source_row_as_often_as_needed) {
    const Bytes file = still_file({7, 5, 8}).bytes;
    for (const GifRequest &request :
         {GifRequest{1, 0, 0x700, 15, 19}, GifRequest{7, 0, 0x700, 3, 11}, GifRequest{10, 0, 0x700, 20, 2}})
        for (const int32_t rows : {1, 2, 4, 40})
            expect_beginning(gathered(file, request, rows), checked_decode(file, request).output, request.described());
}

TEST_F(GifLine, rows_are_left_aligned_whatever_rotation_and_placement) {
    const Bytes file = still_file({6, 4, 8}).bytes;
    const Bytes upright = checked_decode(file, own_size(6, 4, 1)).output;
    for (uint32_t turns = 0; turns < 4; ++turns)
        for (const uint32_t placement : {0u, 0x100u}) {
            const Bytes all = gathered(file, {1, turns, placement, 10, 10}, 4);
            for (size_t row = 0; row < 4; ++row)
                EXPECT_TRUE(std::equal(upright.begin() + static_cast<ptrdiff_t>(row * 18),
                                       upright.begin() + static_cast<ptrdiff_t>(row * 18 + 18),
                                       all.begin() + static_cast<ptrdiff_t>(row * 30)));
        }
}

TEST_F(GifLine, at_most_the_width_of_the_box_is_written) {
    for (uint32_t turns = 0; turns < 4; ++turns)
        for (const uint32_t placement : {0u, 0x100u, 0x700u})
            for (const int32_t width : {1, 3, 5, 6, 7, 30})
                for (const uint32_t format : gif_formats)
                    EXPECT_EQ(gif_difference(still_file({11, 6, 8}).bytes, {format, turns, placement, width, 8},
                                             GifCall::line, {}, 2),
                              "");
}

TEST_F(GifLine, no_rows_asked_for_begins_and_writes_nothing) {
    for (const int32_t rows : {0, -1, INT32_MIN}) {
        const Bytes file = still_file({6, 4, 8}).bytes;
        SideBySide both(file, own_size(6, 4, 1));
        for (int i = 0; i < 3; ++i) {
            EXPECT_EQ(both.call(GifCall::line, rows), "");
            EXPECT_EQ(both.result(), 1);
            EXPECT_NE(both.info().decoderState, nullptr);
        }
        EXPECT_EQ(both.call(GifCall::line, 4), "");
        EXPECT_EQ(both.expected(), checked_decode(file, own_size(6, 4, 1)).output);
    }
}

TEST_F(GifLine, an_interlaced_image_is_refused_when_its_first_row_is_asked_for) {
    SideBySide both(still_file({6, 4, 8, true}).bytes, own_size(6, 4));
    EXPECT_EQ(both.call(GifCall::line, 0), "");
    EXPECT_EQ(both.result(), 1);
    EXPECT_EQ(both.call(GifCall::line, 1), "");
    EXPECT_EQ(both.result(), 0);
    EXPECT_TRUE(host.live_blocks().empty());
}

TEST_F(GifLine, an_end_code_with_rows_missing_succeeds_once_and_then_fails) {
    GifFile file;
    file.screen(6, 9, table).descriptor({0, 0, 6, 9}).data(8, lzw_data(noise_pixels(6 * 5, 256, 2), 8)).trailer();
    SideBySide both(file.bytes, own_size(6, 9));
    EXPECT_EQ(both.call(GifCall::line, 9), "");
    EXPECT_EQ(both.result(), 1);
    EXPECT_NE(both.info().decoderState, nullptr);
    EXPECT_EQ(both.call(GifCall::line, 9), "");
    EXPECT_EQ(both.result(), 0);
    EXPECT_EQ(both.info().decoderState, nullptr);
    EXPECT_TRUE(host.live_blocks().empty());
}

TEST_F(GifLine, a_file_that_ends_with_rows_missing_succeeds_once_and_then_fails) {
    Bytes file = still_file({20, 30, 8}).bytes;
    file.resize(file.size() - 300);
    for (const int32_t rows : {30, 4}) {
        SideBySide both(file, own_size(20, 30));
        std::vector<int32_t> results;
        do {
            EXPECT_EQ(both.call(GifCall::line, rows), "");
            results.push_back(both.result());
        } while (both.info().decoderState != nullptr && results.size() < 50);
        ASSERT_GE(results.size(), 2u);
        EXPECT_EQ(results.back(), 0);
        EXPECT_EQ(results[results.size() - 2], 1);
    }
}

TEST_F(GifLine, a_refused_file_frees_everything) {
    SideBySide both(GifFile().screen(6, 9, table).raw({0x21, 0xF9, 9, 9}).bytes, own_size(6, 9));
    EXPECT_EQ(both.call(GifCall::line, 9), "");
    EXPECT_EQ(both.result(), 0);
    EXPECT_TRUE(host.live_blocks().empty());
}

TEST_F(GifLine, an_image_below_the_top_of_the_screen_is_written_one_to_one_and_hardly_reduced) {
    for (const uint16_t top : std::initializer_list<uint16_t>{1, 5, 10}) {
        GifFile file;
        file.screen(9, 21, table).image({0, top, 9, 11}, noise_pixels(99, 256, 3), 8).trailer();
        EXPECT_EQ(gif_difference(file.bytes, own_size(9, 21, 1), GifCall::line, {}, 4), "");
        for (int32_t height = 1; height <= 20; ++height)
            EXPECT_EQ(gif_difference(file.bytes, {1, 0, 0x700, 9, height}, GifCall::line, {}, 4), "");
    }
}

} // namespace
} // namespace pelm::test

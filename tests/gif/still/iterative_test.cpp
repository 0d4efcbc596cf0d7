// Decodes in slices: what each call does, how the last one ends, and that the picture is that of the one-shot call.
#include "tests/gif/support/gif_check.h"

namespace pelm::test {
namespace {

const ColourTable table = distinct_table(256);

GifFile headed(uint16_t width, uint16_t height) {
    GifFile file;
    return file.screen(width, height, table).descriptor({0, 0, width, height});
}

class GifIterative : public GifTest {
protected:
    // The results of all calls.
    static std::vector<int32_t> results_of(const Bytes &file, const GifRequest &request) {
        SideBySide both(file, request);
        std::vector<int32_t> results;
        do {
            EXPECT_EQ(both.call(GifCall::iterative), "");
            results.push_back(both.result());
        } while (both.result() == PELM_RESULT_MORE && results.size() < 1000);
        EXPECT_EQ(both.info().decoderState, nullptr);
        EXPECT_TRUE(TestHost::get().live_blocks().empty());
        return results;
    }
};

TEST_F(GifIterative, the_first_call_writes_nothing_and_asks_for_more) {
    SideBySide both(still_file({8, 3}).bytes, own_size(8, 3));
    EXPECT_EQ(both.call(GifCall::iterative), "");
    EXPECT_EQ(both.result(), 4);
    EXPECT_EQ(both.expected(), Bytes(8 * 3 * 4, gif_background));
    EXPECT_NE(both.info().decoderState, nullptr);
    EXPECT_EQ(both.call(GifCall::iterative), "");
    EXPECT_EQ(both.result(), 1);
    EXPECT_EQ(both.info().decoderState, nullptr);
}

TEST_F(GifIterative, the_sixteenth_cycle_asks_for_more_even_when_the_image_is_complete) {
    // One pixel per code and one code per row: a cycle for each row.
    const LzwOptions literals{.literals_only = true};
    const auto results = [&](uint16_t height) {
        const Bytes pixels = noise_pixels(height, 256, height);
        GifFile file;
        file.screen(1, height, table).image({0, 0, 1, height}, pixels, 8, {}, literals).trailer();
        return results_of(file.bytes, own_size(1, height));
    };
    EXPECT_EQ(results(15), (std::vector<int32_t>{4, 1}));
    EXPECT_EQ(results(16), (std::vector<int32_t>{4, 4, 1}));
    EXPECT_EQ(results(17), (std::vector<int32_t>{4, 4, 1}));
    EXPECT_EQ(results(32), (std::vector<int32_t>{4, 4, 4, 1}));
    EXPECT_EQ(results(33), (std::vector<int32_t>{4, 4, 4, 1}));
}

TEST_F(GifIterative, cycles_are_counted_and_not_rows) {
    // Strings of 1, 2, 3 ... pixels in an image one pixel wide: each code is a cycle and ever more rows.
    Codes codes = {4, 3};
    for (uint32_t code = 6; code < 6 + 20; ++code)
        codes.push_back(code);
    const Bytes file = headed(1, 140).data(2, packed_codes(codes, 2)).trailer().bytes;
    // The first pixel's row and the first 15 strings: 1 + 2 + ... + 16 = 136 rows in 16 cycles.
    EXPECT_EQ(results_of(file, own_size(1, 140)), (std::vector<int32_t>{4, 4, 1}));
    EXPECT_EQ(results_of(headed(1, 136).data(2, packed_codes(codes, 2)).bytes, own_size(1, 136)),
              (std::vector<int32_t>{4, 4, 1}));
    EXPECT_EQ(results_of(headed(1, 120).data(2, packed_codes(codes, 2)).bytes, own_size(1, 120)),
              (std::vector<int32_t>{4, 1}));
}

TEST_F(GifIterative, gives_the_picture_of_the_one_shot_call) {
    for (const bool interlaced : {false, true})
        for (const uint16_t height : std::initializer_list<uint16_t>{1, 15, 16, 17, 31, 32, 33, 100}) {
            const Bytes file = still_file({19, height, 5, interlaced, height}).bytes;
            for (const GifRequest &request :
                 {own_size(19, height), GifRequest{1, 1, 0, height, 12}, GifRequest{0, 3, 0x700, height, 25}}) {
                const GifOutcome outcome = checked_decode(file, request, GifCall::iterative);
                EXPECT_EQ(outcome.output, checked_decode(file, request).output) << request.described();
            }
        }
}

TEST_F(GifIterative, a_first_call_that_ends_at_once_keeps_its_outcome_for_the_next) {
    using Results = std::vector<int32_t>;
    const GifRequest request = own_size(6, 9);
    EXPECT_EQ(results_of(headed(6, 9).data(2, packed_codes({4, 5}, 2)).bytes, request), (Results{4, 1}));
    EXPECT_EQ(results_of(headed(6, 9).data(2, packed_codes({5}, 2)).bytes, request), (Results{4, 1}));
    EXPECT_EQ(results_of(headed(6, 9).raw({2}).bytes, request), (Results{4, 0})) << "nothing behind the code size";
    EXPECT_EQ(results_of(headed(6, 9).raw({2, 9, 1, 1}).bytes, request), (Results{4, 1})) << "the file ends";
    EXPECT_EQ(results_of(headed(6, 9).raw({12, 1, 0, 0}).bytes, request), (Results{4, 0})) << "code size 12";
    GifFile rowless;
    rowless.screen(6, 9, table).descriptor({0, 0, 6, 0}).raw({12, 1, 0, 0});
    EXPECT_EQ(results_of(rowless.bytes, request), (Results{4, 1})) << "no rows are missing";
}

TEST_F(GifIterative, the_output_arguments_of_later_calls_are_ignored) {
    const Bytes file = still_file({40, 60, 8}).bytes;
    const Bytes expected = checked_decode(file, own_size(40, 60, 1)).output;
    host.reset();
    TestSource source(PELM_SOURCE_STREAM, file);
    ImageDecodeInfo info{};
    info.input = &source.source;
    info.outputFormat = 1;
    Bytes output(expected.size(), 1);
    ASSERT_EQ(ZOTARPELMI_DecodeGIFIter(&info, output.data(), 40, 60), 4);
    info.outputFormat = 7;
    info.flags = PELM_ROTATE_90;
    int32_t result;
    do
        result = ZOTARPELMI_DecodeGIFIter(&info, nullptr, -7, 2);
    while (result == 4);
    EXPECT_EQ(result, 1);
    EXPECT_EQ(output, expected);
}

TEST_F(GifIterative, an_abort_frees_everything_at_any_moment) {
    const Bytes file = still_file({19, 100, 5}).bytes;
    for (int calls = 0; calls < 7; ++calls) {
        SideBySide both(file, own_size(19, 100));
        for (int i = 0; i < calls; ++i)
            EXPECT_EQ(both.call(GifCall::iterative), "");
        EXPECT_EQ(both.abort(), "");
        EXPECT_TRUE(host.live_blocks().empty());
        // And the next call begins anew.
        EXPECT_EQ(both.all_calls(GifCall::iterative), "");
        EXPECT_EQ(both.result(), 1);
    }
}

TEST_F(GifIterative, an_abort_needs_a_request_and_no_state) {
    EXPECT_EQ(ZOTARPELMI_AbortGIFIter(nullptr), 0);
    ImageDecodeInfo info{};
    EXPECT_EQ(ZOTARPELMI_AbortGIFIter(&info), 1);
    EXPECT_EQ(info.decoderState, nullptr);
    EXPECT_TRUE(host.violations.empty());
}

TEST_F(GifIterative, calls_of_another_kind_fail_and_leave_the_state_alone) {
    constexpr GifCall kinds[] = {GifCall::iterative, GifCall::line, GifCall::frame, GifCall::frame_iterative};
    GifFile file = still_file({9, 60, 4});
    file.bytes.pop_back();
    for (int i = 0; i < 2; ++i) // further images keep the animated calls going
        file.image({0, 0, 9, 60}, noise_pixels(540, 16, 3), 4);
    Bytes output(9 * 60 * 4);
    const auto call = [&](GifCall kind, ImageDecodeInfo &info) {
        switch (kind) {
        case GifCall::iterative: return ZOTARPELMI_DecodeGIFIter(&info, output.data(), 9, 60);
        case GifCall::line: return ZOTARPELMI_DecodeGIFLine(&info, output.data(), 9, 60, 2);
        case GifCall::frame: return ZOTARPELMI_DecodeAGIF(&info, output.data(), 9, 60);
        default: return ZOTARPELMI_DecodeAGIFIter(&info, output.data(), 9, 60);
        }
    };
    for (const GifCall starter : kinds)
        for (const GifCall other : kinds) {
            if (starter == other) continue;
            host.reset();
            TestSource source(PELM_SOURCE_MEMORY, file.bytes);
            ImageDecodeInfo info{};
            info.input = &source.source;
            info.outputFormat = 7;
            const int32_t started = call(starter, info);
            ASSERT_NE(info.decoderState, nullptr) << name_of(starter);
            void *const state = info.decoderState;
            const Bytes before = output;
            const std::vector<uint32_t> blocks = host.live_blocks();
            EXPECT_EQ(call(other, info), 0) << name_of(other) << " after " << name_of(starter);
            EXPECT_EQ(info.decoderState, state);
            EXPECT_EQ(host.live_blocks(), blocks);
            EXPECT_EQ(output, before);
            EXPECT_EQ(call(starter, info), started) << "goes on";
            EXPECT_EQ(ZOTARPELMI_AbortGIFIter(&info), 1);
        }
}

} // namespace
} // namespace pelm::test

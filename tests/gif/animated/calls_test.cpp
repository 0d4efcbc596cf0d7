// Frame by frame: results, the request's words, colour tables, starting again and giving up.
#include "tests/gif/animated/frames.h"

namespace pelm::test {
namespace {

constexpr uint16_t width = 10, height = 8;
constexpr GifRequest request{7, 0, 0, width, height};

Animation three_frames() {
    Animation animation{width, height, 3, 1, {}, true, 4};
    animation.frames = {{{0, 0, width, height}, {1, -1, 7}},
                        {{2, 3, 5, 4}, {2, 3, 0}, distinct_table(8, 9)},
                        {{0, 0, 9, 8, true}, {3, 1, 65535}, {}}};
    return animation;
}

// A request for these, which nothing has been called with yet.
struct Fresh {
    TestSource source{PELM_SOURCE_STREAM, three_frames().file()};
    ImageDecodeInfo info{};
    Bytes output = Bytes(width * height * 4, gif_background);

    Fresh() {
        info.input = &source.source;
        info.outputFormat = 7;
    }
    int32_t next() { return ZOTARPELMI_DecodeAGIF(&info, output.data(), width, height); }
};

class GifFrames : public GifTest {
protected:
    static Bytes raw(const ColourTable &table) {
        Bytes bytes = table;
        bytes.resize(1024);
        return bytes;
    }
    static void free_tables(ImageDecodeInfo &info) {
        for (void **const table : {&info.globalColorTable, &info.localColorTable}) {
            if (*table != nullptr) ZOTARPELM_OsFree(*table);
            *table = nullptr;
        }
    }
};

TEST_F(GifFrames, each_call_delivers_a_frame_and_the_last_one_says_so) {
    const auto frames = frames_of(three_frames().file(), request);
    ASSERT_EQ(frames.size(), 3u);
    EXPECT_EQ(frames[0].result, 1);
    EXPECT_EQ(frames[1].result, 1);
    EXPECT_EQ(frames[2].result, 3);
    EXPECT_FALSE(frames[2].words.has_state);
}

TEST_F(GifFrames, a_single_frame_is_the_last) {
    Animation animation{width, height, 3, 1, {{{0, 0, width, height}, {}}}, true, 4};
    for (const GifCall call : frame_calls) {
        const auto frames = frames_of(animation.file(), request, call);
        ASSERT_EQ(frames.size(), 1u);
        EXPECT_EQ(frames[0].result, 3);
    }
}

TEST_F(GifFrames, delays_are_milliseconds_and_tables_are_told) {
    const Animation animation = three_frames();
    const auto frames = frames_of(animation.file(), request);
    ASSERT_EQ(frames.size(), 3u);
    EXPECT_EQ(frames[0].words.frame_delay, 70u);
    EXPECT_EQ(frames[1].words.frame_delay, 0u);
    EXPECT_EQ(frames[2].words.frame_delay, 655350u);
    EXPECT_EQ(frames[0].words.colour_table_state, 0u);
    EXPECT_EQ(frames[1].words.colour_table_state, 1u);
    EXPECT_EQ(frames[2].words.colour_table_state, 0u);
    for (const DeliveredFrame &frame : frames)
        EXPECT_EQ(frame.words.global_table, raw(animation.table()));
    // Between calls the next frame has been found already.
    EXPECT_EQ(frames[0].words.local_table, raw(distinct_table(8, 9)));
    EXPECT_EQ(frames[1].words.local_table, Bytes(1024, 0));
    EXPECT_EQ(frames[2].words.local_table, Bytes(1024, 0));
}

TEST_F(GifFrames, getters_give_the_words) {
    Fresh fresh;
    ImageDecodeInfo &info = fresh.info;
    EXPECT_EQ(fresh.next(), 1);
    EXPECT_EQ(ZOTARPELMI_GetAGIFDelayTime(&info), 70u);
    EXPECT_EQ(ZOTARPELMI_GetAGIFColorTableState(&info), 0u);
    EXPECT_EQ(ZOTARPELMI_GetAGIFGlobalColorTable(&info), info.globalColorTable);
    EXPECT_EQ(ZOTARPELMI_GetAGIFLocalColorTable(&info), info.localColorTable);
    EXPECT_EQ(fresh.next(), 1);
    EXPECT_EQ(ZOTARPELMI_GetAGIFColorTableState(&info), 1u);
    EXPECT_EQ(ZOTARPELMI_AborAGIF(&info), 1);
    free_tables(info);
    EXPECT_TRUE(host.live_blocks().empty());
}

TEST_F(GifFrames, iterative_calls_write_no_word_but_the_transparency_of_the_next_frame) {
    SideBySide both(three_frames().file(), request);
    EXPECT_EQ(both.call(GifCall::frame_iterative), "");
    EXPECT_EQ(both.info().hasTransparency, 0xE0E0E0E0u) << "not by the first walk";
    while (both.result() == 4)
        EXPECT_EQ(both.call(GifCall::frame_iterative), "");
    EXPECT_EQ(both.result(), 1);
    EXPECT_EQ(both.info().hasTransparency, 1u);
    EXPECT_EQ(both.info().frameDelay, 0x18181818u);
    EXPECT_EQ(both.info().colorTableState, 0x19191919u);
    EXPECT_EQ(both.info().globalColorTable, nullptr);
    EXPECT_EQ(both.info().localColorTable, nullptr);
}

TEST_F(GifFrames, iterative_calls_copy_every_raw_table_to_a_buffer_of_the_callers) {
    GifSetting setting;
    setting.has_raw_table = true;
    const auto frames = frames_of(three_frames().file(), request, GifCall::frame_iterative, setting);
    ASSERT_EQ(frames.size(), 3u);
    const ColourTable local = distinct_table(8, 9);
    EXPECT_TRUE(std::equal(local.begin(), local.end(), frames[0].words.global_table->begin()));
}

TEST_F(GifFrames, iterative_calls_give_the_same_pictures) {
    for (const GifRequest &box : {request, GifRequest{1, 1, 0, 6, 9}, GifRequest{0, 3, 0x700, 20, 17}}) {
        const auto whole = frames_of(three_frames().file(), box);
        const auto slices = frames_of(three_frames().file(), box, GifCall::frame_iterative);
        ASSERT_EQ(whole.size(), slices.size());
        for (size_t i = 0; i < whole.size(); ++i) {
            EXPECT_EQ(whole[i].result, slices[i].result);
            EXPECT_EQ(whole[i].output, slices[i].output);
        }
    }
}

TEST_F(GifFrames, iterative_calls_stop_after_every_sixteenth_cycle) {
    Animation animation{3, 40, 2, 0, {}, true, 1};
    animation.frames = {{{0, 0, 3, 40}, {}}, {{0, 30, 3, 4}, {}}};
    SideBySide both(animation.file(), {7, 0, 0, 3, 40});
    std::vector<int32_t> results;
    do {
        EXPECT_EQ(both.call(GifCall::frame_iterative), "");
        results.push_back(both.result());
    } while (both.result() == 4 || both.result() == 1);
    EXPECT_EQ(results, (std::vector<int32_t>{4, 4, 4, 1, 4, 3}));
}

TEST_F(GifFrames, after_the_last_frame_a_call_begins_again) {
    Fresh fresh;
    std::vector<Bytes> outputs;
    for (int round = 0; round < 3; ++round) {
        std::fill(fresh.output.begin(), fresh.output.end(), uint8_t{9});
        for (const int32_t expected : {1, 1, 3}) {
            EXPECT_EQ(fresh.next(), expected);
            outputs.push_back(fresh.output);
        }
        EXPECT_EQ(fresh.info.decoderState, nullptr);
        EXPECT_EQ(host.live_blocks(), (std::vector<uint32_t>{1024, 1024}));
        free_tables(fresh.info);
    }
    for (size_t i = 3; i < outputs.size(); ++i)
        EXPECT_EQ(outputs[i], outputs[i - 3]);
}

TEST_F(GifFrames, a_local_table_that_was_taken_away_is_not_missed) {
    const auto expected = frames_of(three_frames().file(), request);
    host.reset();
    Fresh fresh;
    ImageDecodeInfo &info = fresh.info;
    for (const DeliveredFrame &frame : expected) { // the second one has a table of its own
        EXPECT_EQ(fresh.next(), frame.result);
        EXPECT_EQ(fresh.output, frame.output);
        EXPECT_EQ(info.colorTableState, frame.words.colour_table_state);
        if (info.localColorTable != nullptr) ZOTARPELM_OsFree(info.localColorTable);
        info.localColorTable = nullptr;
    }
    free_tables(info);
    EXPECT_TRUE(host.live_blocks().empty());
    EXPECT_TRUE(host.violations.empty());
}

TEST_F(GifFrames, the_output_arguments_of_later_calls_are_ignored) {
    const auto expected = frames_of(three_frames().file(), request);
    host.reset();
    Fresh fresh;
    EXPECT_EQ(fresh.next(), 1);
    fresh.info.outputFormat = 0;
    fresh.info.flags = PELM_ROTATE_180;
    EXPECT_EQ(ZOTARPELMI_DecodeAGIF(&fresh.info, nullptr, -1, 70000), 1);
    EXPECT_EQ(fresh.output, expected[1].output);
    EXPECT_EQ(ZOTARPELMI_DecodeAGIF(&fresh.info, nullptr, 0, 0), 3);
    EXPECT_EQ(fresh.output, expected[2].output);
}

TEST_F(GifFrames, giving_up_frees_all_but_the_tables) {
    for (const GifCall call : frame_calls)
        for (int calls = 0; calls < 4; ++calls) {
            SideBySide both(three_frames().file(), request);
            for (int i = 0; i < calls; ++i)
                EXPECT_EQ(both.call(call), "");
            EXPECT_EQ(both.abort(), "");
            EXPECT_EQ(host.live_blocks().size(), call == GifCall::frame && calls > 0 ? 2u : 0u);
        }
    EXPECT_EQ(ZOTARPELMI_AborAGIF(nullptr), 0);
    ImageDecodeInfo info{};
    EXPECT_EQ(ZOTARPELMI_AborAGIF(&info), 1);
}

TEST_F(GifFrames, null_requests_fail) {
    EXPECT_EQ(ZOTARPELMI_DecodeAGIF(nullptr, nullptr, 1, 1), 0);
    EXPECT_EQ(ZOTARPELMI_DecodeAGIFIter(nullptr, nullptr, 1, 1), 0);
}

TEST_F(GifFrames, a_missing_output_composes_and_writes_nothing) {
    GifSetting setting;
    setting.no_output = true;
    for (const GifCall call : frame_calls)
        EXPECT_EQ(frames_of(three_frames().file(), request, call, setting).size(), 3u);
}

TEST_F(GifFrames, tables_of_every_kind_colour_their_own_frames) {
    for (const bool has_global : {true, false}) {
        GifFile file;
        file.screen(16, 16, has_global ? distinct_table(256) : ColourTable{}, 200);
        Bytes all;
        for (int i = 0; i < 256; ++i)
            all.push_back(static_cast<uint8_t>(i));
        const ImagePlace place{0, 0, 16, 16};
        for (size_t entries = 256; entries >= 2; entries /= 2) { // shorter tables leave the rest of longer ones
            file.control({static_cast<uint8_t>(entries % 3 + 1), -1, 1});
            file.image(place, all, 8, distinct_table(entries, static_cast<uint32_t>(entries)));
            file.image(place, all, 8);
        }
        file.trailer();
        for (const uint32_t format : gif_formats)
            for (const GifCall call : frame_calls)
                EXPECT_EQ(frames_of(file.bytes, {format, 0, 0, 16, 16}, call).size(), 16u);
    }
}

TEST_F(GifFrames, stray_bytes_and_unknown_extensions_between_frames_are_walked_over) {
    Animation animation = three_frames();
    animation.has_trailer = false;
    GifFile file{animation.file()};
    file.raw({0, 0, 9, 255}).extension(0x10, {{1, 2, 3}}).control({1, -1, 3});
    file.image({0, 0, 4, 4}, noise_pixels(16, 8, 3), 3).trailer().raw({1, 2, 3});
    for (const GifCall call : frame_calls)
        EXPECT_EQ(frames_of(file.bytes, request, call).size(), 4u);
}

TEST_F(GifFrames, what_is_left_of_a_complete_frames_data_is_walked_over_byte_by_byte) {
    // Behind the last pixel that is needed the data goes on with bytes that look like blocks.
    for (const Bytes &rest : {Bytes{0x3B}, Bytes{0x21, 0xF9, 4, 1, 0, 0, 0, 0}, Bytes{0x2C}, Bytes{0x21, 0xFE, 1, 7}}) {
        const Bytes pixels = noise_pixels(width * height, 8, 3);
        Bytes packed = lzw_data(pixels, 8, {.ends = false, .literals_only = true});
        packed.insert(packed.end(), rest.begin(), rest.end());
        GifFile file;
        file.screen(width, height, distinct_table(8)).descriptor({0, 0, width, height}).data(8, packed);
        file.image({0, 0, width, height}, pixels, 8).trailer();
        for (const GifCall call : frame_calls)
            frames_of(file.bytes, request, call);
    }
}

} // namespace
} // namespace pelm::test

// Animations that end too early, hosts without memory, absurd screens.
#include "tests/gif/animated/frames.h"
#include "tests/gif/support/gif_blocks.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

constexpr uint16_t width = 10, height = 8;
constexpr GifRequest request{7, 0, 0, width, height};

Animation two_frames() {
    Animation animation{width, height, 3, 1, {}, true, 4};
    animation.frames = {{{0, 2, width, 5}, {2, 4, 7}}, {{2, 3, 5, 4, true}, {1, -1, 2}, distinct_table(8, 9)}};
    return animation;
}

std::vector<uint32_t> listed_blocks(bool with_tables) {
    std::vector<uint32_t> blocks;
    if (with_tables) blocks = gif_request_tables;
    for (const uint32_t size : gif_animated_blocks(width, height))
        blocks.push_back(size);
    return blocks;
}

class GifFrameFailures : public GifTest {
protected:
    struct Run {
        explicit Run(const Bytes &file) : source(PELM_SOURCE_MEMORY, file) {
            info.input = &source.source;
            info.outputFormat = 7;
        }
        int32_t call(GifCall which) {
            return which == GifCall::frame ? ZOTARPELMI_DecodeAGIF(&info, output.data(), width, height)
                                           : ZOTARPELMI_DecodeAGIFIter(&info, output.data(), width, height);
        }
        TestSource source;
        ImageDecodeInfo info{};
        Bytes output = Bytes(width * height * 4);
    };
};

TEST_F(GifFrameFailures, a_missing_trailer_fails_behind_the_last_frame_which_was_delivered) {
    Animation animation = two_frames();
    const auto whole = frames_of(animation.file(), request);
    animation.has_trailer = false;
    for (const GifCall call : frame_calls) {
        const auto frames = frames_of(animation.file(), request, call);
        ASSERT_EQ(frames.size(), 2u);
        EXPECT_EQ(frames[1].result, 0);
        EXPECT_EQ(frames[1].output, whole[1].output);
        EXPECT_FALSE(frames[1].words.has_state);
    }
}

TEST_F(GifFrameFailures, an_animation_may_end_at_any_byte) {
    const Bytes file = two_frames().file();
    for (size_t size = 0; size < file.size(); ++size)
        for (const GifCall call : frame_calls)
            for (const GifRequest &box : {request, GifRequest{0, 1, 0, 5, 7}}) {
                GifSetting setting;
                setting.kind = gif_source_kinds[size % 4];
                const Bytes cut(file.begin(), file.begin() + static_cast<ptrdiff_t>(size));
                EXPECT_EQ(gif_difference(cut, box, call, setting), "") << size << " bytes";
            }
}

TEST_F(GifFrameFailures, a_frame_whose_data_is_broken_keeps_the_canvas_and_the_walk_goes_on) {
    for (const Bytes &data : {packed_codes({8, 9}, 3), packed_codes({8, 1, 2, 9}, 3), lzw_data(Bytes(33, 5), 3)}) {
        GifFile file;
        file.screen(width, height, distinct_table(8)).control({1, -1, 7});
        file.image({0, 0, width, height}, noise_pixels(80, 8, 2), 3);
        file.control({2, 3, 11}).descriptor({1, 1, 7, 6}, distinct_table(8, 3)).data(3, data);
        file.image({3, 3, 2, 2}, noise_pixels(4, 8, 9), 3).trailer();
        for (const GifCall call : frame_calls) {
            const auto frames = frames_of(file.bytes, request, call);
            ASSERT_EQ(frames.size(), 3u);
            EXPECT_EQ(frames[2].result, 3);
            if (call == GifCall::frame) {
                EXPECT_EQ(frames[1].words.frame_delay, 110u);
                EXPECT_EQ(frames[1].words.colour_table_state, 1u);
            }
        }
    }
}

TEST_F(GifFrameFailures, code_size_12_decodes_nothing_and_the_walk_goes_on) {
    GifFile file;
    file.screen(width, height, distinct_table(8)).descriptor({1, 1, 7, 6}).data(12, Bytes(9, 1));
    file.image({3, 3, 2, 2}, noise_pixels(4, 8, 9), 3).trailer();
    for (const GifCall call : frame_calls)
        EXPECT_EQ(frames_of(file.bytes, request, call).size(), 2u);
}

TEST_F(GifFrameFailures, a_frame_that_ends_at_once_still_asks_for_another_iterative_call) {
    GifFile file;
    file.screen(width, height, distinct_table(8)).descriptor({1, 1, 7, 6}).data(3, packed_codes({8, 9}, 3)).trailer();
    SideBySide both(file.bytes, request);
    EXPECT_EQ(both.call(GifCall::frame_iterative), "");
    EXPECT_EQ(both.result(), 4);
    EXPECT_EQ(both.call(GifCall::frame_iterative), "");
    EXPECT_EQ(both.result(), 3);
}

TEST_F(GifFrameFailures, exactly_the_listed_blocks_are_allocated_in_order) {
    for (const GifCall call : frame_calls) {
        host.reset();
        Run run(two_frames().file());
        run.call(call);
        EXPECT_EQ(host.allocations, listed_blocks(call == GifCall::frame));
        ZOTARPELMI_AborAGIF(&run.info);
    }
}

TEST_F(GifFrameFailures, without_memory_for_the_tables_nothing_begins) {
    for (int failing = 1; failing <= 2; ++failing) {
        host.reset();
        host.faults.failing_allocation = failing;
        Run run(two_frames().file());
        EXPECT_EQ(run.call(GifCall::frame), 0);
        EXPECT_EQ(run.info.decoderState, nullptr);
        EXPECT_EQ(run.info.globalColorTable != nullptr, failing == 2);
        EXPECT_EQ(run.info.localColorTable, nullptr);
        EXPECT_EQ(host.live_blocks().size(), static_cast<size_t>(failing - 1));
        EXPECT_EQ(host.allocations.size(), static_cast<size_t>(failing));
    }
}

TEST_F(GifFrameFailures, every_other_allocation_that_fails_leaves_only_the_tables) {
    for (const GifCall call : frame_calls) {
        const size_t tables = call == GifCall::frame ? 2 : 0;
        for (size_t failing = tables + 1; failing <= tables + 12; ++failing) {
            host.reset();
            host.faults.failing_allocation = static_cast<int>(failing);
            Run run(two_frames().file());
            EXPECT_EQ(run.call(call), 0) << failing;
            EXPECT_EQ(run.info.decoderState, nullptr);
            EXPECT_EQ(host.live_blocks().size(), tables) << failing;
            EXPECT_EQ(host.allocations.size(), failing);
            EXPECT_TRUE(host.violations.empty());
        }
    }
}

TEST_F(GifFrameFailures, no_memory_for_a_wide_frame_fails_and_frees) {
    Animation animation{width, height, 3, 1, {}, true, 4};
    animation.frames = {{{0, 0, width, height}, {}}, {{0, 0, 90, 3}, {}}};
    for (const GifCall call : frame_calls) {
        host.reset();
        const size_t tables = call == GifCall::frame ? 2 : 0;
        host.faults.failing_allocation = static_cast<int>(tables) + 13;
        Run run(animation.file());
        int32_t result;
        do
            result = run.call(call);
        while (result == 4);
        EXPECT_EQ(result, 0);
        EXPECT_EQ(run.info.decoderState, nullptr);
        EXPECT_EQ(host.live_blocks().size(), tables);
    }
}

TEST_F(GifFrameFailures, a_first_walk_that_finds_nothing_frees_the_record) {
    const Bytes file = GifFile().screen(width, height, distinct_table(8)).raw({1, 2, 3}).bytes;
    for (const GifCall call : frame_calls) {
        host.reset();
        Run run(file);
        EXPECT_EQ(run.call(call), 0);
        EXPECT_EQ(run.info.decoderState, nullptr);
        EXPECT_EQ(host.live_blocks().size(), call == GifCall::frame ? 2u : 0u);
    }
}

TEST_F(GifFrameFailures, canvases_that_no_memory_holds_fail) {
    host.faults.largest_block = 32u << 20;
    for (const auto &[screen_width, screen_height] :
         {std::pair<uint16_t, uint16_t>{65535, 65535}, {65535, 16385}, {32768, 32768}, {46341, 46341}, {65535, 129}})
        for (const GifCall call : frame_calls) {
            host.reset();
            host.faults.largest_block = 32u << 20;
            GifFile file;
            file.screen(screen_width, screen_height, distinct_table(8));
            Run run(file.image({0, 0, 2, 2}, {1, 2, 3, 4}, 3).trailer().bytes);
            EXPECT_EQ(run.call(call), 0) << screen_width << " x " << screen_height;
            EXPECT_EQ(run.info.decoderState, nullptr);
            EXPECT_EQ(host.live_blocks().size(), call == GifCall::frame ? 2u : 0u);
        }
}

TEST_F(GifFrameFailures, sources_and_short_reads_give_the_same_frames) {
    for (const uint32_t kind : gif_source_kinds)
        for (const int32_t most : {13, 14, 50, 200, 1000})
            for (const GifCall call : frame_calls) {
                GifSetting setting;
                setting.kind = kind;
                setting.most_per_read = most;
                EXPECT_EQ(gif_difference(two_frames().file(), request, call, setting), "");
            }
}

TEST_F(GifFrameFailures, long_frames_that_may_be_broken_do_as_the_model) {
    const uint32_t seeds = quick() ? 20 : 300;
    for (uint32_t seed = 0; seed < seeds && !HasFailure(); ++seed) {
        Noise noise(seed + 8888);
        const auto below = [&noise](uint32_t limit) { return (noise.next() >> 6) % limit; };
        Animation animation{70, 90, static_cast<int>(2 + below(7)), 1, {}, true, seed};
        for (uint32_t i = 0; i < 4; ++i) {
            const uint16_t columns = static_cast<uint16_t>(1 + below(70)), rows = static_cast<uint16_t>(2 + below(88));
            Frame frame{{static_cast<uint16_t>(below(9)), static_cast<uint16_t>(below(9)), columns, rows, i == 2},
                        {static_cast<uint8_t>(below(4)), static_cast<int>(below(4)) - 1}};
            frame.pixels = pixel_runs(size_t{columns} * rows, 1u << animation.bits, 1 + below(60), noise);
            animation.frames.push_back(frame);
        }
        Bytes file = animation.file();
        for (uint32_t i = below(2) == 0 ? 1 + below(3) : 0; i > 0; --i)
            file[file.size() / 2 + below(static_cast<uint32_t>(file.size() / 2))] = static_cast<uint8_t>(below(256));
        const GifRequest box{gif_formats[below(8)], below(4), 0, below(2) == 0 ? 90 : 41, below(2) == 0 ? 90 : 33};
        EXPECT_EQ(gif_difference(file, box, frame_calls[seed % 2]), "") << "seed " << seed;
    }
}

TEST_F(GifFrameFailures, random_animations_do_as_the_model) {
    const uint32_t seeds = quick() ? 100 : 3000;
    for (uint32_t seed = 0; seed < seeds && !HasFailure(); ++seed) {
        Noise noise(seed + 4242);
        const auto below = [&noise](uint32_t limit) { return (noise.next() >> 6) % limit; };
        const auto size = [&below](uint32_t limit) { return static_cast<uint16_t>(below(limit)); };
        Animation animation{static_cast<uint16_t>(1 + below(16)),
                            static_cast<uint16_t>(1 + below(20)),
                            static_cast<int>(1 + below(4)),
                            static_cast<uint8_t>(below(20)),
                            {},
                            below(6) > 0,
                            seed};
        for (uint32_t i = 1 + below(5); i > 0; --i) {
            Frame frame;
            frame.place = {size(20), size(22), size(24), size(24), below(3) == 0};
            if (below(3) == 0) frame.place = {0, 0, animation.width, animation.height};
            frame.control = {static_cast<uint8_t>(below(8)), static_cast<int>(below(5)) - 1, size(65535), 0};
            frame.has_control = below(5) > 0;
            if (below(3) == 0) frame.local = distinct_table(size_t{2} << below(5), seed + i);
            animation.frames.push_back(frame);
        }
        Bytes file = animation.file();
        for (uint32_t i = below(3) == 0 ? 1 + below(4) : 0; i > 0; --i)
            file[30 + below(static_cast<uint32_t>(file.size()) - 30)] = static_cast<uint8_t>(below(256));
        const GifRequest box{gif_formats[below(8)], below(4),
                             below(3) == 0   ? 0x700u
                             : below(4) == 0 ? 0x100u
                                             : 0u,
                             static_cast<int32_t>(below(30)), static_cast<int32_t>(below(30))};
        EXPECT_EQ(gif_difference(file, box, frame_calls[seed % 2]), "") << "seed " << seed;
    }
}

} // namespace
} // namespace pelm::test

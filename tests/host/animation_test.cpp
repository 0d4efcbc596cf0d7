// What PelmAnimation.h tells about a GIF, over sources of every kind, and how a request is made ready again.
#include "PelmAnimation.h"

#include <cerrno>
#include <vector>

#include "tests/host/support.h"
#include "tests/support/small_gif.h"

namespace pelm::host_test {
namespace {

using Bytes = std::vector<uint8_t>;
using test::SmallFrame;
using test::SmallGif;

constexpr uint32_t room = 16;

struct Described {
    int error = -1;
    PelmAnimation animation;
    PelmAnimationFrame frames[room];
};

Bytes operator+(Bytes bytes, const Bytes &more) {
    bytes.insert(bytes.end(), more.begin(), more.end());
    return bytes;
}

Bytes first_of(Bytes bytes, size_t count) {
    bytes.resize(count);
    return bytes;
}

Described described(InputSource &source) {
    Described got;
    memset(&got.animation, 0xA5, sizeof got.animation);
    got.error = PelmAnimation_Describe(&source, &got.animation, got.frames, room);
    return got;
}

Described described(Bytes bytes) {
    Source source;
    EXPECT_EQ(PelmHost_OpenMemory(&source, PELM_SOURCE_MEMORY, bytes.data(), static_cast<int32_t>(bytes.size())), 0);
    return described(source);
}

SmallGif three_frames() {
    SmallGif gif;
    gif.width = 20;
    gif.height = 10;
    gif.loops = 3;
    SmallFrame small, last;
    small.left = 5, small.top = 6, small.width = 7, small.height = 2;
    small.delay = 7, small.disposal = 2, small.transparent = 3, small.interlaced = true;
    last.delay = 1, last.disposal = 3, last.colours = {1, 2, 3, 4, 5, 6, 7, 8};
    gif.frames = {SmallFrame{}, small, last};
    return gif;
}

TEST(Animation, tells_screen_frames_and_timing) {
    const Described got = described(gif_bytes(three_frames()));
    EXPECT_EQ(got.error, 0);
    EXPECT_EQ(got.animation.screenWidth, 20u);
    EXPECT_EQ(got.animation.screenHeight, 10u);
    EXPECT_EQ(got.animation.globalColours, 4u);
    EXPECT_EQ(got.animation.loopCount, 3);
    EXPECT_EQ(got.animation.plays, 4u);
    EXPECT_EQ(got.animation.ending, uint32_t{PELM_ANIMATION_TRAILER});
    ASSERT_EQ(got.animation.frameCount, 3u);
    const PelmAnimationFrame &first = got.frames[0], &second = got.frames[1], &third = got.frames[2];
    EXPECT_EQ(first.width, 4u);
    EXPECT_EQ(first.height, 3u);
    EXPECT_EQ(first.completeRows, 3u);
    EXPECT_EQ(first.delay, 0u);
    EXPECT_EQ(first.shownDelay, 100u);
    EXPECT_EQ(first.transparentIndex, -1);
    EXPECT_EQ(first.interlaced, 0u);
    EXPECT_EQ(first.localColours, 0u);
    EXPECT_EQ(second.left, 5u);
    EXPECT_EQ(second.top, 6u);
    EXPECT_EQ(second.width, 7u);
    EXPECT_EQ(second.completeRows, 2u);
    EXPECT_EQ(second.delay, 70u);
    EXPECT_EQ(second.shownDelay, 70u);
    EXPECT_EQ(second.disposal, 2u);
    EXPECT_EQ(second.transparentIndex, 3);
    EXPECT_EQ(second.interlaced, 1u);
    EXPECT_EQ(third.delay, 10u);
    EXPECT_EQ(third.shownDelay, 100u);
    EXPECT_EQ(third.disposal, 3u);
    EXPECT_EQ(third.transparentIndex, -1);
    EXPECT_EQ(third.localColours, 8u);
}

TEST(Animation, frames_without_a_graphic_control_block_have_the_values_of_the_one_before) {
    SmallGif gif = three_frames();
    gif.frames.insert(gif.frames.begin() + 2, SmallFrame{});
    const Described got = described(gif_bytes(gif));
    ASSERT_EQ(got.animation.frameCount, 4u);
    EXPECT_EQ(got.frames[2].delay, 70u);
    EXPECT_EQ(got.frames[2].disposal, 2u);
    EXPECT_EQ(got.frames[2].transparentIndex, 3);
}

TEST(Animation, plays_once_for_ever_or_once_more_than_stored) {
    SmallGif gif;
    const struct {
        int loops;
        int32_t stored;
        uint32_t plays;
    } cases[] = {{-1, -1, 1}, {0, 0, 0}, {1, 1, 2}, {65535, 65535, 65536}};
    for (const auto &one : cases) {
        gif.loops = one.loops;
        const Described got = described(gif_bytes(gif));
        EXPECT_EQ(got.animation.loopCount, one.stored);
        EXPECT_EQ(got.animation.plays, one.plays);
    }
}

TEST(Animation, loop_counts_stand_in_two_kinds_of_application_blocks) {
    const SmallGif gif;
    const Bytes rest = test::gif_frame(SmallFrame{}) + Bytes{';'};
    const auto loops = [&](const Bytes &block) {
        return described(gif_header(gif) + block + rest).animation.loopCount;
    };
    EXPECT_EQ(loops(test::gif_loop_block("ANIMEXTS1.0", 9)), 9);
    EXPECT_EQ(loops(test::gif_loop_block("NETSCAPE3.0", 9)), -1);
    EXPECT_EQ(loops(test::gif_loop_block("NETSCAPE2.0x", 9)), -1);
    EXPECT_EQ(loops({'!', 0xFF, 3, 1, 9, 0, 0}), -1);
    Bytes short_of_a_byte = test::gif_loop_block("NETSCAPE2.0", 9);
    short_of_a_byte[14] = 2; // the block's size; its last byte is then an empty block's
    short_of_a_byte[17] = 0;
    EXPECT_EQ(loops(short_of_a_byte), -1);
    Bytes comment = test::gif_loop_block("NETSCAPE2.0", 9);
    comment[1] = 0xFE;
    EXPECT_EQ(loops(comment), -1);
    Bytes other_first = test::gif_loop_block("NETSCAPE2.0", 9);
    const Bytes buffer_size = {5, 2, 0, 0, 1, 0};
    other_first.insert(other_first.begin() + 14, buffer_size.begin(), buffer_size.end());
    EXPECT_EQ(loops(other_first), 9);
    EXPECT_EQ(loops(test::gif_loop_block("NETSCAPE2.0", 9) + test::gif_loop_block("NETSCAPE2.0", 8)), 8);
}

TEST(Animation, the_delay_that_is_shown_is_that_of_browsers) {
    EXPECT_EQ(PelmAnimation_ShownDelay(0), 100u);
    EXPECT_EQ(PelmAnimation_ShownDelay(10), 100u);
    EXPECT_EQ(PelmAnimation_ShownDelay(19), 100u);
    EXPECT_EQ(PelmAnimation_ShownDelay(20), 20u);
    EXPECT_EQ(PelmAnimation_ShownDelay(655350), 655350u);
}

TEST(Animation, a_first_call_counts_and_a_second_lists) {
    Bytes bytes = gif_bytes(three_frames());
    Source source;
    ASSERT_EQ(PelmHost_OpenMemory(&source, PELM_SOURCE_MEMORY, bytes.data(), static_cast<int32_t>(bytes.size())), 0);
    PelmAnimation animation;
    ASSERT_EQ(PelmAnimation_Describe(&source, &animation, nullptr, 0), 0);
    EXPECT_EQ(animation.frameCount, 3u);
    PelmAnimationFrame frames[3] = {};
    frames[2].width = 12345;
    ASSERT_EQ(PelmAnimation_Describe(&source, &animation, frames, 2), 0);
    EXPECT_EQ(animation.frameCount, 3u);
    EXPECT_EQ(frames[1].width, 7u);
    EXPECT_EQ(frames[2].width, 12345u) << "wrote beyond the room it was given";
    EXPECT_EQ(PelmAnimation_Describe(&source, &animation, nullptr, 2), 0);
}

TEST(Animation, is_the_same_over_every_source_which_is_left_at_its_first_byte) {
    SmallGif gif = three_frames();
    gif.width = gif.height = 200;
    gif.frames[1].width = gif.frames[1].height = 200; // beyond any buffer
    Bytes bytes = gif_bytes(gif);
    const Described expected = described(bytes);
    ASSERT_EQ(expected.animation.frameCount, 3u);
    for (const uint32_t kind :
         {PELM_SOURCE_STREAM, PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM_ALT, PELM_SOURCE_SEQUENTIAL}) {
        Source source;
        ASSERT_EQ(PelmHost_OpenMemory(&source, kind, bytes.data(), static_cast<int32_t>(bytes.size())), 0);
        ZOTARPELM_Seek_IO(&source, 99, 0);
        const Described got = described(source);
        EXPECT_EQ(memcmp(&got.animation, &expected.animation, sizeof got.animation), 0) << kind;
        EXPECT_EQ(memcmp(got.frames, expected.frames, 3 * sizeof *got.frames), 0) << kind;
        EXPECT_EQ(source.consumed, 0);
        EXPECT_EQ(read_some(source, 3), "GIF");
    }
    const TemporaryFile file({reinterpret_cast<const char *>(bytes.data()), bytes.size()});
    Source source;
    ASSERT_EQ(PelmHost_OpenFile(&source, file.path(), 0), 0);
    EXPECT_EQ(memcmp(described(source).frames, expected.frames, 3 * sizeof *expected.frames), 0);
    EXPECT_EQ(read_some(source, 3), "GIF");
}

TEST(Animation, sources_that_cannot_be_moved_back_are_told_at_once) {
    const Bytes bytes = gif_bytes(three_frames());
    Pipe pipe;
    pipe.write_bytes({reinterpret_cast<const char *>(bytes.data()), bytes.size()});
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, pipe.reader(), 0), 0);
    const Described got = described(source); // would wait for ever if it read on: the pipe stays open
    EXPECT_EQ(got.error, ESPIPE);
    EXPECT_EQ(got.animation.frameCount, 0u);
    EXPECT_EQ(described(source).error, ESPIPE) << "also when it has been read from before";
}

TEST(Animation, headers_that_the_decoder_refuses_are_no_gif) {
    const Bytes sound = gif_bytes(SmallGif{});
    for (const char *const version : {"GIF87a", "GIF89a", "GIF12Q", "GIF00A", "GIF99z"}) {
        Bytes bytes = sound;
        memcpy(bytes.data(), version, 6);
        EXPECT_EQ(described(bytes).error, 0) << version;
    }
    for (const char *const version : {"GIFx9a", "GIF8xa", "GIF89@", "GIF89{", "gif89a", "PNG89a"}) {
        Bytes bytes = sound;
        memcpy(bytes.data(), version, 6);
        EXPECT_EQ(described(bytes).error, EINVAL) << version;
        EXPECT_EQ(described(bytes).animation.screenWidth, 0u);
    }
    for (const size_t size : {0u, 5u, 12u, 13u, 24u})
        EXPECT_EQ(described(first_of(sound, size)).error, EINVAL) << size;
    EXPECT_EQ(described(first_of(sound, 25)).error, 0);
    PelmAnimation animation;
    EXPECT_EQ(PelmAnimation_Describe(nullptr, &animation, nullptr, 0), EINVAL);
    Source source;
    EXPECT_EQ(PelmAnimation_Describe(&source, nullptr, nullptr, 0), EINVAL);
}

TEST(Animation, tells_how_the_file_ends) {
    const Bytes start = gif_header(SmallGif{}), frame = test::gif_frame(SmallFrame{});
    const Bytes bad_size = {'!', 0xF9, 5, 0, 0, 0, 0, 0, 0}, no_terminator = {'!', 0xF9, 4, 0, 0, 0, 0, 1};
    Bytes wide_codes = frame;
    wide_codes[10] = 13;
    const struct {
        Bytes bytes;
        uint32_t frames;
        uint32_t ending;
    } cases[] = {{start + Bytes{';'} + frame, 0, PELM_ANIMATION_TRAILER},
                 {start, 0, PELM_ANIMATION_CUT},
                 {start + frame, 1, PELM_ANIMATION_CUT},
                 {start + frame + Bytes{'!'}, 1, PELM_ANIMATION_CUT},
                 {start + frame + Bytes{'!', 0xFE, 9, 'x'}, 1, PELM_ANIMATION_CUT},
                 {start + frame + Bytes{',', 0, 0}, 1, PELM_ANIMATION_CUT},
                 {start + frame + bad_size, 1, PELM_ANIMATION_DAMAGED},
                 {start + frame + no_terminator + frame, 1, PELM_ANIMATION_DAMAGED},
                 {start + wide_codes, 0, PELM_ANIMATION_DAMAGED}};
    for (const auto &one : cases) {
        const Described got = described(one.bytes);
        EXPECT_EQ(got.animation.frameCount, one.frames) << testing::PrintToString(one.bytes);
        EXPECT_EQ(got.animation.ending, one.ending) << testing::PrintToString(one.bytes);
    }
}

TEST(Animation, what_the_decoder_steps_over_holds_no_frames_and_what_it_scans_does) {
    const Bytes start = gif_header(SmallGif{}), frame = test::gif_frame(SmallFrame{}), end = {';'};
    Bytes hidden = {'!', 0xFE, static_cast<uint8_t>(frame.size())};
    hidden = hidden + frame + Bytes{0};
    Bytes scanned = hidden;
    scanned[1] = 0x77;
    const auto frames = [&](const Bytes &between) {
        return described(start + frame + between + frame + end).animation.frameCount;
    };
    EXPECT_EQ(frames({}), 2u);
    EXPECT_EQ(frames({0, 1, 2, 200}), 2u);
    EXPECT_EQ(frames(hidden), 2u);
    EXPECT_EQ(frames(scanned), 3u);
}

// The decoder stops at the last pixel and looks for blocks from there on, in what is left of the data too.
TEST(Animation, data_beyond_the_last_pixel_is_scanned_for_blocks) {
    SmallFrame frame;
    frame.width = frame.height = 1;
    Bytes image = test::gif_image(frame);
    // Data of 27 bits: clear code, pixel, end code. Three bytes are read for the first two; the fourth is left.
    ASSERT_EQ(image.size(), 11u + 1 + 4 + 1);
    for (const auto &[byte, count] : {std::pair{uint8_t{0}, 2u}, {uint8_t{';'}, 1u}}) {
        image[15] = byte;
        EXPECT_EQ(described(gif_header(SmallGif{}) + image + image + Bytes{';'}).animation.frameCount, count);
    }
}

TEST(Animation, rows_that_the_data_lacks_are_counted) {
    SmallFrame frame;
    frame.height = 5;
    frame.indices = Bytes(11, 1);
    SmallGif gif;
    gif.frames = {frame, frame};
    const Described got = described(gif_bytes(gif));
    ASSERT_EQ(got.animation.frameCount, 2u);
    EXPECT_EQ(got.frames[0].completeRows, 2u);
    frame.indices = {};
    frame.width = 0;
    gif.frames = {frame, SmallFrame{}};
    EXPECT_EQ(described(gif_bytes(gif)).frames[0].completeRows, 5u);
    Bytes unreadable = test::gif_image(SmallFrame{});
    unreadable[10] = 12;
    EXPECT_EQ(described(gif_header(SmallGif{}) + unreadable + Bytes{';'}).frames[0].completeRows, 0u);
}

// The decoder takes a block only when a byte follows it.
TEST(Animation, the_data_of_a_block_that_ends_with_the_file_do_not_count) {
    Bytes file = gif_header(SmallGif{}) + test::gif_image(SmallFrame{});
    ASSERT_EQ(file.back(), 0);
    EXPECT_EQ(described(file).frames[0].completeRows, 3u);
    file.pop_back();
    const Described got = described(file);
    ASSERT_EQ(got.animation.frameCount, 1u);
    EXPECT_EQ(got.frames[0].completeRows, 0u);
}

int aborted = 0;

int32_t count_abort(ImageDecodeInfo *) {
    ++aborted;
    return 1;
}

TEST(Animation, a_request_is_made_ready_again_without_leaks) {
    const Control control;
    PelmHost_UseForThread(control);
    ImageDecodeInfo info = {};
    info.globalColorTable = ZOTARPELM_OsMalloc(1024);
    info.localColorTable = ZOTARPELM_OsMalloc(1024);
    aborted = 0;
    PelmAnimation_Restart(&info, count_abort);
    EXPECT_EQ(aborted, 1);
    EXPECT_EQ(info.globalColorTable, nullptr);
    EXPECT_EQ(info.localColorTable, nullptr);
    EXPECT_EQ(control.counters().liveBlocks, 0u);
    PelmAnimation_Restart(&info, nullptr);
    PelmAnimation_Restart(nullptr, count_abort);
    EXPECT_EQ(aborted, 1);
}

} // namespace
} // namespace pelm::host_test

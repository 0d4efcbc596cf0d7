// Hosts that stop a decode at any of its polls, or pause it at all of them. What else polls do to a PNG is shown with
// the decodes (tests/png/decode/host_test.cpp, tests/png/interlaced/host_test.cpp); the other formats never poll.
#include <algorithm>

#include "tests/bounds/ways.h"
#include "tests/bounds/work.h"
#include "tests/gif/support/gif_builder.h"
#include "tests/png/support/png_builder.h"
#include "tests/support/wbmp_builder.h"

namespace pelm::test {
namespace {

using Polls = BoundsTest;

constexpr int32_t width = 13, height = 11;

Bytes png_file(uint8_t colour_type, uint8_t interlace) {
    Png png{.width = width, .height = height, .colour_type = colour_type, .depth = 8};
    png.interlace = interlace;
    png.plte = Bytes(48, 90);
    png.rows = noise_rows(png, 5);
    if (colour_type == 3)
        for (Bytes &row : png.rows)
            for (uint8_t &index : row)
                index &= 15;
    return build(png);
}

struct Subject {
    Bytes file;
    std::vector<Way> ways;
};

std::vector<Subject> pngs() {
    std::vector<Subject> all;
    for (const uint8_t colour_type : {uint8_t{0}, uint8_t{2}, uint8_t{3}, uint8_t{6}}) {
        all.push_back({png_file(colour_type, 0), {Way::png, Way::png_iterative, Way::png_lines}});
        all.push_back({png_file(colour_type, 1), {Way::png, Way::png_iterative}});
    }
    return all;
}

std::vector<Asking> askings(uint32_t kind) {
    return {{kind, 7, 0, width, height}, {kind, 0, 0, 6, 7, 3}, {kind, 7, PELM_INTERLACE_FRAME, 6, 7, 3}};
}

TEST_F(Polls, a_stop_at_any_poll_fails_the_decode_and_leaves_nothing) {
    for (const Subject &subject : pngs())
        for (const Way way : subject.ways)
            for (const uint32_t kind : every_kind)
                for (const Asking &asking : askings(kind)) {
                    reset_work();
                    ASSERT_EQ(decode(subject.file, way, asking).result, 1) << name_of(way);
                    const uint64_t polls = PelmTest_Counters()->polls;
                    ASSERT_GT(polls, 0u);
                    for (uint32_t stop = 1; stop <= polls + 1; ++stop) {
                        reset_work();
                        PelmTest_Faults()->stoppingPoll = stop;
                        const Decoded decoded = decode(subject.file, way, asking);
                        EXPECT_EQ(decoded.result, stop <= polls ? 0 : 1) << name_of(way) << ", poll " << stop;
                        EXPECT_EQ(PelmTest_Counters()->polls, std::min<uint64_t>(stop, polls));
                        EXPECT_TRUE(left_nothing()) << name_of(way) << ", poll " << stop;
                    }
                }
}

TEST_F(Polls, a_pause_at_every_poll_sleeps_once_each_and_changes_no_pixel) {
    for (const Subject &subject : pngs())
        for (const Way way : subject.ways)
            for (const uint32_t kind : every_kind)
                for (const Asking &asking : askings(kind)) {
                    reset_work();
                    const Decoded expected = decode(subject.file, way, asking);
                    const uint64_t polls = PelmTest_Counters()->polls;
                    reset_work();
                    PelmTest_Faults()->pausingPollsFrom = 1;
                    const Decoded paused = decode(subject.file, way, asking);
                    EXPECT_EQ(paused.result, 1);
                    EXPECT_EQ(paused.output, expected.output) << name_of(way);
                    EXPECT_EQ(PelmTest_Counters()->polls, polls);
                    EXPECT_EQ(PelmTest_Counters()->pauses, polls);
                    EXPECT_EQ(PelmTest_Counters()->sleeps, polls);
                    EXPECT_TRUE(left_nothing()) << name_of(way);
                }
}

TEST_F(Polls, the_other_formats_never_poll) {
    const Bytes bmp = file_bytes(noise_bmp(variant_named("eight_bits"), width, height, false));
    const Bytes wbmp = file_bytes(noise_wbmp(width, height));
    const Bytes gif = still_file({width, height}).bytes;
    const std::vector<Subject> others = {
        {bmp, {Way::bmp, Way::bmp_iterative, Way::bmp_bands, Way::bmp_lines, Way::bmp_two_steps}},
        {wbmp, {Way::wbmp}},
        {gif, {Way::gif, Way::gif_iterative, Way::gif_lines, Way::frames, Way::frames_iterative}}};
    for (const Subject &subject : others)
        for (const Way way : subject.ways) {
            reset_work();
            PelmTest_Faults()->stoppingPollsFrom = 1;
            EXPECT_GE(decode(subject.file, way, {PELM_SOURCE_MEMORY, 7, 0, width, height, 3}).result, 1);
            EXPECT_EQ(PelmTest_Counters()->polls, 0u) << name_of(way);
        }
}

} // namespace
} // namespace pelm::test

// What PelmAnimation.h makes of hosts that claim too much, deliver little, or fail.
#include "PelmAnimation.h"

#include <vector>

#include <gtest/gtest.h>

#include "PelmHostTesting.h"
#include "tests/support/small_gif.h"

namespace {

using pelm::test::SmallFrame;
using pelm::test::SmallGif;

class AnimationHosts : public testing::Test {
protected:
    AnimationHosts() { PelmTest_Reset(); }
    ~AnimationHosts() override { PelmTest_Reset(); }

    // Three frames of 9 KB each: more than the reader holds at once.
    static std::vector<uint8_t> large_gif() {
        SmallFrame frame;
        frame.width = 100;
        frame.height = 80;
        SmallGif gif;
        gif.frames = {frame, frame, frame};
        return gif_bytes(gif);
    }
    void describe() {
        PelmTestBytes served{file.data(), static_cast<int32_t>(file.size()), 0};
        InputSource source;
        PelmTest_OpenSource(&source, PELM_SOURCE_STREAM, &served, 0);
        ASSERT_EQ(PelmAnimation_Describe(&source, &animation, frames, 3), 0);
    }
    void expect_all_frames() {
        EXPECT_EQ(animation.ending, uint32_t{PELM_ANIMATION_TRAILER});
        ASSERT_EQ(animation.frameCount, 3u);
        for (const PelmAnimationFrame &frame : frames) {
            EXPECT_EQ(frame.width, 100u);
            EXPECT_EQ(frame.completeRows, 80u);
        }
    }

    std::vector<uint8_t> file = large_gif();
    PelmAnimation animation{};
    PelmAnimationFrame frames[3] = {};
};

TEST_F(AnimationHosts, a_read_that_claims_more_than_was_asked_for_counts_as_that_much) {
    PelmTest_Faults()->overclaimingReadsFrom = 1;
    describe();
    expect_all_frames();
}

TEST_F(AnimationHosts, reads_may_bring_a_byte_at_a_time) {
    PelmTest_Faults()->shortReadsFrom = 1;
    describe();
    expect_all_frames();
}

TEST_F(AnimationHosts, a_read_that_fails_is_the_end_of_the_data) {
    PelmTest_Faults()->failingReadsFrom = 6; // 4 KB each, but for the first
    describe();
    EXPECT_EQ(animation.ending, uint32_t{PELM_ANIMATION_CUT});
    EXPECT_EQ(animation.frameCount, 2u);
    EXPECT_EQ(frames[0].completeRows, 80u);
    EXPECT_LT(frames[1].completeRows, 80u);
}

} // namespace

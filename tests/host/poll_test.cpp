// The poll and the pause, and the progress callback.
#include <cerrno>
#include <chrono>
#include <vector>

#include "tests/host/support.h"

namespace pelm::host_test {
namespace {

int32_t poll_status() {
    int32_t status = 12345;
    ZOTARPELM_CheckExStatus(&status);
    return status;
}

// Answers the same each time and notes how far the source was.
struct Listener {
    int32_t answer = 0;
    std::vector<int32_t> positions; // -1 for a poll

    static int32_t listen(void *user, const InputSource *source) {
        auto &self = *static_cast<Listener *>(user);
        self.positions.push_back(source == nullptr ? -1 : source->consumed);
        return self.answer;
    }
};

class HostProgress : public testing::Test {
protected:
    HostProgress() {
        PelmHost_SetProgress(control, Listener::listen, &listener);
        PelmHost_UseForThread(control);
    }
    Control control;
    Listener listener;
    std::string bytes = "abcdef";
};

TEST(HostPoll, goes_on_without_a_control_and_under_an_idle_one) {
    EXPECT_EQ(poll_status(), 0);
    const Control control;
    PelmHost_UseForThread(control);
    EXPECT_EQ(poll_status(), 0);
    ZOTARPELM_CheckExStatus(nullptr);
}

TEST(HostPoll, says_stop_once_cancelled_until_resumed) {
    const Control control;
    PelmHost_UseForProcess(control);
    PelmHost_Cancel(control);
    EXPECT_EQ(poll_status(), -1);
    EXPECT_EQ(poll_status(), -1);
    PelmHost_Resume(control);
    EXPECT_EQ(poll_status(), 0);
}

TEST(HostPoll, says_stop_past_the_deadline_until_it_is_removed) {
    const Control control;
    PelmHost_UseForThread(control);
    let_deadline_pass(control);
    EXPECT_EQ(poll_status(), -1);
    PelmHost_SetDeadline(control, 0);
    EXPECT_EQ(poll_status(), 0);
}

TEST_F(HostProgress, is_asked_without_a_source_at_a_poll) {
    listener.answer = 7;
    EXPECT_EQ(poll_status(), 7);
    EXPECT_EQ(listener.positions, std::vector<int32_t>{-1});
    EXPECT_EQ(PelmHost_StopReason(control), 0);
}

TEST_F(HostProgress, a_negative_answer_to_a_poll_cancels) {
    listener.answer = -5;
    EXPECT_LT(poll_status(), 0);
    EXPECT_EQ(PelmHost_StopReason(control), ECANCELED);
    EXPECT_EQ(poll_status(), -1);
    EXPECT_EQ(listener.positions.size(), 1u) << "it is not asked again once cancelled";
}

TEST_F(HostProgress, is_asked_after_every_read_of_a_stream_source) {
    Source source;
    ASSERT_EQ(PelmHost_OpenMemory(&source, PELM_SOURCE_SEQUENTIAL, writable(bytes), 6), 0);
    listener.answer = 1; // a pause is for polls only
    EXPECT_EQ(read_all(source, 4), bytes);
    EXPECT_EQ(listener.positions, (std::vector<int32_t>{4, 6, 6}));
}

TEST_F(HostProgress, is_not_asked_for_reads_in_place) {
    Source source;
    ASSERT_EQ(PelmHost_OpenMemory(&source, PELM_SOURCE_MEMORY, writable(bytes), 6), 0);
    EXPECT_EQ(read_all(source, 4), bytes);
    EXPECT_TRUE(listener.positions.empty());
}

TEST_F(HostProgress, a_negative_answer_to_a_read_fails_the_next_one) {
    Source source;
    ASSERT_EQ(PelmHost_OpenMemory(&source, PELM_SOURCE_STREAM, writable(bytes), 6), 0);
    listener.answer = -1;
    EXPECT_EQ(read_some(source, 4), "abcd");
    EXPECT_EQ(PelmHost_StopReason(control), ECANCELED);
    EXPECT_EQ(read_result(source), -1);
    EXPECT_EQ(PelmHost_ReadError(&source), ECANCELED);
    EXPECT_EQ(listener.positions, std::vector<int32_t>{4});
}

TEST_F(HostProgress, can_be_removed) {
    PelmHost_SetProgress(control, nullptr, &listener);
    EXPECT_EQ(poll_status(), 0);
    EXPECT_TRUE(listener.positions.empty());
}

TEST(HostPause, returns_at_once_for_0_and_below) {
    for (const int32_t status : {0, -1, INT32_MIN})
        ZOTARPELM_OsSleep(status);
}

TEST(HostPause, lasts_as_many_milliseconds_as_the_status) {
    const auto start = std::chrono::steady_clock::now();
    ZOTARPELM_OsSleep(120);
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(120));
}

// Each of them would take 24 days to the end.
TEST(HostPause, ends_when_the_decode_is_to_stop) {
    const Control control;
    PelmHost_UseForThread(control);
    PelmHost_SetDeadline(control, 5);
    ZOTARPELM_OsSleep(INT32_MAX);
    EXPECT_EQ(PelmHost_StopReason(control), ETIMEDOUT);

    PelmHost_SetDeadline(control, 0);
    std::thread canceller([&] {
        pause_briefly();
        PelmHost_Cancel(control);
    });
    ZOTARPELM_OsSleep(INT32_MAX);
    EXPECT_EQ(PelmHost_StopReason(control), ECANCELED);
    canceller.join();
}

} // namespace
} // namespace pelm::host_test

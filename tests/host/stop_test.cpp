// How a stop that the application asks for reaches reads, also those that wait for data.
#include <atomic>
#include <cerrno>
#include <csignal>
#include <functional>

#include <pthread.h>

#include "tests/host/support.h"

namespace pelm::host_test {
namespace {

std::atomic<PelmHostControl *> cancelled_by_signal{nullptr};

void cancel_on_signal(int) {
    PelmHost_Cancel(cancelled_by_signal);
}

void do_nothing_on_signal(int) {}

// SIGUSR1 interrupts what waits, for as long as this lives.
class SignalHandler {
public:
    explicit SignalHandler(void (*handler)(int)) {
        struct sigaction action = {};
        action.sa_handler = handler;
        sigemptyset(&action.sa_mask);
        sigaction(SIGUSR1, &action, &before_);
    }
    ~SignalHandler() { sigaction(SIGUSR1, &before_, nullptr); }

private:
    struct sigaction before_ = {};
};

// Runs `wait` on a thread and sends it signals until it is done.
void signal_until_done(const std::function<void()> &wait) {
    std::atomic<bool> done{false};
    std::thread waiting([&] {
        wait();
        done = true;
    });
    while (!done) {
        pthread_kill(waiting.native_handle(), SIGUSR1);
        pause_briefly();
    }
    waiting.join();
}

class HostStop : public testing::Test {
protected:
    HostStop() { PelmHost_UseForProcess(control); }
    Control control;
    Pipe pipe;
    std::string bytes = "0123456789";
};

TEST_F(HostStop, fails_the_reads_of_stream_kinds_until_resumed) {
    for (const uint32_t kind : {0u, 2u, 4u}) {
        Source source;
        ASSERT_EQ(PelmHost_OpenMemory(&source, kind, writable(bytes), 10), 0);
        EXPECT_EQ(read_some(source, 2), "01");
        PelmHost_Cancel(control);
        for (int i = 0; i < 2; ++i) {
            source.consumed = 9;
            EXPECT_EQ(read_result(source), -1);
            EXPECT_EQ(PelmHost_ReadError(&source), ECANCELED);
            EXPECT_EQ(source.consumed, 2);
        }
        PelmHost_Resume(control);
        EXPECT_EQ(read_some(source, 2), "23");
        EXPECT_EQ(PelmHost_ReadError(&source), 0);
    }
}

TEST_F(HostStop, leaves_reads_in_place_alone) {
    Source source;
    ASSERT_EQ(PelmHost_OpenMemory(&source, PELM_SOURCE_MEMORY, writable(bytes), 10), 0);
    PelmHost_Cancel(control);
    EXPECT_EQ(read_some(source, 2), "01");
    EXPECT_EQ(PelmHost_ReadError(&source), 0);
}

TEST_F(HostStop, fails_the_reads_of_files_past_the_deadline) {
    const TemporaryFile file(bytes);
    Source source;
    ASSERT_EQ(PelmHost_OpenFile(&source, file.path(), 0), 0);
    let_deadline_pass(control);
    EXPECT_EQ(read_result(source), -1);
    EXPECT_EQ(PelmHost_ReadError(&source), ETIMEDOUT);
    EXPECT_NE(source.consumed, source.size);
    PelmHost_SetDeadline(control, 0);
    EXPECT_EQ(read_some(source, 2), "01");
}

TEST_F(HostStop, lets_no_seek_read_on) {
    pipe.write_bytes(bytes);
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, pipe.reader(), 0), 0);
    PelmHost_Cancel(control);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 3, 0), 0);
    PelmHost_Resume(control);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 3, 0), 3);
    EXPECT_EQ(read_some(source, 1), "3");
}

TEST_F(HostStop, keeps_a_failure_for_after_the_resume) {
    const int directory = open("/", O_RDONLY | O_DIRECTORY);
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, directory, 0), 0);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 3, 0), 0);
    PelmHost_Cancel(control);
    EXPECT_EQ(read_result(source), -1);
    EXPECT_EQ(PelmHost_ReadError(&source), ECANCELED);
    PelmHost_Resume(control);
    EXPECT_EQ(read_result(source), -1);
    EXPECT_EQ(PelmHost_ReadError(&source), EISDIR);
    close(directory);
}

TEST_F(HostStop, by_another_thread_ends_a_read_that_waits_for_a_descriptor) {
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, pipe.reader(), 0), 0);
    std::thread canceller([&] {
        pause_briefly();
        PelmHost_Cancel(control);
    });
    EXPECT_EQ(read_result(source), -1);
    EXPECT_EQ(PelmHost_ReadError(&source), ECANCELED);
    canceller.join();
}

TEST_F(HostStop, by_the_deadline_ends_a_read_that_waits_for_a_descriptor) {
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, pipe.reader(), 0), 0);
    PelmHost_SetDeadline(control, 5);
    EXPECT_EQ(read_result(source), -1);
    EXPECT_EQ(PelmHost_ReadError(&source), ETIMEDOUT);
}

TEST_F(HostStop, delivers_what_came_before_it) {
    pipe.write_bytes("abc");
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, pipe.reader(), 0), 0);
    PelmHost_SetDeadline(control, 20);
    const std::string got = read_some(source, 10);
    EXPECT_EQ(PelmHost_ReadError(&source), ETIMEDOUT);
    PelmHost_SetDeadline(control, 0);
    pipe.close_writer();
    EXPECT_EQ(got + read_some(source, 10), "abc") << "no failure is left for after the stop";
    EXPECT_EQ(PelmHost_ReadError(&source), 0);
}

TEST_F(HostStop, ends_openers_that_read_everything) {
    pipe.write_bytes(bytes);
    const std::string path = "/dev/fd/" + std::to_string(pipe.reader());
    Source source;
    PelmHost_SetDeadline(control, 5);
    EXPECT_EQ(PelmHost_OpenFileInMemory(&source, PELM_SOURCE_MEMORY, path.c_str(), 0), ETIMEDOUT);
    EXPECT_TRUE(is_zeroed(source));
    PelmHost_Cancel(control);
    FILE *const stream = fdopen(dup(pipe.reader()), "r");
    EXPECT_EQ(PelmHost_OpenSpooled(&source, PELM_SOURCE_MEMORY, stream, 0), ECANCELED);
    EXPECT_TRUE(is_zeroed(source));
    fclose(stream);
}

TEST_F(HostStop, from_a_signal_handler_ends_a_read_that_waits_inside_stdio) {
    const SignalHandler handler(cancel_on_signal);
    cancelled_by_signal = control;
    FILE *const stream = fdopen(dup(pipe.reader()), "r");
    Source source;
    ASSERT_EQ(PelmHost_OpenStream(&source, stream, 0), 0);
    signal_until_done([&] { EXPECT_EQ(read_result(source), -1); });
    EXPECT_EQ(PelmHost_ReadError(&source), ECANCELED);
    EXPECT_EQ(PelmHost_StopReason(control), ECANCELED);
    fclose(stream);
}

TEST_F(HostStop, from_a_signal_handler_ends_a_pause) {
    const SignalHandler handler(cancel_on_signal);
    cancelled_by_signal = control;
    signal_until_done([] { ZOTARPELM_OsSleep(INT32_MAX); });
    EXPECT_EQ(PelmHost_StopReason(control), ECANCELED);
}

// Without a control nothing looks at the descriptor before the read that blocks.
TEST(HostInterruption, does_not_end_a_read) {
    const SignalHandler handler(do_nothing_on_signal);
    Pipe pipe;
    Source source;
    ASSERT_EQ(PelmHost_OpenDescriptor(&source, pipe.reader(), 0), 0);
    const DribblingWriter writer(pipe, numbered_bytes(100));
    signal_until_done([&] { EXPECT_EQ(read_some(source, 200), numbered_bytes(100)); });
    EXPECT_EQ(PelmHost_ReadError(&source), 0);
}

TEST(HostInterruption, does_not_end_a_pause) {
    const SignalHandler handler(do_nothing_on_signal);
    const auto start = std::chrono::steady_clock::now();
    signal_until_done([] { ZOTARPELM_OsSleep(60); });
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(60));
}

} // namespace
} // namespace pelm::host_test

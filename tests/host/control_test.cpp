// Which control applies where, how long it lives, and what it counts.
#include <atomic>
#include <thread>
#include <vector>

#include "tests/host/support.h"

namespace pelm::host_test {
namespace {

uint64_t allocations(const PelmHostControl *control) {
    PelmHostCounters counters;
    PelmHost_GetCounters(control, &counters);
    return counters.allocations;
}

void allocate_once() {
    ZOTARPELM_OsFree(ZOTARPELM_OsMalloc(1));
}

TEST(HostControl, counts_what_the_services_did) {
    const Control control;
    PelmHost_UseForThread(control);
    PelmHost_SetMemoryLimits(control, 0, 1000);
    void *const first = ZOTARPELM_OsMalloc(100);
    void *const second = ZOTARPELM_OsMalloc(50);
    ZOTARPELM_OsFree(first);
    void *const third = ZOTARPELM_OsMalloc(20);
    EXPECT_EQ(ZOTARPELM_OsMalloc(1001), nullptr);
    std::string bytes = "abc";
    Source source;
    ASSERT_EQ(PelmHost_OpenMemory(&source, PELM_SOURCE_MEMORY, writable(bytes), 3), 0);
    read_some(source, 5);
    read_some(source, 5);
    ZOTARPELM_Read_IO(nullptr, nullptr, 0);
    ZOTARPELM_Seek_IO(&source, 1, 0);
    ZOTARPELM_Seek_IO(nullptr, 1, 0);

    const PelmHostCounters counters = control.counters();
    EXPECT_EQ(counters.liveBytes, 70u);
    EXPECT_EQ(counters.peakBytes, 150u);
    EXPECT_EQ(counters.liveBlocks, 2u);
    EXPECT_EQ(counters.allocations, 3u);
    EXPECT_EQ(counters.failedAllocations, 1u);
    EXPECT_EQ(counters.reads, 3u);
    EXPECT_EQ(counters.seeks, 2u);
    ZOTARPELM_OsFree(second);
    ZOTARPELM_OsFree(third);
}

TEST(HostControl, the_one_of_the_process_applies_to_threads_without_their_own) {
    const Control process;
    const Control own;
    PelmHost_UseForProcess(process);
    std::thread([&] { allocate_once(); }).join();
    std::thread([&] {
        PelmHost_UseForThread(own);
        allocate_once();
        PelmHost_UseForThread(nullptr);
        allocate_once();
    }).join();
    EXPECT_EQ(allocations(process), 2u);
    EXPECT_EQ(allocations(own), 1u);
}

TEST(HostControl, the_one_of_a_thread_stays_with_the_thread) {
    const Control own;
    PelmHost_UseForThread(own);
    std::thread([] { allocate_once(); }).join();
    EXPECT_EQ(allocations(own), 0u);
    allocate_once();
    EXPECT_EQ(allocations(own), 1u);
}

TEST(HostControl, a_block_is_given_back_to_the_control_that_paid_for_it) {
    const Control first;
    const Control second;
    PelmHost_UseForThread(first);
    void *const paid_by_first = ZOTARPELM_OsMalloc(10);
    PelmHost_UseForThread(second);
    void *const paid_by_second = ZOTARPELM_OsMalloc(20);
    PelmHost_UseForThread(nullptr);
    void *const paid_by_none = ZOTARPELM_OsMalloc(30);
    ZOTARPELM_OsFree(paid_by_second);
    PelmHost_UseForThread(second);
    ZOTARPELM_OsFree(paid_by_first);
    ZOTARPELM_OsFree(paid_by_none);
    for (const Control *control : {&first, &second}) {
        EXPECT_EQ(control->counters().liveBytes, 0u);
        EXPECT_EQ(control->counters().liveBlocks, 0u);
        EXPECT_EQ(control->counters().allocations, 1u);
    }
}

TEST(HostControl, lives_until_its_last_block_is_freed) {
    PelmHostControl *const control = PelmHost_NewControl();
    PelmHost_UseForThread(control);
    void *const block = ZOTARPELM_OsMalloc(10);
    PelmHost_UseForThread(nullptr);
    PelmHost_ReleaseControl(control);
    ZOTARPELM_OsFree(block);
}

TEST(HostControl, lives_while_it_is_installed) {
    PelmHostControl *const control = PelmHost_NewControl();
    PelmHost_UseForThread(control);
    PelmHost_UseForProcess(control);
    PelmHost_ReleaseControl(control);
    allocate_once();
    PelmHost_UseForThread(nullptr);
    allocate_once();
    EXPECT_EQ(allocations(control), 2u);
    PelmHost_UseForProcess(nullptr);
}

TEST(HostControl, may_be_installed_again_where_it_is_installed) {
    const Control control;
    for (int i = 0; i < 3; ++i) {
        PelmHost_UseForThread(control);
        PelmHost_UseForProcess(control);
    }
    allocate_once();
    EXPECT_EQ(allocations(control), 1u);
}

int32_t uninstall_and_release(void *user, const InputSource *) {
    PelmHost_UseForThread(nullptr);
    PelmHost_ReleaseControl(*static_cast<PelmHostControl **>(user));
    return -1;
}

TEST(HostControl, survives_a_callback_that_takes_it_out_and_releases_it) {
    PelmHostControl *control = PelmHost_NewControl();
    PelmHost_SetProgress(control, uninstall_and_release, &control);
    PelmHost_UseForThread(control);
    int32_t status = 0;
    ZOTARPELM_CheckExStatus(&status);
    EXPECT_EQ(status, -1);
}

TEST(HostControl, may_be_exchanged_while_threads_work_under_it) {
    std::atomic<bool> done{false};
    std::vector<std::thread> workers;
    for (int i = 0; i < 2; ++i) {
        workers.emplace_back([&] {
            while (!done) {
                void *const block = ZOTARPELM_OsMalloc(10);
                int32_t status = 0;
                ZOTARPELM_CheckExStatus(&status);
                ZOTARPELM_OsFree(block);
            }
        });
    }
    for (int i = 0; i < 500; ++i) {
        PelmHostControl *const control = PelmHost_NewControl();
        PelmHost_UseForProcess(control);
        PelmHost_SetDeadline(control, 1000000);
        PelmHost_SetMemoryLimits(control, 100, 100);
        PelmHost_ReleaseControl(control);
        std::this_thread::yield();
    }
    PelmHost_UseForProcess(nullptr);
    done = true;
    for (std::thread &worker : workers)
        worker.join();
}

TEST(HostControl, null_is_accepted_everywhere) {
    PelmHost_ReleaseControl(nullptr);
    PelmHost_UseForProcess(nullptr);
    PelmHost_UseForThread(nullptr);
    PelmHost_SetMemoryLimits(nullptr, 1, 1);
    PelmHost_Cancel(nullptr);
    PelmHost_Resume(nullptr);
    PelmHost_SetDeadline(nullptr, 1);
    PelmHost_SetProgress(nullptr, nullptr, nullptr);
    EXPECT_EQ(PelmHost_StopReason(nullptr), 0);
    PelmHostCounters counters = {1, 1, 1, 1, 1, 1, 1};
    PelmHost_GetCounters(nullptr, &counters);
    EXPECT_EQ(counters.liveBytes + counters.peakBytes + counters.liveBlocks + counters.allocations +
                  counters.failedAllocations + counters.reads + counters.seeks,
              0u);
    const Control control;
    PelmHost_GetCounters(control, nullptr);
}

} // namespace
} // namespace pelm::host_test

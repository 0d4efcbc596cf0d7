// The memory services, with and without limits.
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <thread>
#include <vector>

#include "tests/host/support.h"

namespace pelm::host_test {
namespace {

bool is_aligned(const void *block) {
    return reinterpret_cast<uintptr_t>(block) % alignof(std::max_align_t) == 0;
}

TEST(HostMemory, blocks_of_every_small_size_are_aligned_and_writable) {
    for (uint32_t size = 0; size < 100; ++size) {
        void *const block = ZOTARPELM_OsMalloc(size);
        ASSERT_NE(block, nullptr) << size;
        EXPECT_TRUE(is_aligned(block)) << size;
        ZOTARPELM_OsMemset(block, 0xFF, size);
        ZOTARPELM_OsFree(block);
    }
}

TEST(HostMemory, freeing_null_does_nothing) {
    ZOTARPELM_OsFree(nullptr);
}

#if UINTPTR_MAX == UINT32_MAX // only 32-bit systems have such
TEST(HostMemory, a_block_that_would_wrap_the_address_space_fails) {
    for (uint32_t below = 0; below < 32; ++below)
        EXPECT_EQ(ZOTARPELM_OsMalloc(UINT32_MAX - below), nullptr) << below;
}
#endif

TEST(HostMemory, memset_fills_with_the_low_byte_of_the_value) {
    uint8_t bytes[4] = {1, 2, 3, 4};
    ZOTARPELM_OsMemset(bytes + 1, 0x1234, 2);
    EXPECT_EQ(bytes[0], 1);
    EXPECT_EQ(bytes[1], 0x34);
    EXPECT_EQ(bytes[2], 0x34);
    EXPECT_EQ(bytes[3], 4);
    ZOTARPELM_OsMemset(bytes, -1, 1);
    EXPECT_EQ(bytes[0], 0xFF);
}

TEST(HostMemory, a_copy_is_right_when_the_areas_overlap_either_way) {
    char up[] = "abcdefgh";
    ZOTARPELM_OsMemcpy(up + 2, up, 6);
    EXPECT_STREQ(up, "ababcdef");
    char down[] = "abcdefgh";
    ZOTARPELM_OsMemcpy(down, down + 2, 6);
    EXPECT_STREQ(down, "cdefghgh");
}

TEST(HostMemory, nothing_is_filled_or_copied_for_a_count_of_0) {
    ZOTARPELM_OsMemset(nullptr, 1, 0);
    ZOTARPELM_OsMemcpy(nullptr, nullptr, 0);
}

TEST(HostMemoryLimits, the_live_limit_is_exact) {
    const Control control;
    PelmHost_UseForThread(control);
    PelmHost_SetMemoryLimits(control, 100, 0);
    void *const first = ZOTARPELM_OsMalloc(60);
    ASSERT_NE(first, nullptr);
    EXPECT_EQ(ZOTARPELM_OsMalloc(41), nullptr);
    void *const second = ZOTARPELM_OsMalloc(40);
    EXPECT_NE(second, nullptr);
    EXPECT_EQ(ZOTARPELM_OsMalloc(1), nullptr);
    void *const empty = ZOTARPELM_OsMalloc(0);
    EXPECT_NE(empty, nullptr);
    ZOTARPELM_OsFree(first);
    void *const again = ZOTARPELM_OsMalloc(60);
    EXPECT_NE(again, nullptr);
    for (void *block : {second, empty, again})
        ZOTARPELM_OsFree(block);
}

TEST(HostMemoryLimits, the_block_limit_is_exact_and_leaves_the_sum_free) {
    const Control control;
    PelmHost_UseForThread(control);
    PelmHost_SetMemoryLimits(control, 0, 10);
    EXPECT_EQ(ZOTARPELM_OsMalloc(11), nullptr);
    void *const first = ZOTARPELM_OsMalloc(10);
    void *const second = ZOTARPELM_OsMalloc(10);
    EXPECT_NE(first, nullptr);
    EXPECT_NE(second, nullptr);
    ZOTARPELM_OsFree(first);
    ZOTARPELM_OsFree(second);
}

TEST(HostMemoryLimits, a_limit_below_what_is_alive_fails_everything_until_enough_is_freed) {
    const Control control;
    PelmHost_UseForThread(control);
    void *const large = ZOTARPELM_OsMalloc(100);
    PelmHost_SetMemoryLimits(control, 50, 0);
    EXPECT_EQ(ZOTARPELM_OsMalloc(0), nullptr);
    ZOTARPELM_OsFree(large);
    void *const block = ZOTARPELM_OsMalloc(50);
    EXPECT_NE(block, nullptr);
    ZOTARPELM_OsFree(block);
}

TEST(HostMemoryLimits, limits_of_0_are_none) {
    const Control control;
    PelmHost_UseForThread(control);
    PelmHost_SetMemoryLimits(control, 1, 1);
    PelmHost_SetMemoryLimits(control, 0, 0);
    void *const block = ZOTARPELM_OsMalloc(1000);
    EXPECT_NE(block, nullptr);
    ZOTARPELM_OsFree(block);
}

TEST(HostMemoryLimits, the_private_memory_of_sources_is_neither_counted_nor_limited) {
    const Control control;
    PelmHost_UseForThread(control);
    PelmHost_SetMemoryLimits(control, 1, 1);
    const TemporaryFile file("contents");
    Source source;
    EXPECT_EQ(PelmHost_OpenFileInMemory(&source, PELM_SOURCE_STREAM, file.path(), 0), 0);
    EXPECT_EQ(read_all(source, 100), "contents");
    EXPECT_EQ(control.counters().allocations, 0u);
    EXPECT_EQ(control.counters().failedAllocations, 0u);
}

TEST(HostMemoryLimits, threads_together_never_exceed_the_limit) {
    const Control control;
    PelmHost_UseForProcess(control);
    PelmHost_SetMemoryLimits(control, 1000, 0);
    std::vector<std::thread> threads;
    for (uint32_t id = 0; id < 4; ++id) {
        threads.emplace_back([id] {
            for (uint32_t i = 0; i < 2000; ++i) {
                void *const first = ZOTARPELM_OsMalloc(300 + id);
                void *const second = ZOTARPELM_OsMalloc(i % 200);
                ZOTARPELM_OsFree(first);
                ZOTARPELM_OsFree(second);
            }
        });
    }
    for (std::thread &thread : threads)
        thread.join();
    const PelmHostCounters counters = control.counters();
    EXPECT_LE(counters.peakBytes, 1000u);
    EXPECT_EQ(counters.liveBytes, 0u);
    EXPECT_EQ(counters.liveBlocks, 0u);
    EXPECT_EQ(counters.allocations + counters.failedAllocations, 4u * 2 * 2000);
}

} // namespace
} // namespace pelm::host_test

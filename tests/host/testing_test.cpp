// The host for tests, by itself: each fault strikes where it is asked for, and the account is right.
#include <cstring>
#include <vector>

#include <gtest/gtest.h>

#include "PelmHostTesting.h"

namespace {

class HostForTests : public testing::Test {
protected:
    HostForTests() { PelmTest_Reset(); }
    ~HostForTests() override {
        PelmTest_SetObserver(nullptr, nullptr);
        PelmTest_Reset();
    }

    PelmTestFaults &faults = *PelmTest_Faults();
    const PelmTestCounters &counters = *PelmTest_Counters();
    uint8_t letters[6] = {'a', 'b', 'c', 'd', 'e', 'f'};
    PelmTestBytes bytes{letters, 6, 0};
    InputSource source{};
    uint8_t buffer[16] = {};

    int32_t read(int32_t count) { return ZOTARPELM_Read_IO(&source, buffer, count); }
    int32_t poll() const {
        int32_t status = 99;
        ZOTARPELM_CheckExStatus(&status);
        return status;
    }
};

TEST_F(HostForTests, counts_blocks_and_names_them_oldest_first) {
    void *const first = ZOTARPELM_OsMalloc(10);
    void *const second = ZOTARPELM_OsMalloc(20);
    EXPECT_EQ(counters.liveBytes, 30u);
    ZOTARPELM_OsFree(first);
    const void *block = nullptr;
    EXPECT_EQ(PelmTest_LiveBlock(0, &block), 20u);
    EXPECT_EQ(block, second);
    EXPECT_EQ(PelmTest_LiveBlock(1, &block), 0u);
    EXPECT_EQ(block, nullptr);
    ZOTARPELM_OsFree(second);
    EXPECT_EQ(counters.liveBlocks, 0u);
    EXPECT_EQ(counters.peakBytes, 30u);
    EXPECT_EQ(counters.allocations, 2u);
    EXPECT_EQ(counters.frees, 2u);
    EXPECT_EQ(PelmTest_Violation(), nullptr);
}

TEST_F(HostForTests, fills_blocks_as_asked) {
    faults.filling = 0x42;
    auto *const block = static_cast<uint8_t *>(ZOTARPELM_OsMalloc(3));
    EXPECT_EQ(std::vector<uint8_t>(block, block + 3), std::vector<uint8_t>(3, 0x42));
}

TEST_F(HostForTests, counts_the_bytes_that_are_copied_and_filled) {
    ZOTARPELM_OsMemcpy(buffer, letters, 4);
    ZOTARPELM_OsMemset(buffer, 0, 7);
    EXPECT_EQ(counters.bytesMoved, 11u);
}

TEST_F(HostForTests, fails_the_allocations_it_is_told_to) {
    faults.failingAllocation = 2;
    faults.failingAllocationsFrom = 4;
    for (int number = 1; number <= 6; ++number)
        EXPECT_EQ(ZOTARPELM_OsMalloc(1) == nullptr, number == 2 || number >= 4) << number;
    EXPECT_EQ(counters.failedAllocations, 4u);
}

TEST_F(HostForTests, refuses_blocks_and_sums_above_the_limits) {
    faults.largestBlock = 100;
    EXPECT_EQ(ZOTARPELM_OsMalloc(101), nullptr);
    faults.mostLiveBytes = 150;
    EXPECT_NE(ZOTARPELM_OsMalloc(100), nullptr);
    EXPECT_EQ(ZOTARPELM_OsMalloc(51), nullptr);
    EXPECT_NE(ZOTARPELM_OsMalloc(50), nullptr);
}

TEST_F(HostForTests, notices_frees_of_what_is_no_block) {
    ZOTARPELM_OsFree(letters);
    EXPECT_STREQ(PelmTest_Violation(), "freed what is not an allocated block");
    ZOTARPELM_OsFree(nullptr);
    EXPECT_EQ(counters.violations, 2u);
}

#if !defined(PELM_TEST_UNDER_ASAN) // which would end the program at the write itself
TEST_F(HostForTests, notices_writes_on_either_side_of_a_block) {
    for (const int at : {-1, 5}) {
        auto *const block = static_cast<volatile uint8_t *>(ZOTARPELM_OsMalloc(5));
        block[at] = 0;
        PelmTest_CheckBlocks();
        EXPECT_STREQ(PelmTest_Violation(), "wrote outside a block") << at;
        PelmTest_Reset();
    }
}
#endif

TEST_F(HostForTests, reads_and_seeks_within_the_bytes_that_there_are_whatever_size_is_stated) {
    PelmTest_OpenSource(&source, PELM_SOURCE_STREAM, &bytes, 64);
    EXPECT_EQ(source.bufferSize, 64);
    source.size = 1000;
    EXPECT_EQ(read(4), 4);
    EXPECT_EQ(memcmp(buffer, "abcd", 4), 0);
    EXPECT_EQ(read(4), 2);
    EXPECT_EQ(source.consumed, 6);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, -20, 1), -6);
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 20, 0), 6);
    source.size = 3;
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 0, 0), -6);
    EXPECT_EQ(read(6), 6);
    bytes.endsWithStatedSize = 1;
    EXPECT_EQ(ZOTARPELM_Seek_IO(&source, 0, 0), -6);
    EXPECT_EQ(read(6), 3);
    EXPECT_EQ(counters.bytesRead, 15u);
}

TEST_F(HostForTests, memory_sources_have_their_bytes_in_place) {
    PelmTest_OpenSource(&source, PELM_SOURCE_MEMORY, &bytes, 0);
    EXPECT_EQ(source.data, letters);
    InputSource by_hand{};
    by_hand.kind = PELM_SOURCE_MEMORY;
    by_hand.data = letters;
    by_hand.size = 6;
    EXPECT_EQ(ZOTARPELM_Read_IO(&by_hand, buffer, 9), 6);
}

TEST_F(HostForTests, reads_fail_come_short_and_claim_too_much_as_asked) {
    PelmTest_OpenSource(&source, PELM_SOURCE_STREAM, &bytes, 0);
    faults.failingRead = 1;
    faults.shortRead = 2;
    faults.mostPerRead = 2;
    faults.overclaimingReadsFrom = 4;
    EXPECT_EQ(read(3), -1);
    EXPECT_EQ(source.consumed, 0);
    EXPECT_EQ(read(3), 2);
    EXPECT_EQ(read(1), 1);
    EXPECT_EQ(read(2), 1002);
    EXPECT_EQ(source.consumed, 5);
    EXPECT_EQ(counters.faultyReads, 3u);
}

TEST_F(HostForTests, fills_what_reads_leave_of_their_room_as_asked) {
    PelmTest_OpenSource(&source, PELM_SOURCE_STREAM, &bytes, 0);
    EXPECT_EQ(read(4), 4);
    faults.readFilling = 'x';
    EXPECT_EQ(read(8), 2);
    EXPECT_EQ(memcmp(buffer, "efxxxxxx\0", 9), 0);
    faults.failingRead = 3;
    EXPECT_EQ(read(9), -1);
    EXPECT_EQ(memcmp(buffer, "xxxxxxxxx\0", 10), 0);
}

TEST_F(HostForTests, stops_and_pauses_at_the_polls_asked_for) {
    faults.pausingPoll = 2;
    faults.pausingStatus = 7;
    faults.stoppingPollsFrom = 3;
    EXPECT_EQ(poll(), 0);
    EXPECT_EQ(poll(), 7);
    ZOTARPELM_OsSleep(7);
    EXPECT_EQ(poll(), -1);
    EXPECT_EQ(counters.stops, 1u);
    EXPECT_EQ(counters.pauses, 1u);
    EXPECT_EQ(PelmTest_Violation(), nullptr);
}

TEST_F(HostForTests, notices_pauses_that_are_not_taken_or_not_asked_for) {
    faults.pausingPoll = 1;
    EXPECT_EQ(poll(), 1);
    EXPECT_EQ(poll(), 0);
    EXPECT_STREQ(PelmTest_Violation(), "did not pause when asked to");
    ZOTARPELM_OsSleep(1);
    EXPECT_EQ(counters.violations, 2u);
}

TEST_F(HostForTests, observers_see_each_call_twice_and_may_change_faults_in_time) {
    static std::vector<int> seen;
    seen.clear();
    PelmTest_SetObserver(
        [](void *user, const PelmTestCall *call) {
            if (call->served == 0) static_cast<PelmTestFaults *>(user)->failingAllocation = 1;
            seen.push_back(call->service * 10 + call->served);
        },
        &faults);
    EXPECT_EQ(ZOTARPELM_OsMalloc(4), nullptr);
    EXPECT_EQ(poll(), 0);
    const std::vector<int> expected{PELM_TEST_ALLOCATION * 10, PELM_TEST_ALLOCATION * 10 + 1, PELM_TEST_POLL * 10,
                                    PELM_TEST_POLL * 10 + 1};
    EXPECT_EQ(seen, expected);
}

TEST_F(HostForTests, areas_lie_flush_against_their_page_and_notice_writes_beside_them) {
    PelmTestArea area{};
    for (const int edge : {PELM_TEST_AREA_AT_END, PELM_TEST_AREA_AT_START}) {
        uint8_t *const start = PelmTest_TakeArea(&area, 100, edge);
        ASSERT_NE(start, nullptr);
        const bool at_start = edge == PELM_TEST_AREA_AT_START;
        EXPECT_EQ(at_start ? start : start + 100, at_start ? area.room : area.room + area.roomSize);
        EXPECT_EQ(PelmTest_AreaIsIntact(&area), 1);
        start[at_start ? 100 : -1] = 0;
        EXPECT_EQ(PelmTest_AreaIsIntact(&area), 0);
    }
    PelmTest_ReleaseArea(&area);
}

TEST_F(HostForTests, decoders_run_under_it) {
    PelmTest_OpenSource(&source, PELM_SOURCE_STREAM, &bytes, 0);
    ImageDecodeInfo info{};
    info.input = &source;
    EXPECT_EQ(ZOTARPELMI_DecodePNG(&info, nullptr, 4, 4), 0);
    EXPECT_GT(counters.allocations, 0u);
    EXPECT_EQ(counters.liveBlocks, 0u);
    faults.failingAllocation = static_cast<uint32_t>(counters.allocations) + 1;
    const uint64_t reads = counters.reads;
    EXPECT_EQ(ZOTARPELMI_DecodePNG(&info, nullptr, 4, 4), 0);
    EXPECT_EQ(counters.reads, reads);
}

} // namespace

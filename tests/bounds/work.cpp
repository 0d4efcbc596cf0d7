#include "tests/bounds/work.h"

namespace pelm::test {
namespace {

uint64_t bytes_moved = 0;

} // namespace

Work work() {
    const PelmTestCounters &counters = *PelmTest_Counters();
    return {counters.allocations, counters.reads, counters.bytesRead, counters.seeks, bytes_moved, counters.peakBytes};
}

void reset_work() {
    TestHost::get().reset();
    bytes_moved = 0;
}

::testing::AssertionResult within(uint64_t factor, const Work &got, const Work &ordinary) {
    auto result = ::testing::AssertionSuccess();
    const auto compare = [&](const char *what, uint64_t Work::*part) {
        // A few more calls than none are no growth.
        if (got.*part <= factor * (ordinary.*part) + 16) return;
        if (result) result = ::testing::AssertionFailure();
        result << what << ": " << got.*part << ", ordinarily " << ordinary.*part << "; ";
    };
    compare("allocations", &Work::allocations);
    compare("reads", &Work::reads);
    compare("bytes read", &Work::bytes_read);
    compare("seeks", &Work::seeks);
    compare("bytes copied and filled", &Work::bytes_moved);
    compare("bytes alive at once", &Work::peak_bytes);
    return result;
}

::testing::AssertionResult left_nothing() {
    PelmTest_CheckBlocks();
    if (const char *const violation = PelmTest_Violation()) return ::testing::AssertionFailure() << violation;
    if (const uint64_t blocks = PelmTest_Counters()->liveBlocks)
        return ::testing::AssertionFailure() << blocks << " blocks are still allocated";
    return ::testing::AssertionSuccess();
}

} // namespace pelm::test

extern "C" {

void __real_ZOTARPELM_OsMemcpy(void *destination, const void *source, uint32_t count);
void __real_ZOTARPELM_OsMemset(void *destination, int32_t value, uint32_t count);
void __wrap_ZOTARPELM_OsMemcpy(void *destination, const void *source, uint32_t count);
void __wrap_ZOTARPELM_OsMemset(void *destination, int32_t value, uint32_t count);

void __wrap_ZOTARPELM_OsMemcpy(void *destination, const void *source, uint32_t count) {
    pelm::test::bytes_moved += count;
    __real_ZOTARPELM_OsMemcpy(destination, source, count);
}

void __wrap_ZOTARPELM_OsMemset(void *destination, int32_t value, uint32_t count) {
    pelm::test::bytes_moved += count;
    __real_ZOTARPELM_OsMemset(destination, value, count);
}

} // extern "C"

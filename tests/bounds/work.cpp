#include "tests/bounds/work.h"

namespace pelm::test {
Work work() {
    const PelmTestCounters &counters = *PelmTest_Counters();
    return {counters.allocations, counters.reads,      counters.bytesRead,
            counters.seeks,       counters.bytesMoved, counters.peakBytes};
}

void reset_work() {
    TestHost::get().reset();
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

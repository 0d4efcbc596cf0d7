#include "tests/support/test_host.h"

#include <algorithm>

namespace pelm::test {

TestHost &TestHost::get() {
    static TestHost host;
    return host;
}

TestHost::TestHost() {
    PelmTest_SetObserver(observe, this);
}

namespace {
// Tests look at what was asked for before they first named the host, too.
const TestHost &from_the_start = TestHost::get();
} // namespace

void TestHost::reset() {
    PelmTest_Reset();
    faults = HostFaults{};
    allocations.clear();
    seeks.clear();
    reads.clear();
    violations.clear();
    peak_bytes = 0;
}

std::vector<uint32_t> TestHost::live_blocks() const {
    std::vector<uint32_t> sizes;
    for (uint64_t i = 0; i < PelmTest_Counters()->liveBlocks; ++i)
        sizes.push_back(PelmTest_LiveBlock(i, nullptr));
    return sizes;
}

uint64_t TestHost::live_bytes() const {
    return PelmTest_Counters()->liveBytes;
}

void TestHost::observe(void *host, const PelmTestCall *call) {
    if (call->served == 0)
        static_cast<TestHost *>(host)->hand_over_faults();
    else
        static_cast<TestHost *>(host)->record(*call);
}

void TestHost::hand_over_faults() const {
    PelmTestFaults &to = *PelmTest_Faults();
    to.failingAllocation = static_cast<uint32_t>(faults.failing_allocation);
    to.failingAllocationsFrom = static_cast<uint32_t>(faults.failing_allocations_from);
    to.largestBlock = faults.largest_block;
    to.failingRead = static_cast<uint32_t>(faults.failing_read);
    to.failingReadsFrom = static_cast<uint32_t>(faults.failing_reads_from);
    to.failingReadResult = faults.failing_read_result;
    to.shortReadsFrom = static_cast<uint32_t>(faults.short_reads_from);
    to.mostPerRead = faults.most_per_read;
    to.overclaimingReadsFrom = static_cast<uint32_t>(faults.overclaiming_reads_from);
    to.filling = faults.block_filling;
    to.readFilling = faults.read_filling;
}

void TestHost::record(const PelmTestCall &call) {
    switch (call.service) {
    case PELM_TEST_ALLOCATION: allocations.push_back(static_cast<uint32_t>(call.amount)); break;
    case PELM_TEST_READ: reads.push_back({call.position, static_cast<int32_t>(call.amount), call.result}); break;
    case PELM_TEST_SEEK: seeks.push_back({static_cast<int32_t>(call.amount), call.origin}); break;
    default: break;
    }
    if (call.violation != nullptr)
        violations.push_back(std::string(call.violation) + " (" + std::to_string(call.amount) + " bytes)");
    peak_bytes = PelmTest_Counters()->peakBytes;
}

TestSource::TestSource(uint32_t kind, const std::vector<uint8_t> &bytes, int32_t buffer_size)
    : served_{memory_.take(bytes.size(), Edge::end), static_cast<int32_t>(bytes.size()), 1}, original_(bytes) {
    std::copy(bytes.begin(), bytes.end(), served_.bytes);
    PelmTest_OpenSource(&source, kind, &served_, buffer_size);
}

bool TestSource::unchanged() const {
    return std::equal(original_.begin(), original_.end(), served_.bytes) && memory_.intact();
}

} // namespace pelm::test

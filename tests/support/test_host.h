// The host for tests (PelmHostTesting.h) as the test programs see it: what was asked of it as lists to compare, and a
// source over guarded bytes.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "PelmHostTesting.h"
#include "tests/support/guarded_buffer.h"

namespace pelm::test {

struct SeekCall {
    int32_t offset;
    int32_t origin;
    bool operator==(const SeekCall &) const = default;
};

struct ReadCall {
    int32_t position; // before the read
    int32_t asked;
    int32_t delivered;
    bool operator==(const ReadCall &) const = default;
};

// The faults that the tests ask for (PelmTestFaults has all). Calls are counted from 1; 0 means never.
struct HostFaults {
    int failing_allocation = 0;
    int failing_allocations_from = 0;
    uint32_t largest_block = 64u << 20; // what is larger fails
    int failing_read = 0;
    int failing_reads_from = 0;
    int32_t failing_read_result = -1;
    int short_reads_from = 0; // from this read on at most `most_per_read` bytes are delivered
    int32_t most_per_read = 1;
    int overclaiming_reads_from = 0; // from this read on the result is 1000 above what was delivered
    uint8_t block_filling = 0xA5;
    uint8_t read_filling = 0; // what reads leave of their room; 0: as it was
};

class TestHost {
public:
    static TestHost &get();

    // Frees what is still allocated, forgets everything that was recorded, and behaves from now on.
    void reset();

    HostFaults faults;

    // Sizes asked for, in order, failed ones included; and those of the blocks that are alive, oldest first.
    std::vector<uint32_t> allocations;
    std::vector<uint32_t> live_blocks() const;
    uint64_t live_bytes() const;
    uint64_t peak_bytes = 0;
    std::vector<SeekCall> seeks;
    std::vector<ReadCall> reads;

    // What the library did that it must not do: one line each.
    std::vector<std::string> violations;

    // What a test allocates on behalf of the library, by the same account.
    void *allocate(uint32_t size) { return ZOTARPELM_OsMalloc(size); }
    void free(void *block) { ZOTARPELM_OsFree(block); }

private:
    TestHost();
    static void observe(void *host, const PelmTestCall *call);
    void hand_over_faults() const;
    void record(const PelmTestCall &call);
};

// A source of any kind over bytes of its own, which end flush against an inaccessible page. A stream's position lives
// in the words that belong to the host.
class TestSource {
public:
    TestSource(uint32_t kind, const std::vector<uint8_t> &bytes, int32_t buffer_size = 4096);
    TestSource(const TestSource &) = delete;
    TestSource &operator=(const TestSource &) = delete;

    InputSource source{};
    const uint8_t *bytes() const { return served_.bytes; }
    // Whether the bytes are still those that it was made of.
    bool unchanged() const;

private:
    GuardedBuffer memory_;
    PelmTestBytes served_;
    std::vector<uint8_t> original_;
};

} // namespace pelm::test

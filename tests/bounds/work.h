// What decodes asked of their host, counted: what they cost, without a clock.
#pragma once

#include <gtest/gtest.h>

#include <cstdint>

#include "tests/support/test_host.h"

namespace pelm::test {

struct Work {
    uint64_t allocations = 0;
    uint64_t reads = 0;
    uint64_t bytes_read = 0;
    uint64_t seeks = 0;
    uint64_t bytes_moved = 0; // copied and filled by the host
    uint64_t peak_bytes = 0;
};

// Since the host was last reset by reset_work().
Work work();
void reset_work();

// What is asked for may grow with the input, but by no more than `factor` times as much as ordinary input of the same
// size asks for.
::testing::AssertionResult within(uint64_t factor, const Work &got, const Work &ordinary);

class BoundsTest : public ::testing::Test {
protected:
    BoundsTest() { reset_work(); }
    ~BoundsTest() override { TestHost::get().reset(); }
    TestHost &host = TestHost::get();
};

// Nothing is alive, and nothing was done that must not be done.
::testing::AssertionResult left_nothing();

} // namespace pelm::test

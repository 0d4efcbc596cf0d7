// How many cases a sweep has gone through.
#pragma once

#include <cstdint>
#include <cstdio>

#include <gtest/gtest.h>

#include "tests/sweeps/extent.h"

namespace pelm::sweeps {

// Tells the number, and fails when the complete form has not come to what it is meant to.
inline void tell(const char *what, uint64_t count, uint64_t of_all) {
    testing::Test::RecordProperty(what, std::to_string(count));
    std::printf("%llu %s\n", static_cast<unsigned long long>(count), what);
    if (by_extent(false, false, true)) {
        EXPECT_GE(count, of_all) << what;
    }
}

} // namespace pelm::sweeps

// How far sweeps go: everything where the environment has PELM_TEST_LONG, little where it has PELM_TEST_QUICK.
#pragma once

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>

#include <gtest/gtest.h>

#include "tests/support/quick.h"

namespace pelm::sweeps {

template <class Amount>
Amount by_extent(Amount quick, Amount usual, Amount all) {
    if (getenv("PELM_TEST_LONG") != nullptr) return all;
    return test::quick() ? quick : usual;
}

inline bool is_complete() {
    return by_extent(false, false, true);
}

// What scripts/soak shows of a sweep.
inline void tell_count(const char *sweep, uint64_t count, const char *of_what = "decodes") {
    testing::Test::RecordProperty(of_what, std::to_string(count));
    printf("%s: %llu %s\n", sweep, static_cast<unsigned long long>(count), of_what);
}

} // namespace pelm::sweeps

// Fewer cases of the large cross products, for emulators and sanitizers: where the environment has PELM_TEST_QUICK.
#pragma once

#include <cstdlib>

namespace pelm::test {

inline bool quick() {
    static const bool asked = getenv("PELM_TEST_QUICK") != nullptr;
    return asked;
}

} // namespace pelm::test

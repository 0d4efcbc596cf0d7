// How far sweeps go: everything where the environment has PELM_TEST_LONG, little where it has PELM_TEST_QUICK.
#pragma once

#include <cstdlib>

namespace pelm::sweeps {

template <class Amount>
Amount by_extent(Amount quick, Amount usual, Amount all) {
    if (getenv("PELM_TEST_LONG") != nullptr) return all;
    return getenv("PELM_TEST_QUICK") != nullptr ? quick : usual;
}

} // namespace pelm::sweeps

// Choices by chance, the same in every run.
#pragma once

#include <cstddef>
#include <cstdint>

#include "tests/support/bmp_builder.h"

namespace pelm::test {

class Chooser {
public:
    explicit Chooser(uint32_t seed) : noise_(seed) {}
    template <class T, size_t count>
    T among(const T (&values)[count]) {
        return values[noise_.below(count)];
    }
    bool one_in(uint32_t count) { return noise_.below(count) == 0; }
    uint32_t below(uint32_t limit) { return noise_.below(limit); }

private:
    Noise noise_;
};

} // namespace pelm::test

// Running the same test with each kind of code that this processor can run.
#pragma once

#include <vector>

#include "frame/lanes.h"
#include "frame/processor.h"

namespace pelm::test {

// Those to compare; the last one is what the library chooses by itself.
inline std::vector<Kernels> all_kernels() {
    std::vector<Kernels> all;
    for (auto kind = static_cast<uint8_t>(Kernels::careful); kind <= static_cast<uint8_t>(kernels()); ++kind)
        all.push_back(static_cast<Kernels>(kind));
    return all;
}

class WithKernels {
public:
    explicit WithKernels(Kernels wanted) : before_(kernels()) { use_kernels(wanted); }
    WithKernels(const WithKernels &) = delete;
    WithKernels &operator=(const WithKernels &) = delete;
    ~WithKernels() { use_kernels(before_); }

private:
    Kernels before_;
};

} // namespace pelm::test

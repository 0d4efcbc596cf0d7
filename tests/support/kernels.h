// Running the same test with each kind of code that this processor can run.
#pragma once

#include <vector>

#include "frame/lanes.h"
#include "frame/processor.h"

namespace pelm::test {

// Those to compare; the last one is what the library chooses by itself.
inline std::vector<Kernels> all_kernels() {
    std::vector<Kernels> all{Kernels::plain};
    if (lanes_are_fast) all.push_back(Kernels::lanes);
    if (kernels() > all.back()) all.push_back(kernels());
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

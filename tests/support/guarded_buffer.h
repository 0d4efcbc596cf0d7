// Memory between two inaccessible pages (PelmTestArea) that gives itself back.
#pragma once

#include <cstddef>
#include <cstdint>

#include "PelmHostTesting.h"

namespace pelm::test {

enum class Edge { end, start };

class GuardedBuffer {
public:
    GuardedBuffer() = default;
    GuardedBuffer(const GuardedBuffer &) = delete;
    GuardedBuffer &operator=(const GuardedBuffer &) = delete;
    ~GuardedBuffer() { PelmTest_ReleaseArea(&area_); }

    // `size` bytes at the given edge, of any content. The area of the last call is given up.
    uint8_t *take(size_t size, Edge edge);

    // Whether everything round the area is as it was.
    bool intact() const { return PelmTest_AreaIsIntact(&area_) != 0; }

private:
    PelmTestArea area_{};
};

} // namespace pelm::test

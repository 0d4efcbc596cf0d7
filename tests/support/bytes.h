// Files under construction.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace pelm::test {

using Bytes = std::vector<uint8_t>;

inline void append(Bytes &bytes, const Bytes &more) {
    const size_t size = bytes.size();
    bytes.resize(size + more.size());
    std::copy(more.begin(), more.end(), bytes.begin() + static_cast<ptrdiff_t>(size));
}

inline void append_u32be(Bytes &bytes, uint32_t value) {
    for (int shift = 24; shift >= 0; shift -= 8)
        bytes.push_back(static_cast<uint8_t>(value >> shift));
}

} // namespace pelm::test

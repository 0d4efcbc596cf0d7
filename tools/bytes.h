// Multi-byte reads from files, in both byte orders. Out-of-range bytes read as 0.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

namespace pelm_tool {

using Bytes = std::span<const uint8_t>;

inline uint32_t byte_at(Bytes bytes, size_t at) {
    return at < bytes.size() ? bytes[at] : 0u;
}

inline uint32_t read_le16(Bytes bytes, size_t at) {
    return byte_at(bytes, at) | byte_at(bytes, at + 1) << 8;
}

inline uint32_t read_le32(Bytes bytes, size_t at) {
    return read_le16(bytes, at) | read_le16(bytes, at + 2) << 16;
}

inline uint32_t read_be32(Bytes bytes, size_t at) {
    return byte_at(bytes, at) << 24 | byte_at(bytes, at + 1) << 16 | byte_at(bytes, at + 2) << 8 |
           byte_at(bytes, at + 3);
}

} // namespace pelm_tool

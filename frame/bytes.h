// Multi-byte values in memory: little-endian reads of file data, native stores of pixels. Any address may be unaligned.
#pragma once

#include <bit>
#include <cstdint>
#include <cstring>

namespace pelm {

inline uint16_t read_u16le(const uint8_t *at) {
    return static_cast<uint16_t>(at[0] | at[1] << 8);
}

inline uint32_t read_u32le(const uint8_t *at) {
    return static_cast<uint32_t>(at[0]) | static_cast<uint32_t>(at[1]) << 8 | static_cast<uint32_t>(at[2]) << 16 |
           static_cast<uint32_t>(at[3]) << 24;
}

inline int32_t read_i32le(const uint8_t *at) {
    return static_cast<int32_t>(read_u32le(at));
}

inline uint64_t read_u64le(const uint8_t *at) {
    static_assert(std::endian::native == std::endian::little, "read as one value");
    uint64_t value;
    std::memcpy(&value, at, sizeof value);
    return value;
}

inline uint16_t read_u16be(const uint8_t *at) {
    return static_cast<uint16_t>(at[0] << 8 | at[1]);
}

// A pixel in native byte order.
inline uint16_t load_u16(const uint8_t *at) {
    uint16_t value;
    std::memcpy(&value, at, sizeof value);
    return value;
}

inline void store_u16(uint8_t *at, uint16_t value) {
    std::memcpy(at, &value, sizeof value);
}

// Four bytes in memory order, as one store.
inline void store_4(uint8_t *at, uint8_t b0, uint8_t b1, uint8_t b2, uint8_t b3) {
    static_assert(std::endian::native == std::endian::little, "pixels are packed for little-endian memory");
    const uint32_t value = static_cast<uint32_t>(b0) | static_cast<uint32_t>(b1) << 8 |
                           static_cast<uint32_t>(b2) << 16 | static_cast<uint32_t>(b3) << 24;
    std::memcpy(at, &value, sizeof value);
}

} // namespace pelm

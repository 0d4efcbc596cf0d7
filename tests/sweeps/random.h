// Numbers without a pattern, the same in every build.
#pragma once

#include <cstddef>
#include <cstdint>
#include <random>
#include <vector>

namespace pelm::sweeps {

class Random {
public:
    explicit Random(uint32_t seed) : engine_(seed) {}
    uint32_t next() { return static_cast<uint32_t>(engine_()); }
    uint32_t below(uint32_t limit) { return static_cast<uint32_t>(uint64_t{next()} * limit >> 32); }
    uint32_t between(uint32_t low, uint32_t high) { return low + below(high - low + 1); }
    bool one_in(uint32_t count) { return below(count) == 0; }
    uint8_t byte() { return static_cast<uint8_t>(next() >> 24); }

    std::vector<uint8_t> noise(size_t size) {
        std::vector<uint8_t> bytes(size);
        for (uint8_t &one : bytes)
            one = byte();
        return bytes;
    }

private:
    std::mt19937 engine_;
};

} // namespace pelm::sweeps

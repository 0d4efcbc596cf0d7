// A block of exactly so many bytes: touching one more ends the program, under AddressSanitizer by its red zones and
// elsewhere by an inaccessible page behind the block.
#pragma once

#include <cstddef>
#include <cstdint>

#include "PelmHostTesting.h"

namespace pelm::fuzz {

class ExactBytes {
public:
    // Some bytes before the block, to give it another alignment, are watched too.
    explicit ExactBytes(size_t size, size_t before = 0);
    ExactBytes(const ExactBytes &) = delete;
    ExactBytes &operator=(const ExactBytes &) = delete;
    ~ExactBytes();

    uint8_t *bytes() { return bytes_; }
    const uint8_t *bytes() const { return bytes_; }
    size_t size() const { return size_; }
    bool is_intact_before() const;

private:
    uint8_t *start_; // of the memory
    size_t before_;
    uint8_t *bytes_;
    size_t size_;
    PelmTestArea area_{}; // without AddressSanitizer
};

} // namespace pelm::fuzz

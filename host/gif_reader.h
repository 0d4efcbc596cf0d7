// The bytes of a GIF in their order, through the read service and a small window.
#pragma once

#include <cstdint>

#include "PelmHost.h"

namespace pelm::host {

class GifReader {
public:
    explicit GifReader(InputSource &source) : source_(source) {}

    // Whether `need` unread bytes are there, side by side from next() on. At most `window_size`.
    bool hold(int32_t need) { return end_ - at_ >= need || refill(need); }
    const uint8_t *next() const { return window_ + at_; }

    // Only of bytes that hold() said are there.
    void skip(int32_t count) { at_ += count; }
    uint8_t take() { return window_[at_++]; }

    static constexpr int32_t window_size = 4096;

private:
    bool refill(int32_t need);

    InputSource &source_;
    int32_t at_ = 0; // unread: from here to end_
    int32_t end_ = 0;
    uint8_t window_[window_size];
};

inline uint32_t le16(const uint8_t *bytes) {
    return bytes[0] | static_cast<uint32_t>(bytes[1]) << 8;
}

} // namespace pelm::host

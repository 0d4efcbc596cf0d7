// Memory between two inaccessible pages: an area can end flush against the upper one or start right after the lower
// one, and what lies between the area and the other page is filled with canaries.
#pragma once

#include <cstddef>
#include <cstdint>

namespace pelm::test {

enum class Edge { end, start };

class GuardedBuffer {
public:
    GuardedBuffer() = default;
    GuardedBuffer(const GuardedBuffer &) = delete;
    GuardedBuffer &operator=(const GuardedBuffer &) = delete;
    ~GuardedBuffer();

    // `size` bytes at the given edge, of any content. The area of the last call is given up.
    uint8_t *take(size_t size, Edge edge);

    // Whether everything round the area is as it was.
    bool intact() const;

private:
    void reserve(size_t size);
    void release();

    uint8_t *mapping_ = nullptr; // with both guard pages
    size_t mapping_size_ = 0;
    uint8_t *room_ = nullptr; // between the guard pages
    size_t room_size_ = 0;
    uint8_t *area_ = nullptr;
    size_t area_size_ = 0;
};

} // namespace pelm::test

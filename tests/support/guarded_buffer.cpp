#include "tests/support/guarded_buffer.h"

#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>

namespace pelm::test {

namespace {
constexpr uint8_t canary = 0xC3;
// Canaries beyond this distance from the area are not looked at.
constexpr size_t watched = 512;
} // namespace

GuardedBuffer::~GuardedBuffer() {
    release();
}

void GuardedBuffer::release() {
    if (mapping_ != nullptr) munmap(mapping_, mapping_size_);
    mapping_ = nullptr;
}

void GuardedBuffer::reserve(size_t size) {
    if (mapping_ != nullptr && room_size_ >= size) return;
    release();
    const size_t page = static_cast<size_t>(sysconf(_SC_PAGESIZE));
    room_size_ = (size / page + 1) * page;
    mapping_size_ = room_size_ + 2 * page;
    void *const mapping = mmap(nullptr, mapping_size_, PROT_NONE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (mapping == MAP_FAILED) abort();
    mapping_ = static_cast<uint8_t *>(mapping);
    room_ = mapping_ + page;
    if (mprotect(room_, room_size_, PROT_READ | PROT_WRITE) != 0) abort();
}

uint8_t *GuardedBuffer::take(size_t size, Edge edge) {
    reserve(size);
    area_ = edge == Edge::start ? room_ : room_ + (room_size_ - size);
    area_size_ = size;
    const size_t before = static_cast<size_t>(area_ - room_);
    const size_t after = room_size_ - size - before;
    memset(area_ - std::min(before, watched), canary, std::min(before, watched));
    memset(area_ + size, canary, std::min(after, watched));
    return area_;
}

bool GuardedBuffer::intact() const {
    if (mapping_ == nullptr) return true;
    const auto all_canaries = [](const uint8_t *from, const uint8_t *to) {
        return std::all_of(from, to, [](uint8_t byte) { return byte == canary; });
    };
    const size_t before = static_cast<size_t>(area_ - room_);
    const size_t after = room_size_ - area_size_ - before;
    const uint8_t *const behind = area_ + area_size_;
    return all_canaries(area_ - std::min(before, watched), area_) &&
           all_canaries(behind, behind + std::min(after, watched));
}

} // namespace pelm::test

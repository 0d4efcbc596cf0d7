// The memory services: allocation within the limits of the control, and filling and copying bytes.
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <new>

#include "host/control.h"

namespace pelm::host {
namespace {

// Stands in front of every block, so that freeing charges the control that paid, whichever is installed by then.
// The alignment makes sizeof a step that keeps the block behind it aligned for any type.
struct alignas(std::max_align_t) BlockHeader {
    PelmHostControl *owner; // holds a reference; NULL when allocated without a control
    uint32_t size;          // as asked for
};

// NULL also when header and block together exceed the address space (32-bit systems).
BlockHeader *allocate(uint32_t size, PelmHostControl *owner) {
    size_t total = 0;
    if (__builtin_add_overflow(sizeof(BlockHeader), size, &total)) return nullptr;
    void *const memory = malloc(total);
    return memory == nullptr ? nullptr : new (memory) BlockHeader{owner, size};
}

// Call under the lock.
bool within_limits(const PelmHostControl &control, uint32_t size) {
    if (control.block_limit != 0 && size > control.block_limit) return false;
    return control.live_limit == 0 || control.counters.liveBytes + size <= control.live_limit;
}

// Call under the lock.
void charge(PelmHostCounters &counters, uint32_t size) {
    counters.allocations += 1;
    counters.liveBlocks += 1;
    counters.liveBytes += size;
    if (counters.peakBytes < counters.liveBytes) counters.peakBytes = counters.liveBytes;
}

// One locked step from the check to the charge, so that threads together cannot overshoot a limit.
BlockHeader *allocate_under(PelmHostControl &control, uint32_t size) {
    const Locked locked(control);
    BlockHeader *const block = within_limits(control, size) ? allocate(size, &control) : nullptr;
    if (block == nullptr) {
        control.counters.failedAllocations += 1;
        return nullptr;
    }
    charge(control.counters, size);
    retain(control);
    return block;
}

void refund(PelmHostControl &control, uint32_t size) {
    {
        const Locked locked(control);
        control.counters.liveBlocks -= 1;
        control.counters.liveBytes -= size;
    }
    drop(control);
}

} // namespace
} // namespace pelm::host

[[gnu::weak]] void *ZOTARPELM_OsMalloc(uint32_t size) {
    const pelm::host::HeldControl control;
    pelm::host::BlockHeader *const block = control.get() == nullptr ? pelm::host::allocate(size, nullptr)
                                                                    : pelm::host::allocate_under(*control.get(), size);
    return block == nullptr ? nullptr : block + 1;
}

[[gnu::weak]] void ZOTARPELM_OsFree(void *block) {
    if (block == nullptr) return;
    pelm::host::BlockHeader *const header = static_cast<pelm::host::BlockHeader *>(block) - 1;
    if (header->owner != nullptr) pelm::host::refund(*header->owner, header->size);
    free(header);
}

[[gnu::weak]] void ZOTARPELM_OsMemset(void *destination, int32_t value, uint32_t count) {
    if (count > 0) memset(destination, value, count);
}

[[gnu::weak]] void ZOTARPELM_OsMemcpy(void *destination, const void *source, uint32_t count) {
    if (count > 0) memmove(destination, source, count);
}

void PelmHost_SetMemoryLimits(PelmHostControl *control, uint64_t liveBytes, uint64_t blockBytes) {
    if (control == nullptr) return;
    const pelm::host::Locked locked(*control);
    control->live_limit = liveBytes;
    control->block_limit = blockBytes;
}

// Memory: blocks that fail on demand, are watched on both sides, and are known one by one.
#include <cstdlib>
#include <cstring>

#include "host/testing/account.h"

#if defined(__has_feature)
#if __has_feature(address_sanitizer)
#define PELM_TESTING_ASAN 1
#endif
#endif
#if defined(__SANITIZE_ADDRESS__)
#define PELM_TESTING_ASAN 1
#endif

namespace pelm::host_testing {
namespace {

// On either side of a block; keeps it aligned for any type. AddressSanitizer watches blocks of exactly their size
// itself.
#if defined(PELM_TESTING_ASAN)
constexpr size_t margin_size = 0;
#else
constexpr size_t margin_size = 32;
#endif
constexpr uint8_t margin_byte = 0xC7;

struct Block {
    uint8_t *payload;
    uint32_t size;
};

// The live blocks, oldest first.
struct Blocks {
    Block *list;
    size_t count;
    size_t capacity;
};

constinit thread_local Blocks blocks{nullptr, 0, 0};

bool make_room() {
    if (blocks.count < blocks.capacity) return true;
    const size_t capacity = blocks.capacity == 0 ? 64 : blocks.capacity * 2;
    auto *const list = static_cast<Block *>(realloc(blocks.list, capacity * sizeof(Block)));
    if (list == nullptr) return false;
    blocks.list = list;
    blocks.capacity = capacity;
    return true;
}

bool fails(uint32_t size) {
    const Account &now = account();
    const PelmTestFaults &faults = now.faults;
    return struck(now.counters.allocations, faults.failingAllocation, faults.failingAllocationsFrom) ||
           (faults.largestBlock != 0 && size > faults.largestBlock) ||
           (faults.mostLiveBytes != 0 && now.counters.liveBytes + size > faults.mostLiveBytes);
}

uint8_t *new_block(uint32_t size) {
    if (uint64_t{size} + 2 * margin_size > SIZE_MAX || !make_room()) return nullptr;
    auto *const start = static_cast<uint8_t *>(malloc(size + 2 * margin_size));
    if (start == nullptr) return nullptr;
    uint8_t *const payload = start + margin_size;
    memset(start, margin_byte, margin_size);
    memset(payload + size, margin_byte, margin_size);
    const int32_t filling = account().faults.filling;
    if (filling >= 0) memset(payload, filling, size);
    blocks.list[blocks.count++] = {payload, size};
    return payload;
}

void count_new_block(uint32_t size) {
    PelmTestCounters &counters = account().counters;
    ++counters.liveBlocks;
    counters.liveBytes += size;
    if (counters.liveBytes > counters.peakBytes) counters.peakBytes = counters.liveBytes;
}

bool is_margin(const uint8_t *start) {
    for (size_t i = 0; i < margin_size; ++i)
        if (start[i] != margin_byte) return false;
    return true;
}

bool is_intact(const Block &block) {
    return is_margin(block.payload - margin_size) && is_margin(block.payload + block.size);
}

// Newest first: most blocks do not live long. NULL when it is none.
Block *find(const void *payload) {
    for (size_t i = blocks.count; i > 0; --i)
        if (blocks.list[i - 1].payload == payload) return &blocks.list[i - 1];
    return nullptr;
}

// Compilers may leave out what is written to memory that is freed next, unless they do not know who writes it.
void *(*const volatile fill)(void *, int, size_t) = memset;

// A reader of what it has freed sees neither what was there nor what new blocks hold.
void free_block(const Block &block) {
    const int32_t filling = account().faults.filling;
    if (filling >= 0) fill(block.payload, ~filling, block.size);
    free(block.payload - margin_size);
}

void give_back(Block *block) {
    PelmTestCounters &counters = account().counters;
    --counters.liveBlocks;
    counters.liveBytes -= block->size;
    free_block(*block);
    --blocks.count;
    memmove(block, block + 1, static_cast<size_t>(blocks.list + blocks.count - block) * sizeof(Block));
}

constexpr char wrote_outside[] = "wrote outside a block";

} // namespace

void release_blocks() {
    for (size_t i = 0; i < blocks.count; ++i)
        free_block(blocks.list[i]);
    free(blocks.list);
    blocks = Blocks{nullptr, 0, 0};
}

} // namespace pelm::host_testing

using namespace pelm::host_testing;

uint32_t PelmTest_LiveBlock(uint64_t index, const void **block) {
    const bool exists = index < blocks.count;
    const Block found = exists ? blocks.list[index] : Block{nullptr, 0};
    if (block != nullptr) *block = found.payload;
    return found.size;
}

void PelmTest_CheckBlocks(void) {
    for (size_t i = 0; i < blocks.count; ++i)
        if (!is_intact(blocks.list[i])) count_violation(wrote_outside);
}

void *ZOTARPELM_OsMalloc(uint32_t size) {
    Call call({PELM_TEST_ALLOCATION, 0, nullptr, nullptr, size, 0, 0, 0, nullptr});
    PelmTestCounters &counters = account().counters;
    ++counters.allocations;
    uint8_t *const block = fails(size) ? nullptr : new_block(size);
    if (block == nullptr)
        ++counters.failedAllocations;
    else
        count_new_block(size);
    call.record.block = block;
    return block;
}

void ZOTARPELM_OsFree(void *payload) {
    Call call({PELM_TEST_FREE, 0, nullptr, payload, 0, 0, 0, 0, nullptr});
    ++account().counters.frees;
    Block *const block = find(payload);
    if (block == nullptr) {
        call.violate(payload == nullptr ? "freed NULL" : "freed what is not an allocated block");
        return;
    }
    call.record.amount = block->size;
    if (!is_intact(*block)) call.violate(wrote_outside);
    give_back(block);
}

void ZOTARPELM_OsMemset(void *destination, int32_t value, uint32_t count) {
    account().counters.bytesMoved += count;
    if (count > 0) memset(destination, value, count);
}

void ZOTARPELM_OsMemcpy(void *destination, const void *source, uint32_t count) {
    account().counters.bytesMoved += count;
    if (count > 0) memmove(destination, source, count);
}

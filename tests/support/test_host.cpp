#include "tests/support/test_host.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>

#if defined(__has_feature)
#if __has_feature(address_sanitizer)
#define PELM_TEST_ASAN 1
#endif
#endif
#if defined(__SANITIZE_ADDRESS__)
#define PELM_TEST_ASAN 1
#endif
#if defined(PELM_TEST_ASAN)
#include <sanitizer/asan_interface.h>
#define PELM_TEST_POISON(start, size) ASAN_POISON_MEMORY_REGION(start, size)
#define PELM_TEST_UNPOISON(start, size) ASAN_UNPOISON_MEMORY_REGION(start, size)
#else
#define PELM_TEST_POISON(start, size) static_cast<void>(start)
#define PELM_TEST_UNPOISON(start, size) static_cast<void>(start)
#endif

namespace pelm::test {

namespace {

// On either side of a block; also keeps the block aligned for any type.
constexpr size_t margin_size = 32;
constexpr uint8_t margin_byte = 0xC7;

bool is_margin(const uint8_t *start) {
    return std::all_of(start, start + margin_size, [](uint8_t byte) { return byte == margin_byte; });
}

bool reached(size_t calls, int from) {
    return from > 0 && calls >= static_cast<size_t>(from);
}

} // namespace

TestHost &TestHost::get() {
    static TestHost host;
    return host;
}

void TestHost::reset() {
    for (const Block &block : blocks_)
        give_back(block);
    blocks_.clear();
    faults = HostFaults{};
    allocations.clear();
    seeks.clear();
    reads.clear();
    violations.clear();
    peak_bytes = 0;
}

std::vector<uint32_t> TestHost::live_blocks() const {
    std::vector<uint32_t> sizes;
    for (const Block &block : blocks_)
        sizes.push_back(block.size);
    return sizes;
}

uint64_t TestHost::live_bytes() const {
    uint64_t bytes = 0;
    for (const Block &block : blocks_)
        bytes += block.size;
    return bytes;
}

void *TestHost::allocate(uint32_t size) {
    allocations.push_back(size);
    const bool fails = allocations.size() == static_cast<size_t>(faults.failing_allocation) ||
                       reached(allocations.size(), faults.failing_allocations_from) || size > faults.largest_block;
    if (fails) return nullptr;
    uint8_t *const start = static_cast<uint8_t *>(malloc(size + 2 * margin_size));
    if (start == nullptr) return nullptr;
    uint8_t *const payload = start + margin_size;
    memset(start, margin_byte, margin_size);
    memset(payload, faults.block_filling, size);
    memset(payload + size, margin_byte, margin_size);
    PELM_TEST_POISON(start, margin_size);
    PELM_TEST_POISON(payload + size, margin_size);
    blocks_.push_back({payload, size});
    peak_bytes = std::max(peak_bytes, live_bytes());
    return payload;
}

void TestHost::check_margins(const Block &block) {
    if (!is_margin(block.payload - margin_size) || !is_margin(block.payload + block.size))
        violations.push_back("wrote outside a block of " + std::to_string(block.size) + " bytes");
}

void TestHost::give_back(const Block &block) {
    PELM_TEST_UNPOISON(block.payload - margin_size, margin_size);
    PELM_TEST_UNPOISON(block.payload + block.size, margin_size);
    check_margins(block);
    ::free(block.payload - margin_size);
}

void TestHost::free(void *block) {
    const auto found =
        std::find_if(blocks_.begin(), blocks_.end(), [block](const Block &b) { return b.payload == block; });
    if (found == blocks_.end()) {
        violations.push_back(block == nullptr ? "freed NULL" : "freed what is not an allocated block");
        return;
    }
    give_back(*found);
    blocks_.erase(found);
}

int32_t TestHost::read(InputSource *source, void *destination, int32_t count) {
    const int32_t position = source->hostPosition;
    reads.push_back({position, count, 0});
    if (count < 0) violations.push_back("read of " + std::to_string(count) + " bytes");
    if (reads.size() == static_cast<size_t>(faults.failing_read) || reached(reads.size(), faults.failing_reads_from))
        return reads.back().delivered = faults.failing_read_result;
    int32_t delivered = std::clamp(count, 0, source->size - position);
    if (reached(reads.size(), faults.short_reads_from)) delivered = std::min(delivered, faults.most_per_read);
    const TestSource *const bytes = static_cast<const TestSource *>(source->hostContext);
    if (delivered > 0) memcpy(destination, bytes->bytes() + position, static_cast<size_t>(delivered));
    source->hostPosition = position + delivered;
    source->consumed = source->hostPosition;
    reads.back().delivered = delivered;
    return reached(reads.size(), faults.overclaiming_reads_from) ? delivered + 1000 : delivered;
}

int32_t TestHost::seek(InputSource *source, int32_t offset, int32_t origin) {
    seeks.push_back({offset, origin});
    const int64_t base = origin == 0 ? 0 : source->hostPosition;
    const int64_t target = std::clamp<int64_t>(base + offset, 0, source->size);
    source->hostPosition = static_cast<int32_t>(target);
    source->consumed = source->hostPosition;
    return static_cast<int32_t>(target - base);
}

TestSource::TestSource(uint32_t kind, const std::vector<uint8_t> &bytes, int32_t buffer_size)
    : bytes_(memory_.take(bytes.size(), Edge::end)), original_(bytes) {
    std::copy(bytes.begin(), bytes.end(), bytes_);
    source.kind = kind;
    source.data = kind == PELM_SOURCE_MEMORY ? bytes_ : nullptr;
    source.hostContext = this;
    source.size = static_cast<int32_t>(bytes.size());
    source.bufferSize = buffer_size;
}

bool TestSource::unchanged() const {
    return std::equal(original_.begin(), original_.end(), bytes_) && memory_.intact();
}

} // namespace pelm::test

using pelm::test::TestHost;

extern "C" {

int32_t ZOTARPELM_Read_IO(InputSource *source, void *destination, int32_t count) {
    return TestHost::get().read(source, destination, count);
}

int32_t ZOTARPELM_Seek_IO(InputSource *source, int32_t offset, int32_t origin) {
    return TestHost::get().seek(source, offset, origin);
}

void *ZOTARPELM_OsMalloc(uint32_t size) {
    return TestHost::get().allocate(size);
}

void ZOTARPELM_OsFree(void *block) {
    TestHost::get().free(block);
}

void ZOTARPELM_OsMemset(void *destination, int32_t value, uint32_t count) {
    if (count > 0) memset(destination, value, count);
}

void ZOTARPELM_OsMemcpy(void *destination, const void *source, uint32_t count) {
    if (count > 0) memmove(destination, source, count);
}

void ZOTARPELM_CheckExStatus(int32_t *status) {
    *status = 0;
}

void ZOTARPELM_OsSleep(int32_t) {}

} // extern "C"

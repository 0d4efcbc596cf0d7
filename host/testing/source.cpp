// Reading and seeking in bytes that the test holds.
#include <cstring>

#include "host/testing/account.h"

namespace pelm::host_testing {
namespace {

int32_t smaller(int32_t a, int32_t b) {
    return a < b ? a : b;
}

// What the source delivers; memory sources that were filled in by hand, without bytes of ours, have their own.
PelmTestBytes bytes_of(const InputSource &source) {
    if (source.hostContext != nullptr) return *static_cast<const PelmTestBytes *>(source.hostContext);
    const bool has_data = source.kind == PELM_SOURCE_MEMORY && source.data != nullptr;
    return {source.data, has_data ? source.size : 0, 1};
}

// Where the data ends; 0 or above.
int32_t end_of(const InputSource &source) {
    const PelmTestBytes bytes = bytes_of(source);
    const int32_t end = bytes.endsWithStatedSize != 0 ? smaller(bytes.size, source.size) : bytes.size;
    return end < 0 ? 0 : end;
}

void move_to(InputSource &source, int32_t position) {
    source.hostPosition = position;
    source.consumed = position;
}

int32_t deliver(InputSource &source, void *destination, int32_t count) {
    const int32_t position = source.hostPosition;
    const int32_t left = end_of(source) - position;
    const int32_t delivered = smaller(count, left);
    if (delivered <= 0) return 0;
    // NOLINTNEXTLINE(clang-analyzer-core.NonNullParamChecker): bytes that have a size are there
    memcpy(destination, bytes_of(source).bytes + position, static_cast<size_t>(delivered));
    move_to(source, position + delivered);
    account().counters.bytesRead += static_cast<uint64_t>(delivered);
    return delivered;
}

} // namespace
} // namespace pelm::host_testing

using namespace pelm::host_testing;

void PelmTest_OpenSource(InputSource *source, uint32_t kind, PelmTestBytes *bytes, int32_t bufferSize) {
    *source = InputSource{};
    source->kind = kind;
    source->data = kind == PELM_SOURCE_MEMORY ? bytes->bytes : nullptr;
    source->hostContext = bytes;
    source->size = bytes->size;
    source->bufferSize = bufferSize;
}

int32_t ZOTARPELM_Read_IO(InputSource *source, void *destination, int32_t count) {
    Call call({PELM_TEST_READ, 0, source, nullptr, count, 0, source->hostPosition, 0, nullptr});
    PelmTestCounters &counters = account().counters;
    const PelmTestFaults &faults = account().faults;
    const uint64_t number = ++counters.reads;
    if (count < 0) call.violate("read a negative number of bytes");
    if (count > 0 && faults.readFilling != 0) memset(destination, faults.readFilling, static_cast<size_t>(count));
    if (struck(number, faults.failingRead, faults.failingReadsFrom)) {
        ++counters.faultyReads;
        return call.record.result = faults.failingReadResult;
    }
    const bool short_read = struck(number, faults.shortRead, faults.shortReadsFrom) && faults.mostPerRead < count;
    if (short_read) ++counters.faultyReads;
    const int32_t delivered = deliver(*source, destination, short_read ? faults.mostPerRead : count);
    call.record.result = delivered;
    if (!struck(number, 0, faults.overclaimingReadsFrom)) return delivered;
    ++counters.faultyReads;
    return delivered + 1000;
}

int32_t ZOTARPELM_Seek_IO(InputSource *source, int32_t offset, int32_t origin) {
    Call call({PELM_TEST_SEEK, 0, source, nullptr, offset, origin, source->hostPosition, 0, nullptr});
    ++account().counters.seeks;
    const int64_t before = source->hostPosition;
    int64_t target = (origin == 0 ? 0 : before) + offset;
    if (target > end_of(*source)) target = end_of(*source);
    if (target < 0) target = 0;
    move_to(*source, static_cast<int32_t>(target));
    return call.record.result = static_cast<int32_t>(target - before);
}

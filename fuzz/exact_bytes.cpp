#include "fuzz/exact_bytes.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>

#if defined(__has_feature)
#if __has_feature(address_sanitizer)
#define PELM_FUZZ_ASAN 1
#endif
#endif
#if defined(__SANITIZE_ADDRESS__)
#define PELM_FUZZ_ASAN 1
#endif

namespace pelm::fuzz {
namespace {

constexpr uint8_t canary = 0xC9;

#if defined(PELM_FUZZ_ASAN)
// A heap block of 0 bytes would have one.
uint8_t *take(PelmTestArea &, size_t size, size_t &before) {
    if (size + before == 0) before = 1;
    return static_cast<uint8_t *>(malloc(size + before));
}

void give_back(PelmTestArea &, uint8_t *start) {
    free(start);
}
#else
uint8_t *take(PelmTestArea &area, size_t size, size_t &before) {
    return PelmTest_TakeArea(&area, size + before, PELM_TEST_AREA_AT_END);
}

void give_back(PelmTestArea &area, uint8_t *) {
    PelmTest_ReleaseArea(&area);
}
#endif

} // namespace

ExactBytes::ExactBytes(size_t size, size_t before) : before_(before), size_(size) {
    start_ = take(area_, size, before_);
    if (start_ == nullptr) abort();
    memset(start_, canary, before_);
    bytes_ = start_ + before_;
}

ExactBytes::~ExactBytes() {
    give_back(area_, start_);
}

bool ExactBytes::is_intact_before() const {
    return std::all_of(start_, start_ + before_, [](uint8_t byte) { return byte == canary; });
}

} // namespace pelm::fuzz

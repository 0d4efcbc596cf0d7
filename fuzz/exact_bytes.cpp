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

bool is_intact_round(const PelmTestArea &) {
    return true;
}
#else
// Areas that are not in use: mapping one anew takes longer than most decodes.
struct SpareAreas {
    static constexpr size_t most = 16;
    PelmTestArea list[most] = {};
    size_t count = 0;

    ~SpareAreas() {
        while (count > 0)
            PelmTest_ReleaseArea(&list[--count]);
    }
};

thread_local SpareAreas spare;

uint8_t *take(PelmTestArea &area, size_t size, size_t &before) {
    if (spare.count > 0) area = spare.list[--spare.count];
    return PelmTest_TakeArea(&area, size + before, PELM_TEST_AREA_AT_END);
}

void give_back(PelmTestArea &area, uint8_t *) {
    if (spare.count < SpareAreas::most)
        spare.list[spare.count++] = area;
    else
        PelmTest_ReleaseArea(&area);
}

bool is_intact_round(const PelmTestArea &area) {
    return PelmTest_AreaIsIntact(&area) != 0;
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
    return std::all_of(start_, start_ + before_, [](uint8_t byte) { return byte == canary; }) && is_intact_round(area_);
}

} // namespace pelm::fuzz

#include "fuzz/account.h"

#include <cstdio>
#include <cstdlib>

namespace pelm::fuzz {
namespace {

constexpr uint64_t everything = UINT64_MAX;
constexpr uint64_t most_for_a_still_gif = 464u << 10;

bool is_bmp_header_refused(const Plan &plan) {
    if (plan.file.size() <= 14) return false;
    const uint8_t size = plan.file[14];
    return size != 12 && size != 40 && (size < 56 || size > 64);
}

bool begins_with_bm(const Plan &plan) {
    return plan.file.size() >= 2 && plan.file[0] == 'B' && plan.file[1] == 'M';
}

} // namespace

void give_reason(const char *what) {
    fprintf(stderr, "Broken promise: %s\n", what);
    abort();
}

void check(const Call &call, bool holds, const char *what) {
    if (holds) return;
    fprintf(stderr, "Broken promise: %s %s\n", call.name, what);
    abort();
}

Account::Account(const Plan &plan, int32_t filling) : plan_(plan) {
    PelmTest_Reset();
    *PelmTest_Faults() = plan.faults;
    PelmTest_Faults()->filling = filling;
    PelmTest_SetObserver(observe, this);
}

Account::~Account() {
    PelmTest_SetObserver(nullptr, nullptr);
    PelmTest_Reset();
}

// Reading must end, whatever the file says: at most a few times all of it in one call.
void Account::observe(void *account, const PelmTestCall *call) {
    Account &self = *static_cast<Account *>(account);
    if (call->served == 0) return;
    if (call->violation != nullptr) give_reason(call->violation);
    if (call->service != PELM_TEST_READ) return;
    const uint64_t file = self.plan_.file.size();
    self.came_short_ |= call->result < call->amount;
    self.bytes_read_ += call->result > 0 ? static_cast<uint64_t>(call->result) : 0;
    if (++self.reads_ > 2000 + 8 * file) give_reason("reads without end");
    if (self.bytes_read_ > (1u << 20) + 8 * file) give_reason("reads the file again and again");
}

void Account::begin_call() {
    const PelmTestCounters &now = *PelmTest_Counters();
    live_before_ = now.liveBlocks;
    stops_before_ = now.stops;
    failed_before_ = now.failedAllocations;
    reads_ = bytes_read_ = 0;
    came_short_ = false;
}

uint64_t Account::stated_leak(const Call &call, const Ending &ending) const {
    const bool failed = ending.result == PELM_RESULT_FAILED;
    switch (call.leaks) {
    case Leaks::nothing: return 0;
    case Leaks::broken_gif: return failed && !ending.found_an_image ? everything : 0;
    case Leaks::read_buffer:
        return plan_.kind == PELM_SOURCE_STREAM_ALT || plan_.kind == PELM_SOURCE_SEQUENTIAL ||
                       PelmTest_Counters()->failedAllocations != failed_before_
                   ? 1
                   : 0;
    case Leaks::refused_bmp:
        if (!failed) return 0;
        return came_short_ ? 2 : is_bmp_header_refused(plan_) ? 1 : 0;
    case Leaks::unsigned_bmp: return failed && (came_short_ || !begins_with_bm(plan_)) ? 1 : 0;
    case Leaks::all: return everything;
    }
    return 0;
}

void Account::end_call(const Call &call, const Ending &ending) {
    const PelmTestCounters &now = *PelmTest_Counters();
    check(call, plan_.format != Format::png || now.stops == stops_before_ || ending.result == PELM_RESULT_FAILED,
          "went on although it was told to stop");
    const bool is_by_itself = call.progress == Progress::whole || call.progress == Progress::needs_idle;
    const uint64_t owned = is_by_itself ? live_before_ : lost_;
    if (!is_by_itself && !ending.idle) return;
    check(call, now.liveBlocks >= owned, "freed what it had lost");
    const uint64_t leaked = now.liveBlocks - owned;
    check(call, leaked <= stated_leak(call, ending), "leaks");
    lost_ += leaked;
}

void Account::end() {
    PelmTest_CheckBlocks();
    if (PelmTest_Violation() != nullptr) give_reason(PelmTest_Violation());
    const PelmTestCounters &now = *PelmTest_Counters();
    if (plan_.format != Format::bmp && now.liveBlocks != lost_) give_reason("a decode that was given up leaks");
    if (plan_.format == Format::gif && plan_.most_calls != 1 && now.peakBytes > most_for_a_still_gif)
        give_reason("a still GIF took more memory than the documents say");
}

} // namespace pelm::fuzz

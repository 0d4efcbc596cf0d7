// Stopping and pausing.
#include "host/testing/account.h"

namespace pelm::host_testing {
namespace {

// The status of a poll that was told to pause and has not slept yet; 0: none.
constinit thread_local int32_t pause_due = 0;

} // namespace

void reset_polls() {
    pause_due = 0;
}

} // namespace pelm::host_testing

using namespace pelm::host_testing;

void ZOTARPELM_CheckExStatus(int32_t *status) {
    Call call({PELM_TEST_POLL, 0, nullptr, nullptr, 0, 0, 0, 0, nullptr});
    PelmTestCounters &counters = account().counters;
    const PelmTestFaults &faults = account().faults;
    const uint64_t number = ++counters.polls;
    if (pause_due != 0) call.violate("did not pause when asked to");
    pause_due = 0;
    *status = 0;
    if (struck(number, faults.stoppingPoll, faults.stoppingPollsFrom)) {
        ++counters.stops;
        *status = faults.stoppingStatus;
    } else if (struck(number, faults.pausingPoll, faults.pausingPollsFrom)) {
        ++counters.pauses;
        *status = pause_due = faults.pausingStatus;
    }
    call.record.result = *status;
}

void ZOTARPELM_OsSleep(int32_t status) {
    Call call({PELM_TEST_SLEEP, 0, nullptr, nullptr, status, 0, 0, 0, nullptr});
    ++account().counters.sleeps;
    if (pause_due == 0 || status != pause_due) call.violate("paused without being asked to, or by another value");
    pause_due = 0;
}

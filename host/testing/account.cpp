// The account of each thread, and what tests see of it.
#include "host/testing/account.h"

namespace pelm::host_testing {
namespace {

constexpr PelmTestFaults well_behaved() {
    PelmTestFaults faults{};
    faults.largestBlock = 64u << 20;
    faults.filling = 0xA5;
    faults.failingReadResult = -1;
    faults.mostPerRead = 1;
    faults.stoppingStatus = -1;
    faults.pausingStatus = 1;
    return faults;
}

constinit thread_local Account this_thread{well_behaved(), {}, nullptr, nullptr, nullptr};

void tell_observer(const PelmTestCall &call) {
    const Account &account = this_thread;
    if (account.observer != nullptr) account.observer(account.user, &call);
}

} // namespace

Account &account() {
    return this_thread;
}

Call::Call(const PelmTestCall &call) : record(call) {
    tell_observer(record);
}

Call::~Call() {
    record.served = 1;
    tell_observer(record);
}

void Call::violate(const char *text) {
    record.violation = text;
    count_violation(text);
}

void count_violation(const char *text) {
    Account &account = this_thread;
    ++account.counters.violations;
    if (account.violation == nullptr) account.violation = text;
}

} // namespace pelm::host_testing

using pelm::host_testing::account;

PelmTestFaults *PelmTest_Faults(void) {
    return &account().faults;
}

const PelmTestCounters *PelmTest_Counters(void) {
    return &account().counters;
}

const char *PelmTest_Violation(void) {
    return account().violation;
}

void PelmTest_SetObserver(PelmTestObserver observer, void *user) {
    account().observer = observer;
    account().user = user;
}

void PelmTest_Reset(void) {
    pelm::host_testing::release_blocks();
    pelm::host_testing::reset_polls();
    account().faults = pelm::host_testing::well_behaved();
    account().counters = PelmTestCounters{};
    account().violation = nullptr;
}

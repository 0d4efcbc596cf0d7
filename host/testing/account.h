// What the test host knows of the calling thread: faults to come, counters, and who looks on.
#pragma once

#include "PelmHostTesting.h"

namespace pelm::host_testing {

struct Account {
    PelmTestFaults faults;
    PelmTestCounters counters;
    const char *violation; // the first one
    PelmTestObserver observer;
    void *user;
};

Account &account();

// Whether the call of this number is the one, or among those from `from` on. Numbers count from 1; 0 is never.
inline bool struck(uint64_t number, uint32_t one, uint32_t from) {
    return number == one || (from != 0 && number >= from);
}

// One call of a service: tells the observer before it is served and, with its result, afterwards.
class Call {
public:
    explicit Call(const PelmTestCall &call);
    ~Call();
    Call(const Call &) = delete;
    Call &operator=(const Call &) = delete;

    PelmTestCall record;
    // Counts it, and lets the observer know.
    void violate(const char *text);
};

void count_violation(const char *text);

// Frees all blocks and forgets them.
void release_blocks();

// Forgets a pause that was asked for.
void reset_polls();

} // namespace pelm::host_testing

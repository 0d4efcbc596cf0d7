// What a session may take from its host and what it has to give back.
#pragma once

#include "fuzz/calls.h"

namespace pelm::fuzz {

// Ends the program.
[[noreturn]] void give_reason(const char *what);

// Ends the program, naming the call, unless it holds.
void check(const Call &call, bool holds, const char *what);

// How a call ended.
struct Ending {
    int32_t result;
    bool idle;           // no decode is in progress
    bool found_an_image; // GIF: the walk came to it
};

class Account {
public:
    Account(const Plan &plan, int32_t filling);
    ~Account();
    Account(const Account &) = delete;
    Account &operator=(const Account &) = delete;

    void begin_call();
    void end_call(const Call &call, const Ending &ending);
    // The last decode has been given up.
    void end();

private:
    static void observe(void *account, const PelmTestCall *call);
    uint64_t stated_leak(const Call &call, const Ending &ending) const;

    const Plan &plan_;
    uint64_t lost_ = 0; // blocks that nothing can free, as the header says

    // Of the call in progress.
    uint64_t live_before_ = 0, stops_before_ = 0, failed_before_ = 0;
    uint64_t reads_ = 0, bytes_read_ = 0;
    bool came_short_ = false; // a read
};

} // namespace pelm::fuzz

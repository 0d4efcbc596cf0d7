// What a session may take from its host and what it has to give back.
#pragma once

#include <cstdint>
#include <vector>

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
    bool told_the_size;  // GIF: the header was right, and there was memory
};

// An allocation or a read, as it was served.
struct Service {
    uint32_t call; // of the session, from 0
    bool is_read;
    int32_t amount; // asked for
    int32_t result; // bytes delivered; of an allocation 1, or 0 when it failed
    bool at_end;    // of a read: nothing was left to deliver
};

class Account {
public:
    Account(const Plan &plan, int32_t filling);
    ~Account();
    Account(const Account &) = delete;
    Account &operator=(const Account &) = delete;

    void begin_call(bool was_idle);
    // `pixels`: of the scaled image.
    void end_call(const Call &call, const Ending &ending, uint64_t pixels);
    // The last decode has been given up.
    void end();

    // Of all calls, when the plan asks for it.
    const std::vector<Service> &services() const { return services_; }

private:
    static void observe(void *account, const PelmTestCall *call);
    void note(const PelmTestCall &call);
    bool is_refused_bmp() const;
    bool is_broken_gif(const Ending &ending, uint64_t leaked, uint64_t freed) const;
    uint64_t blocks_but_palette(const Call &call, uint64_t held, uint64_t freed) const;
    // In blocks.
    bool is_stated_leak(const Call &call, const Ending &ending, uint64_t leaked, uint64_t freed) const;
    void look_at_work(const Call &call, uint64_t pixels) const;

    const Plan &plan_;
    std::vector<Service> services_;
    uint32_t calls_ = 0;
    uint64_t lost_ = 0; // blocks that nothing can free, as the header says

    // Of the call in progress.
    PelmTestCounters before_{};
    bool was_idle_ = true;
    uint64_t allocated_ = 0, bytes_allocated_ = 0;      // by successful allocations
    bool has_no_first_ = false, has_no_second_ = false; // of them: they failed
    uint64_t reads_ = 0, bytes_read_ = 0;
    bool came_short_ = false;   // the last read
    bool knows_screen_ = false; // GIF: a read delivered the sides
};

} // namespace pelm::fuzz

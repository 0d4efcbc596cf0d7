// The control: its record, its lifetime, and which one applies to the calling thread. What is limited, counted and
// stopped by it is decided in memory.cpp, stop.cpp and status.cpp.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>

#include <pthread.h>

#include "PelmHost.h"

// Alive while anything refers to it: the application's handle, each place where it is installed, each live block, and
// each service call that is looking at it. `lock` guards every field below it; no callback runs under it.
struct PelmHostControl {
    std::atomic<size_t> references{1};
    std::atomic<bool> cancelled{false}; // outside the lock: set by signal handlers
    mutable pthread_mutex_t lock = PTHREAD_MUTEX_INITIALIZER;

    uint64_t live_limit = 0; // bytes; 0: none
    uint64_t block_limit = 0;
    int64_t deadline_ns = 0; // on the monotonic clock; 0: none
    PelmHostProgress progress = nullptr;
    void *progress_user = nullptr;
    PelmHostCounters counters{};
};

namespace pelm::host {

void retain(PelmHostControl &control);
void drop(PelmHostControl &control);

class Locked {
public:
    explicit Locked(const PelmHostControl &control) : lock_(control.lock) { pthread_mutex_lock(&lock_); }
    ~Locked() { pthread_mutex_unlock(&lock_); }
    Locked(const Locked &) = delete;
    Locked &operator=(const Locked &) = delete;

private:
    pthread_mutex_t &lock_;
};

// The control that applies to the calling thread, kept alive for the length of a service call: another thread or a
// callback may uninstall and release it meanwhile. Converts to NULL when there is none.
class HeldControl {
public:
    HeldControl();
    ~HeldControl() {
        if (control_ != nullptr) drop(*control_);
    }
    HeldControl(const HeldControl &) = delete;
    HeldControl &operator=(const HeldControl &) = delete;

    PelmHostControl *get() const { return control_; }

private:
    PelmHostControl *control_;
};

} // namespace pelm::host

// Cancellation and the deadline: how the application asks for a stop. Those who obey are the poll (status.cpp), the
// reads of stream sources (read.cpp, feed.cpp, file.cpp) and the openers that read everything (spool.cpp).
#include "host/stop.h"

#include <cerrno>
#include <ctime>

#include "host/control.h"

namespace pelm::host {
namespace {

// PelmHost_Cancel stores from signal handlers.
static_assert(std::atomic<bool>::is_always_lock_free);

bool deadline_passed(const PelmHostControl &control) {
    const Locked locked(control);
    return control.deadline_ns != 0 && monotonic_ns() >= control.deadline_ns;
}

} // namespace

int64_t monotonic_ns() {
    timespec now{};
    clock_gettime(CLOCK_MONOTONIC, &now);
    return int64_t{now.tv_sec} * 1'000'000'000 + now.tv_nsec;
}

int stop_reason(const PelmHostControl *control) {
    if (control == nullptr) return 0;
    if (control->cancelled.load(std::memory_order_acquire)) return ECANCELED;
    return deadline_passed(*control) ? ETIMEDOUT : 0;
}

} // namespace pelm::host

void PelmHost_Cancel(PelmHostControl *control) {
    if (control != nullptr) control->cancelled.store(true, std::memory_order_release);
}

void PelmHost_Resume(PelmHostControl *control) {
    if (control != nullptr) control->cancelled.store(false, std::memory_order_release);
}

void PelmHost_SetDeadline(PelmHostControl *control, uint32_t milliseconds) {
    if (control == nullptr) return;
    const int64_t now = pelm::host::monotonic_ns();
    const pelm::host::Locked locked(*control);
    control->deadline_ns = milliseconds == 0 ? 0 : now + int64_t{milliseconds} * 1'000'000;
}

int PelmHost_StopReason(const PelmHostControl *control) {
    return pelm::host::stop_reason(control);
}

#include "tools/interrupt.h"

#include <atomic>
#include <csignal>

#include <sys/time.h>

#include "tools/failure.h"

namespace pelm_tool {
namespace {

volatile std::sig_atomic_t caught_signal = 0;
std::atomic<PelmHostControl *> running{nullptr};
static_assert(std::atomic<PelmHostControl *>::is_always_lock_free, "used in a signal handler");

void on_signal(int number) {
    caught_signal = number;
    PelmHostControl *const control = running.load();
    if (control != nullptr) PelmHost_Cancel(control);
}

void on_wake_up(int) {}

// Without SA_RESTART: a read or write that waits for a slow pipe comes back.
void catch_signal(int number, void (*handler)(int)) {
    struct sigaction action = {};
    action.sa_handler = handler;
    sigemptyset(&action.sa_mask);
    sigaction(number, &action, nullptr);
}

void wake_up_every(suseconds_t microseconds) {
    const timeval interval = {0, microseconds};
    const itimerval timer = {interval, interval};
    setitimer(ITIMER_REAL, &timer, nullptr);
}

} // namespace

void catch_interrupts() {
    catch_signal(SIGINT, on_signal);
    catch_signal(SIGTERM, on_signal);
    catch_signal(SIGALRM, on_wake_up);
    // A reader that went away is an error of the write, told like any other.
    std::signal(SIGPIPE, SIG_IGN);
}

void cancel_on_interrupt(PelmHostControl *control) {
    running.store(control);
    // The signal may have come before the store.
    if (control != nullptr && interrupted()) PelmHost_Cancel(control);
}

bool interrupted() {
    return caught_signal != 0;
}

void throw_if_interrupted() {
    if (interrupted()) throw Failure("interrupted");
}

WakeUps::WakeUps() {
    wake_up_every(50'000);
}

WakeUps::~WakeUps() {
    wake_up_every(0);
}

void end_by_interrupt() {
    const int number = caught_signal;
    if (number == 0) return;
    std::signal(number, SIG_DFL);
    std::raise(number);
}

} // namespace pelm_tool

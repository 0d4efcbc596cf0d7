#include "tests/sweeps/at_fault.h"

#include <signal.h>
#include <unistd.h>

#include <cstdio>
#include <iterator>

#if defined(__has_feature)
#if __has_feature(address_sanitizer)
extern "C" void __sanitizer_set_death_callback(void (*callback)());
#define PELM_HAS_DEATH_CALLBACK 1
#endif
#endif

namespace pelm::sweeps {
namespace {

constexpr int signals[] = {SIGABRT, SIGSEGV, SIGBUS, SIGFPE, SIGILL};
struct sigaction former[std::size(signals)];
std::function<std::string()> description;

void describe() {
    const auto now = std::move(description); // at most once
    description = nullptr;
    if (!now) return;
    alarm(10); // the heap may be what is broken
    fprintf(stderr, "At %s\n", now().c_str());
}

void set_back() {
    for (size_t i = 0; i < std::size(signals); ++i)
        sigaction(signals[i], &former[i], nullptr);
}

// The instruction that failed comes again, for whoever looked at such signals before.
void at_signal(int number) {
    describe();
    set_back();
    if (number == SIGABRT) raise(number);
}

} // namespace

AtFault::AtFault(std::function<std::string()> describe_it) {
    description = std::move(describe_it);
    struct sigaction action = {};
    action.sa_handler = at_signal;
    for (size_t i = 0; i < std::size(signals); ++i)
        sigaction(signals[i], &action, &former[i]);
#if defined(PELM_HAS_DEATH_CALLBACK)
    __sanitizer_set_death_callback(describe);
#endif
}

AtFault::~AtFault() {
    description = nullptr;
    set_back();
}

} // namespace pelm::sweeps

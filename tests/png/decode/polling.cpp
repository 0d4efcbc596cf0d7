#include "tests/png/decode/polling.h"

namespace pelm::test {

Polling &Polling::get() {
    static Polling polling;
    return polling;
}

} // namespace pelm::test

using pelm::test::Polling;

extern "C" {

void __wrap_ZOTARPELM_CheckExStatus(int32_t *status);
void __wrap_ZOTARPELM_OsSleep(int32_t value);

void __wrap_ZOTARPELM_CheckExStatus(int32_t *status) {
    Polling &polling = Polling::get();
    const size_t number = static_cast<size_t>(polling.polls++);
    if (polling.at_poll) polling.at_poll(polling.polls);
    *status = number < polling.statuses.size() ? polling.statuses[number] : 0;
}

void __wrap_ZOTARPELM_OsSleep(int32_t value) {
    Polling &polling = Polling::get();
    polling.sleeps.push_back({polling.polls, value});
}

} // extern "C"

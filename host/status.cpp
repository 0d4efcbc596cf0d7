// The poll and the pause, and the progress callback that both the poll and the reads of stream sources ask.
#include "host/status.h"

#include <algorithm>
#include <ctime>

#include "host/control.h"
#include "host/stop.h"

namespace pelm::host {
namespace {

void sleep_ns(int64_t duration) {
    // A signal may end it early; the caller looks at the clock anyway.
    const timespec wait{static_cast<time_t>(duration / 1'000'000'000), static_cast<long>(duration % 1'000'000'000)};
    nanosleep(&wait, nullptr);
}

} // namespace

int32_t ask_progress(PelmHostControl *control, const InputSource *source) {
    if (control == nullptr) return 0;
    PelmHostProgress progress = nullptr;
    void *user = nullptr;
    {
        const Locked locked(*control); // both words of one PelmHost_SetProgress call
        progress = control->progress;
        user = control->progress_user;
    }
    if (progress == nullptr) return 0;
    const int32_t answer = progress(user, source);
    if (answer < 0) PelmHost_Cancel(control);
    return answer;
}

} // namespace pelm::host

[[gnu::weak]] void ZOTARPELM_CheckExStatus(int32_t *status) {
    if (status == nullptr) return;
    const pelm::host::HeldControl control;
    const bool stopped = pelm::host::stop_reason(control.get()) != 0;
    *status = stopped ? -1 : pelm::host::ask_progress(control.get(), nullptr);
}

[[gnu::weak]] void ZOTARPELM_OsSleep(int32_t status) {
    const pelm::host::HeldControl control;
    const int64_t end = pelm::host::monotonic_ns() + int64_t{status} * 1'000'000;
    const int64_t slice = int64_t{pelm::host::wait_slice_ms} * 1'000'000;
    while (pelm::host::stop_reason(control.get()) == 0) {
        const int64_t left = end - pelm::host::monotonic_ns();
        if (left <= 0) return;
        pelm::host::sleep_ns(std::min(left, slice));
    }
}

void PelmHost_SetProgress(PelmHostControl *control, PelmHostProgress progress, void *user) {
    if (control == nullptr) return;
    const pelm::host::Locked locked(*control);
    control->progress = progress;
    control->progress_user = user;
}

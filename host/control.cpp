// Creating, installing, sharing and destroying controls, and reading their counters.
#include "host/control.h"

#include <cstdlib>
#include <new>

namespace pelm::host {
namespace {

// Changed under `process_lock`, so that nobody can take hold of a control between its removal and its end. Read
// without it only to learn that there is none.
constinit std::atomic<PelmHostControl *> process_control{nullptr};
constinit pthread_mutex_t process_lock = PTHREAD_MUTEX_INITIALIZER;

// A plain pointer on purpose: a destructor at thread exit would need the C++ runtime.
constinit thread_local PelmHostControl *thread_control = nullptr;

PelmHostControl *hold_process_control() {
    if (process_control.load(std::memory_order_relaxed) == nullptr) return nullptr;
    pthread_mutex_lock(&process_lock);
    PelmHostControl *const control = process_control.load(std::memory_order_relaxed);
    if (control != nullptr) retain(*control);
    pthread_mutex_unlock(&process_lock);
    return control;
}

PelmHostControl *hold_current_control() {
    if (thread_control == nullptr) return hold_process_control();
    retain(*thread_control);
    return thread_control;
}

} // namespace

void retain(PelmHostControl &control) {
    control.references.fetch_add(1, std::memory_order_relaxed);
}

void drop(PelmHostControl &control) {
    if (control.references.fetch_sub(1, std::memory_order_acq_rel) != 1) return;
    pthread_mutex_destroy(&control.lock);
    free(&control);
}

HeldControl::HeldControl() : control_(hold_current_control()) {}

} // namespace pelm::host

PelmHostControl *PelmHost_NewControl(void) {
    void *const memory = malloc(sizeof(PelmHostControl));
    return memory == nullptr ? nullptr : new (memory) PelmHostControl;
}

void PelmHost_ReleaseControl(PelmHostControl *control) {
    if (control != nullptr) pelm::host::drop(*control);
}

void PelmHost_UseForProcess(PelmHostControl *control) {
    if (control != nullptr) pelm::host::retain(*control);
    pthread_mutex_lock(&pelm::host::process_lock);
    PelmHostControl *const previous = pelm::host::process_control.exchange(control, std::memory_order_relaxed);
    pthread_mutex_unlock(&pelm::host::process_lock);
    if (previous != nullptr) pelm::host::drop(*previous);
}

void PelmHost_UseForThread(PelmHostControl *control) {
    if (control != nullptr) pelm::host::retain(*control);
    PelmHostControl *const previous = pelm::host::thread_control;
    pelm::host::thread_control = control;
    if (previous != nullptr) pelm::host::drop(*previous);
}

void PelmHost_GetCounters(const PelmHostControl *control, PelmHostCounters *counters) {
    if (counters == nullptr) return;
    *counters = {};
    if (control == nullptr) return;
    const pelm::host::Locked locked(*control);
    *counters = control->counters;
}

// Ctrl-C and termination: asks the running decode to stop and is remembered, so that the tool tidies up before it ends.
#pragma once

#include "PelmHost.h"

namespace pelm_tool {

void catch_interrupts();

// The control whose decode an interrupt cancels; nullptr for none. It must stay alive until it is replaced.
void cancel_on_interrupt(PelmHostControl *control);

bool interrupted();
void throw_if_interrupted(); // Failure

// While one lives, system calls that wait come back now and then, so that the host library notices a deadline even
// where standard input stands still.
class WakeUps {
public:
    WakeUps();
    ~WakeUps();
    WakeUps(const WakeUps &) = delete;
    WakeUps &operator=(const WakeUps &) = delete;
};

// Ends the process by the signal that came, as the shell expects of an interrupted command. Returns when none came.
void end_by_interrupt();

} // namespace pelm_tool

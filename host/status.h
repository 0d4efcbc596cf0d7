// The application's progress callback, as polls and reads ask it.
#pragma once

#include "PelmHost.h"

namespace pelm::host {

// What the callback answers; 0 without a control or a callback. A negative answer cancels the control. `source` is
// NULL at a poll.
int32_t ask_progress(PelmHostControl *control, const InputSource *source);

} // namespace pelm::host

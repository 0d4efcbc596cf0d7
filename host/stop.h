// Whether the decodes under a control are to stop: cancellation and the deadline.
#pragma once

#include "PelmHost.h"

#include <cstdint>

namespace pelm::host {

// How long a wait may last before it looks at the control again.
inline constexpr int wait_slice_ms = 50;

int64_t monotonic_ns();

// 0, ECANCELED or ETIMEDOUT; 0 for NULL.
int stop_reason(const PelmHostControl *control);

} // namespace pelm::host

// Reading a descriptor or a stdio stream front to back, in full: short reads, interruptions and waits end here.
#pragma once

#include <cstdint>
#include <cstdio>

#include "PelmHost.h"

namespace pelm::host {

// Why a fetch gave back control.
enum class FetchEnd : uint8_t {
    full,    // everything asked for is there
    ended,   // the data ended first
    failed,  // the read failed first
    stopped, // the control asked for a stop first
};

struct Fetched {
    int32_t count; // bytes delivered, whatever the end
    FetchEnd end;
    int error; // errno value when failed, ECANCELED or ETIMEDOUT when stopped, else 0
};

// Borrowed. Exactly one of the two is set.
struct Feed {
    FILE *stream;   // or NULL
    int descriptor; // open for reading; looked at when `stream` is NULL
};

Fetched fetch_from_feed(const Feed &feed, void *destination, int32_t count, const PelmHostControl *control);

} // namespace pelm::host

// One decode under the limits that the user set: from an open input to a picture, or to the reason why not.
#pragma once

#include "PelmHost.h"
#include "tools/image_formats.h"
#include "tools/input.h"
#include "tools/options.h"
#include "tools/pixels.h"
#include "tools/progress.h"

namespace pelm_tool {

// The limits and counters of one input. They hold for everything that the host does while this lives, from opening the
// input on.
class Session {
public:
    Session(const Options &options, Progress &progress);
    ~Session();
    Session(const Session &) = delete;
    Session &operator=(const Session &) = delete;

    PelmHostCounters counters() const;
    void throw_if_stopped() const; // Failure: interrupted, or the deadline has passed

private:
    PelmHostControl *control_;
};

// Throws Failure.
Picture decode(Input &input, const ImageFormat &image, const ImageDescription &description, const Options &options,
               const Session &session);

} // namespace pelm_tool

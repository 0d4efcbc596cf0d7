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
    void throw_if_stopped() const;       // Failure: interrupted, or the deadline has passed
    void throw_if_out_of_memory() const; // Failure: the decoder asked for memory and got none

    // What the progress line shows: rows of this many, as the decoder polls, instead of bytes of the input.
    void show_rows(int32_t count) { rows_shown_ = count; }
    const uint64_t &polls() const { return polls_; } // so far
    // The same for an animation of `count` frames.
    void show_frames(size_t count) { frames_shown_ = count; }
    void frames_done(size_t count);

private:
    static int32_t on_progress(void *session, const InputSource *source);

    PelmHostControl *control_;
    Progress &progress_;
    bool has_memory_limit_;
    int32_t rows_shown_ = 0; // 0: bytes
    uint64_t polls_ = 0;
    size_t frames_shown_ = 0; // 0: none
};

// What there is to say about a picture that was decoded.
struct Remarks {
    std::string shortage;           // what is missing of it; empty: nothing
    std::vector<std::string> notes; // what the user may not expect
};

struct Decoded {
    Picture picture;
    Remarks remarks;
};

// Throws Failure.
Decoded decode(Input &input, const ImageFormat &image, const ImageDescription &description, const Options &options,
               Session &session);

} // namespace pelm_tool

// How a descriptor or a stdio stream is read until the bytes are there, the data ends, a read fails or the control
// asks for a stop.
#include "host/feed.h"

#include <cerrno>

#include <poll.h>
#include <unistd.h>

#include "host/stop.h"

namespace pelm::host {
namespace {

// What one attempt gave: bytes, and why there were no more of them.
struct Attempt {
    int32_t count;
    bool ended;
    int error; // 0, EINTR and EAGAIN: worth another attempt
};

// Waits for at most one slice. True also when a read would fail: it is for the read to say how.
bool readable(int descriptor) {
    pollfd wanted{descriptor, POLLIN, 0};
    return poll(&wanted, 1, wait_slice_ms) != 0;
}

Attempt attempt_descriptor(int descriptor, uint8_t *to, int32_t count, bool may_be_stopped) {
    // A read that blocks would keep the decode from noticing a stop.
    if (may_be_stopped && !readable(descriptor)) return {0, false, EINTR};
    const ssize_t got = read(descriptor, to, static_cast<size_t>(count));
    if (got < 0) return {0, false, errno};
    return {static_cast<int32_t>(got), got == 0, 0};
}

// Asks the stream for the end only after a short read: error and end flags from before the source was opened say
// nothing about it.
Attempt attempt_stream(FILE *stream, uint8_t *to, int32_t count) {
    errno = 0;
    const auto got = static_cast<int32_t>(fread(to, 1, static_cast<size_t>(count), stream));
    if (got == count) return {got, false, 0};
    if (feof(stream)) return {got, true, 0};
    const int error = errno != 0 ? errno : EIO;
    if (error == EINTR || error == EAGAIN) clearerr(stream);
    return {got, false, error};
}

} // namespace

Fetched fetch_from_feed(const Feed &feed, void *destination, int32_t count, const PelmHostControl *control) {
    uint8_t *const to = static_cast<uint8_t *>(destination);
    int32_t done = 0;
    while (done < count) {
        if (const int reason = stop_reason(control); reason != 0) return {done, FetchEnd::stopped, reason};
        const Attempt got = feed.stream != nullptr
                                ? attempt_stream(feed.stream, to + done, count - done)
                                : attempt_descriptor(feed.descriptor, to + done, count - done, control != nullptr);
        done += got.count;
        if (got.ended) return {done, FetchEnd::ended, 0};
        if (got.error == EAGAIN) {
            readable(feed.stream != nullptr ? fileno(feed.stream) : feed.descriptor);
        } else if (got.error != 0 && got.error != EINTR) {
            return {done, FetchEnd::failed, got.error};
        }
    }
    return {done, FetchEnd::full, 0};
}

} // namespace pelm::host

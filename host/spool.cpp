// Sources over private memory that a whole file or the rest of a stream was read into.
#include <algorithm>
#include <cerrno>
#include <cstdlib>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "host/control.h"
#include "host/source.h"
#include "host/stop.h"

namespace pelm::host {
namespace {

constexpr int32_t first_capacity = 65536; // when the size is not known beforehand

// 0 <= size <= capacity <= limit.
struct Spool {
    uint8_t *bytes;
    int32_t size;
    int32_t capacity;
    int32_t limit;
};

bool resize(Spool &spool, int32_t capacity) {
    void *const bytes = realloc(spool.bytes, static_cast<size_t>(std::max(capacity, 1)));
    if (bytes == nullptr) return false;
    spool.bytes = static_cast<uint8_t *>(bytes);
    spool.capacity = capacity;
    return true;
}

bool grow(Spool &spool) {
    const int64_t doubled = std::max<int64_t>(int64_t{spool.capacity} * 2, first_capacity);
    return resize(spool, static_cast<int32_t>(std::min<int64_t>(doubled, spool.limit)));
}

// Once the memory is full, one more byte tells whether the data goes on: a size that was known beforehand then costs
// neither a second block nor a wrong EFBIG at exactly the limit. 0 with a larger spool, or with `ended` set.
int step_past_capacity(Spool &spool, const Feed &feed, const PelmHostControl *control, bool &ended) {
    uint8_t extra = 0;
    const Fetched got = fetch_from_feed(feed, &extra, 1, control);
    ended = got.end == FetchEnd::ended;
    if (got.end != FetchEnd::full) return got.error;
    if (spool.size == spool.limit) return EFBIG;
    if (!grow(spool)) return ENOMEM;
    spool.bytes[spool.size++] = extra;
    return 0;
}

int fill(Spool &spool, const Feed &feed, const PelmHostControl *control) {
    bool ended = false;
    int error = 0;
    while (error == 0 && !ended) {
        if (spool.size == spool.capacity) {
            error = step_past_capacity(spool, feed, control, ended);
        } else {
            const Fetched got = fetch_from_feed(feed, spool.bytes + spool.size, spool.capacity - spool.size, control);
            spool.size += got.count;
            ended = got.end == FetchEnd::ended;
            error = got.error;
        }
    }
    return error;
}

// Bytes from where the feed stands to the end of its regular file; 0 when that cannot be told, as for pipes and for
// the files of /proc.
int64_t expected_size(const Feed &feed) {
    const int descriptor = feed.stream != nullptr ? fileno(feed.stream) : feed.descriptor;
    struct stat about {};
    if (descriptor < 0 || fstat(descriptor, &about) != 0 || !S_ISREG(about.st_mode)) return 0;
    const off_t position = feed.stream != nullptr ? ftello(feed.stream) : lseek(descriptor, 0, SEEK_CUR);
    return position < 0 ? 0 : std::max<int64_t>(int64_t{about.st_size} - position, 0);
}

// On failure nothing is left allocated.
int spool_all(Spool &spool, const Feed &feed, const PelmHostControl *control) {
    const int64_t expected = expected_size(feed);
    if (expected > spool.limit) return EFBIG;
    const auto capacity = expected > 0 ? static_cast<int32_t>(expected) : std::min(first_capacity, spool.limit);
    if (!resize(spool, capacity)) return ENOMEM;
    const int error = fill(spool, feed, control);
    if (error != 0) {
        free(spool.bytes);
        return error;
    }
    // Without the trim nothing is lost but memory.
    if (spool.size < spool.capacity) resize(spool, spool.size);
    return 0;
}

int open_spooled(InputSource &source, uint32_t kind, const Feed &feed, int32_t limit, const PelmHostControl *control) {
    Spool spool{nullptr, 0, 0, limit > 0 ? limit : INT32_MAX};
    if (const int error = spool_all(spool, feed, control); error != 0) return error;
    SourceContext context;
    context.backing = Backing::bytes;
    context.owned = true;
    context.bytes = spool.bytes;
    context.size = spool.size;
    return open_source(source, kind, context, 0);
}

// A descriptor, or a negative errno value. A pipe waits here for its writer, and a signal may end that wait.
int open_for_reading(const char *path, const PelmHostControl *control) {
    for (;;) {
        const int descriptor = open(path, O_RDONLY | O_CLOEXEC | O_NOCTTY);
        if (descriptor >= 0) return descriptor;
        if (errno != EINTR) return -errno;
        if (const int reason = stop_reason(control); reason != 0) return -reason;
    }
}

} // namespace
} // namespace pelm::host

int PelmHost_OpenFileInMemory(InputSource *source, uint32_t kind, const char *path, int32_t limit) {
    if (source == nullptr) return EINVAL;
    *source = {};
    if (path == nullptr || !pelm::host::is_source_kind(kind)) return EINVAL;
    const pelm::host::HeldControl control;
    const int descriptor = pelm::host::open_for_reading(path, control.get());
    if (descriptor < 0) return -descriptor;
    const int error = pelm::host::open_spooled(*source, kind, {nullptr, descriptor}, limit, control.get());
    close(descriptor);
    return error;
}

int PelmHost_OpenSpooled(InputSource *source, uint32_t kind, FILE *stream, int32_t limit) {
    if (source == nullptr) return EINVAL;
    *source = {};
    if (stream == nullptr || !pelm::host::is_source_kind(kind)) return EINVAL;
    const pelm::host::HeldControl control;
    return pelm::host::open_spooled(*source, kind, {stream, -1}, limit, control.get());
}

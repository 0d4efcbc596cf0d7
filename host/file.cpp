// Sources over regular files, read in place at any position.
#include <cerrno>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "host/source.h"
#include "host/stop.h"

namespace pelm::host {
namespace {

// 0 and the size, or why the descriptor cannot be a seekable source.
int regular_file_size(int descriptor, int32_t &size) {
    struct stat about {};
    if (fstat(descriptor, &about) != 0) return errno;
    if (!S_ISREG(about.st_mode)) return ESPIPE; // replaced since it was looked at
    if (about.st_size > INT32_MAX) return EFBIG;
    size = static_cast<int32_t>(about.st_size);
    return 0;
}

// A descriptor, or a negative errno value. Looks before it opens: to open a pipe and close it again would break its
// writer, and the application could no longer read it in another way.
int open_regular_file(const char *path) {
    struct stat about {};
    if (stat(path, &about) != 0) return -errno;
    if (!S_ISREG(about.st_mode)) return -ESPIPE;
    const int descriptor = open(path, O_RDONLY | O_CLOEXEC | O_NOCTTY | O_NONBLOCK);
    return descriptor < 0 ? -errno : descriptor;
}

} // namespace

Fetched fetch_from_file(int descriptor, int32_t position, void *destination, int32_t count,
                        const PelmHostControl *control) {
    uint8_t *const to = static_cast<uint8_t *>(destination);
    int32_t done = 0;
    while (done < count) {
        if (const int reason = stop_reason(control); reason != 0) return {done, FetchEnd::stopped, reason};
        const ssize_t got = pread(descriptor, to + done, static_cast<size_t>(count - done), off_t{position} + done);
        if (got == 0) return {done, FetchEnd::ended, 0}; // the file became shorter
        if (got < 0 && errno != EINTR) return {done, FetchEnd::failed, errno};
        if (got > 0) done += static_cast<int32_t>(got);
    }
    return {done, FetchEnd::full, 0};
}

} // namespace pelm::host

int PelmHost_OpenFile(InputSource *source, const char *path, int32_t bufferSize) {
    if (source == nullptr) return EINVAL;
    *source = {};
    if (path == nullptr) return EINVAL;
    const int descriptor = pelm::host::open_regular_file(path);
    if (descriptor < 0) return -descriptor;
    pelm::host::SourceContext context;
    context.backing = pelm::host::Backing::file;
    context.owned = true;
    context.descriptor = descriptor;
    const int error = pelm::host::regular_file_size(descriptor, context.size);
    if (error != 0) {
        close(descriptor);
        return error;
    }
    return pelm::host::open_source(*source, PELM_SOURCE_STREAM, context, bufferSize);
}

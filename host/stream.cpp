// Sequential sources over streams and descriptors that the caller keeps.
#include <cerrno>

#include <fcntl.h>

#include "host/source.h"

namespace pelm::host {
namespace {

int open_feed(InputSource &source, const Feed &feed, int32_t buffer_size) {
    SourceContext context;
    context.backing = Backing::feed;
    context.feed = feed;
    context.size = INT32_MAX;
    return open_source(source, PELM_SOURCE_SEQUENTIAL, context, buffer_size);
}

} // namespace
} // namespace pelm::host

int PelmHost_OpenStream(InputSource *source, FILE *stream, int32_t bufferSize) {
    if (source == nullptr) return EINVAL;
    *source = {};
    if (stream == nullptr) return EINVAL;
    return pelm::host::open_feed(*source, {stream, -1}, bufferSize);
}

int PelmHost_OpenDescriptor(InputSource *source, int descriptor, int32_t bufferSize) {
    if (source == nullptr) return EINVAL;
    *source = {};
    const int mode = fcntl(descriptor, F_GETFL);
    if (mode < 0) return errno;
    if ((mode & O_ACCMODE) == O_WRONLY) return EBADF;
    return pelm::host::open_feed(*source, {nullptr, descriptor}, bufferSize);
}

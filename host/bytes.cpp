// Sources over bytes that the caller keeps.
#include <cerrno>

#include "host/source.h"

int PelmHost_OpenMemory(InputSource *source, uint32_t kind, void *bytes, int32_t size) {
    if (source == nullptr) return EINVAL;
    *source = {};
    if (bytes == nullptr || size < 0 || !pelm::host::is_source_kind(kind)) return EINVAL;
    pelm::host::SourceContext context;
    context.backing = pelm::host::Backing::bytes;
    context.bytes = static_cast<uint8_t *>(bytes);
    context.size = size;
    return pelm::host::open_source(*source, kind, context, 0);
}

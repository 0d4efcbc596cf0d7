// The life of a source, from the filled record to the released one.
#include "host/source.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <new>

#include <unistd.h>

namespace pelm::host {
namespace {

SourceContext *context_of(const InputSource &source) {
    return static_cast<SourceContext *>(source.hostContext);
}

void release_owned(const SourceContext &context) {
    if (!context.owned) return;
    if (context.backing == Backing::file) {
        close(context.descriptor);
    } else {
        free(context.bytes);
    }
}

} // namespace

bool is_source_kind(uint32_t kind) {
    return kind == PELM_SOURCE_STREAM || kind == PELM_SOURCE_MEMORY || kind == PELM_SOURCE_STREAM_ALT ||
           kind == PELM_SOURCE_SEQUENTIAL;
}

int open_source(InputSource &source, uint32_t kind, const SourceContext &context, int32_t buffer_size) {
    void *const memory = malloc(sizeof(SourceContext));
    if (memory == nullptr) {
        release_owned(context);
        return ENOMEM;
    }
    source.hostContext = new (memory) SourceContext(context);
    source.kind = kind;
    source.data = kind == PELM_SOURCE_MEMORY ? context.bytes : nullptr;
    source.size = context.size;
    source.bufferSize = buffer_size > 0 ? buffer_size : int32_t{PELM_HOST_BUFFER_SIZE};
    return 0;
}

int32_t data_size(const InputSource &source) {
    if (source.kind == PELM_SOURCE_MEMORY) return source.data == nullptr ? 0 : std::max(source.size, 0);
    return source.hostContext == nullptr ? 0 : context_of(source)->size;
}

void set_position(InputSource &source, int32_t position) {
    source.hostPosition = position;
    source.consumed = position;
}

int32_t current_position(InputSource &source) {
    set_position(source, std::clamp(source.hostPosition, 0, data_size(source)));
    return source.hostPosition;
}

} // namespace pelm::host

void PelmHost_Close(InputSource *source) {
    if (source == nullptr) return;
    if (source->hostContext != nullptr) {
        pelm::host::release_owned(*pelm::host::context_of(*source));
        free(source->hostContext);
    }
    *source = {};
}

int PelmHost_ReadError(const InputSource *source) {
    const bool opened = source != nullptr && source->hostContext != nullptr;
    return opened ? pelm::host::context_of(*source)->read_error : 0;
}

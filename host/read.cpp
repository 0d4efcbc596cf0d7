// The read service: kind 1 in place, stream sources as far as the control lets them.
#include <algorithm>
#include <cstring>

#include "host/control.h"
#include "host/source.h"
#include "host/status.h"
#include "host/stop.h"

namespace pelm::host {
namespace {

void count_read(PelmHostControl *control) {
    if (control == nullptr) return;
    const Locked locked(*control);
    control->counters.reads += 1;
}

int32_t read_in_place(InputSource &source, void *destination, int32_t count) {
    const int32_t from = source.hostPosition;
    const int32_t take = std::min(count, data_size(source) - from);
    if (take > 0) memcpy(destination, source.data + from, static_cast<size_t>(take));
    set_position(source, from + take);
    return take;
}

// Why this read must not reach the source, or 0. Takes the pending error.
int refusal(SourceContext &context, const PelmHostControl *control) {
    if (const int reason = stop_reason(control); reason != 0) return reason;
    const int error = context.pending_error;
    context.pending_error = 0;
    return error;
}

int32_t read_stream(InputSource &source, SourceContext &context, void *destination, int32_t count,
                    PelmHostControl *control) {
    context.read_error = refusal(context, control);
    if (context.read_error != 0) return -1;
    const Fetched got = fetch(source, context, destination, count, control);
    context.read_error = got.error;
    // Bytes that came before a failure are delivered first. A stop needs no note: the next read asks again.
    if (got.end == FetchEnd::failed && got.count > 0) context.pending_error = got.error;
    ask_progress(control, &source);
    return got.count == 0 && got.error != 0 ? -1 : got.count;
}

} // namespace
} // namespace pelm::host

// Weak here and at the other services: an application that links the static library may define some of them itself.
[[gnu::weak]] int32_t ZOTARPELM_Read_IO(InputSource *source, void *destination, int32_t count) {
    const pelm::host::HeldControl control;
    pelm::host::count_read(control.get());
    if (source == nullptr) return 0;
    pelm::host::current_position(*source);
    if (destination == nullptr || count <= 0) return 0;
    if (source->kind == PELM_SOURCE_MEMORY) return pelm::host::read_in_place(*source, destination, count);
    if (source->hostContext == nullptr) return 0;
    auto &context = *static_cast<pelm::host::SourceContext *>(source->hostContext);
    return pelm::host::read_stream(*source, context, destination, count, control.get());
}

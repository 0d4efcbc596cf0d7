// The seek service: anywhere within the data, or forward only on what is read front to back.
#include <algorithm>

#include "host/control.h"
#include "host/source.h"

namespace pelm::host {
namespace {

constexpr int32_t origin_start = 0;
constexpr int32_t origin_current = 1;

void count_seek(PelmHostControl *control) {
    if (control == nullptr) return;
    const Locked locked(*control);
    control->counters.seeks += 1;
}

// The position asked for, moved into the data; an unknown origin asks for the position as it is.
int32_t seek_target(int32_t position, int32_t size, int32_t offset, int32_t origin) {
    int64_t target = position;
    if (origin == origin_start) target = offset;
    if (origin == origin_current) target = int64_t{position} + offset;
    return static_cast<int32_t>(std::clamp<int64_t>(target, 0, size));
}

// Reads on to `target` and throws the bytes away. Stops short where reading does; a failure is left for the next read
// to report.
void discard_until(InputSource &source, SourceContext &context, int32_t target, const PelmHostControl *control) {
    uint8_t unwanted[4096];
    while (source.hostPosition < target && context.pending_error == 0) {
        const int32_t count = std::min(target - source.hostPosition, static_cast<int32_t>(sizeof unwanted));
        const Fetched got = fetch(source, context, unwanted, count, control);
        context.read_error = got.error;
        if (got.end == FetchEnd::failed) context.pending_error = got.error;
        if (got.end != FetchEnd::full) return;
    }
}

void move_to(InputSource &source, int32_t target, const PelmHostControl *control) {
    const bool opened_stream = source.kind != PELM_SOURCE_MEMORY && source.hostContext != nullptr;
    auto *const context = opened_stream ? static_cast<SourceContext *>(source.hostContext) : nullptr;
    if (context != nullptr && context->backing == Backing::feed) {
        discard_until(source, *context, target, control);
    } else {
        set_position(source, target);
    }
}

} // namespace
} // namespace pelm::host

[[gnu::weak]] int32_t ZOTARPELM_Seek_IO(InputSource *source, int32_t offset, int32_t origin) {
    const pelm::host::HeldControl control;
    pelm::host::count_seek(control.get());
    if (source == nullptr) return 0;
    const int32_t position = pelm::host::current_position(*source);
    const int32_t target = pelm::host::seek_target(position, pelm::host::data_size(*source), offset, origin);
    pelm::host::move_to(*source, target, control.get());
    return source->hostPosition - position;
}

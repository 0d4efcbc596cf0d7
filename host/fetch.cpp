// Reading on from a stream source's position, whatever backs it.
#include <algorithm>
#include <cstring>

#include "host/source.h"

namespace pelm::host {
namespace {

Fetched fetch_from_backing(const SourceContext &context, int32_t position, void *destination, int32_t count,
                           const PelmHostControl *control) {
    switch (context.backing) {
    case Backing::bytes: memcpy(destination, context.bytes + position, static_cast<size_t>(count)); break;
    case Backing::file: return fetch_from_file(context.descriptor, position, destination, count, control);
    case Backing::feed: return fetch_from_feed(context.feed, destination, count, control);
    }
    return {count, FetchEnd::full, 0};
}

} // namespace

Fetched fetch(InputSource &source, SourceContext &context, void *destination, int32_t count,
              const PelmHostControl *control) {
    const int32_t position = source.hostPosition;
    // Keeps positions within int32_t too: a feed without an end ends at INT32_MAX bytes.
    const int32_t wanted = std::min(count, context.size - position);
    Fetched got = {0, FetchEnd::ended, 0};
    if (wanted > 0) got = fetch_from_backing(context, position, destination, wanted, control);

    set_position(source, position + got.count);
    if (got.end == FetchEnd::ended) {
        context.size = source.hostPosition;
        source.size = context.size;
    }
    return got;
}

} // namespace pelm::host

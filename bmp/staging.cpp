#include "bmp/staging.h"

#include <algorithm>
#include <limits>

#include "bmp/header.h"
#include "frame/memory.h"

namespace pelm {
namespace {

void open_seekable(Staging &staging, const BmpState &state, int32_t stride, int64_t offset) {
    // A place that the position's 32 bits cannot name lies behind the end of any stream.
    constexpr int64_t farthest = std::numeric_limits<int32_t>::max();
    ZOTARPELM_Seek_IO(staging.input, static_cast<int32_t>(std::min(offset, farthest)), 0);
    staging.capacity = state.output.stagingBytes / stride * stride; // a caller's own buffer may be any size
    staging.bytes = staging.input->data;
}

bool open_sequential(Staging &staging, int32_t stride) {
    staging.capacity = std::max(staging.input->bufferSize, stride);
    staging.bytes = allocate_array<uint8_t>(static_cast<uint32_t>(staging.capacity));
    staging.owned = true;
    return staging.bytes != nullptr;
}

} // namespace

bool open_staging(Staging &staging, const BmpState &state, int64_t offset) {
    const int32_t stride = row_stride(state.width, state.bitsPerPixel);
    staging.input = state.input;
    if (state.input->kind == PELM_SOURCE_SEQUENTIAL) return open_sequential(staging, stride);
    open_seekable(staging, state, stride, offset);
    return true;
}

int32_t fill_staging(Staging &staging, int32_t held) {
    const int32_t room = staging.capacity - held;
    // Another decode over the same source, in between, takes the buffer away.
    const int32_t got = staging.bytes == nullptr ? 0 : ZOTARPELM_Read_IO(staging.input, staging.bytes + held, room);
    if (got >= 1) return std::min(got, room);
    staging.result = staging.input->consumed == staging.input->size ? PELM_RESULT_DONE : PELM_RESULT_DATA_ENDED;
    return 0;
}

void close_staging(Staging &staging) {
    if (staging.owned) free_block(staging.bytes);
}

} // namespace pelm

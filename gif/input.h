// Reading through the state's input buffer.
#pragma once

#include <algorithm>

#include "gif/working.h"

namespace pelm {

// Moves `count` unread bytes to the start of `buffer` and reads once, as much as there is room for. Returns how many
// bytes are held then; a read that fails brings none.
int32_t gif_top_up(InputSource *source, uint8_t *buffer, const uint8_t *unread, int32_t count);

inline bool have_bytes(GifInput &input, InputSource *source, int32_t need) {
    return PELMI_CheckBuffer(need, source, input.buffer, &input.bytesLeft, &input.cursor) != 0;
}

// The next `count` bytes, which are there.
inline const uint8_t *take(GifInput &input, int32_t count) {
    const uint8_t *const bytes = input.cursor;
    input.cursor += count;
    input.bytesLeft -= count;
    return bytes;
}

} // namespace pelm

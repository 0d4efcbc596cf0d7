// The reader's buffer.
#include "gif/input.h"

#include "frame/host.h"

namespace pelm {

int32_t gif_top_up(InputSource *source, uint8_t *buffer, const uint8_t *unread, int32_t count) {
    if (count != 0 && unread != buffer) ZOTARPELM_OsMemcpy(buffer, unread, static_cast<uint32_t>(count));
    const int32_t room = gif_input_bytes - count;
    if (room == 0) return count;
    const int32_t got = ZOTARPELM_Read_IO(source, buffer + count, room);
    return count + std::clamp(got, 0, room);
}

} // namespace pelm

int32_t PELMI_CheckBuffer(int32_t need, InputSource *source, uint8_t *buffer, int32_t *bytesLeft, uint8_t **cursor) {
    if (*bytesLeft >= need) return 1;
    const int32_t held = pelm::gif_top_up(source, buffer, *cursor, *bytesLeft);
    if (held < need) return 0;
    *bytesLeft = held;
    *cursor = buffer;
    return 1;
}

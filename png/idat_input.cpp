#include "png/idat_input.h"

#include "frame/host.h"
#include "png/crc32.h"

namespace pelm {
namespace {

constexpr uint32_t length_bytes = 4;
constexpr uint32_t type_bytes = 4;

void write_u32be(uint8_t *to, uint32_t value) {
    for (int32_t i = 0; i < 4; ++i)
        to[i] = static_cast<uint8_t>(value >> (24 - 8 * i));
}

void write_end_chunk(uint8_t *to) {
    constexpr uint8_t type[type_bytes] = {'I', 'E', 'N', 'D'};
    write_u32be(to, 0);
    ZOTARPELM_OsMemcpy(to + length_bytes, type, type_bytes);
    write_u32be(to + length_bytes + type_bytes, __PELMI_PngCrc32(type, type_bytes));
}

// The next bytes into the empty read buffer.
bool refill_buffer(PngDecodeState &state) {
    PngInputBuffer &buffer = *state.input;
    buffer.bytesLeft = 0;
    const uint32_t code = state.idatIndexed > 1 ? __checkbuffer_util1_multiPELMI_IDAT(&state, &buffer, &state.idatIndex)
                                                : __checkbuffer_util1(&buffer, 1);
    return code != 0 && buffer.bytesLeft != 0;
}

} // namespace

// Each later chunk gives up its frame of twelve bytes, so that the checksum and the end chunk behind the joined data
// stay within what the last chunk took.
void join_idat_chunks(PngDecodeState &state) {
    if (state.idatJoined != 0 || state.idatCount < 2) return;
    state.idatJoined = 1;
    uint8_t *const data = state.idatTable[0].memoryAddress;
    uint32_t length = state.idatTable[0].length;
    for (uint32_t i = 1; i < state.idatCount; ++i) {
        const PngIdatEntry &later = state.idatTable[i];
        ZOTARPELM_OsMemcpy(data + length, later.memoryAddress, later.length);
        length += later.length;
    }
    write_u32be(data - type_bytes - length_bytes, length);
    write_u32be(data + length, __PELMI_PngCrc32(data - type_bytes, type_bytes + length));
    write_end_chunk(data + length + 4);
    state.idatTable[0].length = length;
    state.idatCount = state.idatIndexed = 1;
}

MemoryInput memory_input(const PngDecodeState &state) {
    return {state.inputNext, state.input->data + state.input->sourceSize};
}

bool open_stream(PngDecodeState &state) {
    state.idatIndex = 0;
    state.idatCount = state.idatIndexed;
    for (uint32_t i = 0; i < state.idatIndexed; ++i)
        state.idatTable[i].length = static_cast<uint32_t>(state.idatTable[i].wholeLength);
    state.input->readPos = 0;
    ZOTARPELM_Seek_IO(state.input->source, static_cast<int32_t>(state.idatTable[0].sourceOffset), 0);
    return refill_buffer(state);
}

StreamInput stream_input(PngDecodeState &state) {
    const uint8_t *const next = state.input->data + state.input->readPos;
    return {next, next + state.input->bytesLeft, &state, false};
}

bool more(StreamInput &input) {
    if (input.ended) return false;
    PngDecodeState *const state = input.state;
    const bool came = refill_buffer(*state);
    input = stream_input(*state);
    input.ended = !came;
    return came;
}

void keep_unread(const StreamInput &input) {
    PngInputBuffer &buffer = *input.state->input;
    buffer.readPos = static_cast<uint32_t>(input.next - buffer.data);
    buffer.bytesLeft = static_cast<uint32_t>(input.end - input.next);
}

} // namespace pelm

#include "png/reader.h"

#include <algorithm>
#include <limits>

#include "frame/memory.h"

namespace pelm {
namespace {

// Bytes that the host delivered, however many it claims.
uint32_t read_from_host(PngInputBuffer &input, uint8_t *to, uint32_t count) {
    const int32_t got = ZOTARPELM_Read_IO(input.source, to, static_cast<int32_t>(count));
    return got < 1 ? 0 : std::min(static_cast<uint32_t>(got), count);
}

// Required: the start that is noted is the old end, also behind carried bytes (docs/oddities.md, "Chunk headers across
// the read buffer").
void note_refill(PngInputBuffer &input, uint32_t count) {
    input.readPos = 0;
    input.bytesLeft += count;
    input.bufferStart = input.sourceEnd;
    input.sourceEnd += count;
}

// Behind each chunk's data stand its checksum and the next chunk's length and type.
constexpr uint32_t bytes_between_chunks = 12;

void go_to_next_chunk(PngDecodeState &state, PngInputBuffer &input, uint32_t &entry_index) {
    uint8_t scratch[bytes_between_chunks];
    const uint32_t got = read_from_host(input, scratch, bytes_between_chunks);
    input.source->consumed = static_cast<int32_t>(static_cast<uint32_t>(input.source->consumed) + got);
    ++entry_index;
    --state.idatCount;
}

} // namespace

bool is_readable(const InputSource *source) {
    if (source == nullptr) return false;
    switch (source->kind) {
    case PELM_SOURCE_MEMORY: return source->data != nullptr && source->size > 0;
    case PELM_SOURCE_STREAM:
    case PELM_SOURCE_STREAM_ALT:
    case PELM_SOURCE_SEQUENTIAL: return true;
    default: return false;
    }
}

bool open_reader(PngInputBuffer &input, InputSource &source) {
    input.source = &source;
    input.sourceSize = static_cast<uint32_t>(source.size);
    if (source.kind == PELM_SOURCE_MEMORY) {
        input.data = source.data;
        input.bytesLeft = input.sourceSize;
        return true;
    }
    input.data = allocate_array<uint8_t>(PNG_READ_BUFFER_SIZE);
    if (input.data == nullptr) return false;
    ZOTARPELM_Seek_IO(&source, 0, 0);
    return true;
}

bool have_bytes(PngInputBuffer &input, uint32_t need) {
    while (input.bytesLeft < need) {
        const uint32_t refilled = input.bytesLeft == 0 ? __checkbuffer_util1(&input, static_cast<int32_t>(need))
                                                       : __checkbuffer_util2(&input, need);
        if (refilled != PNG_DONE) return false;
    }
    return true;
}

bool read_byte(PngInputBuffer &input, uint8_t &byte) {
    if (!have_bytes(input, 1)) return false;
    byte = *take(input, 1);
    return true;
}

bool read_u32(PngInputBuffer &input, uint32_t &value) {
    if (!have_bytes(input, 4)) return false;
    value = __PELMI_PngGetUINT32(take(input, 4));
    return true;
}

bool skip_bytes(PngInputBuffer &input, uint64_t count) {
    if (input.bytesLeft >= count) {
        take(input, static_cast<uint32_t>(count));
        return true;
    }
    const uint64_t distance = count - input.bytesLeft;
    if (reads_memory(input) || distance > std::numeric_limits<int32_t>::max()) return false;
    const auto ahead = static_cast<int32_t>(distance);
    if (ZOTARPELM_Seek_IO(input.source, ahead, 1) < ahead) return false;
    input.readPos = 0;
    input.bytesLeft = 0;
    input.sourceEnd += static_cast<uint32_t>(ahead);
    return true;
}

} // namespace pelm

uint32_t __checkbuffer_util1(PngInputBuffer *input, int32_t need) {
    if (need > static_cast<int32_t>(PNG_READ_BUFFER_SIZE) || pelm::reads_memory(*input)) return PNG_INPUT_ENDED;
    const uint32_t got = pelm::read_from_host(*input, input->data, PNG_READ_BUFFER_SIZE);
    if (got == 0) return PNG_INPUT_ENDED;
    input->bytesLeft = 0;
    pelm::note_refill(*input, got);
    return PNG_DONE;
}

uint32_t __checkbuffer_util2(PngInputBuffer *input, uint32_t need) {
    if (need + input->bytesLeft > PNG_READ_BUFFER_SIZE || pelm::reads_memory(*input)) return PNG_INPUT_ENDED;
    if (input->readPos != 0) ZOTARPELM_OsMemcpy(input->data, input->data + input->readPos, input->bytesLeft);
    const uint32_t room = std::min(input->readPos, PNG_READ_BUFFER_SIZE - input->bytesLeft);
    const uint32_t got = pelm::read_from_host(*input, input->data + input->bytesLeft, room);
    input->readPos = 0;
    if (got == 0) return PNG_INPUT_ENDED;
    pelm::note_refill(*input, got);
    return PNG_DONE;
}

uint32_t __checkbuffer_util1_multiPELMI_IDAT(PngDecodeState *state, PngInputBuffer *input, uint32_t *entryIndex) {
    if (*entryIndex >= state->idatIndexed) return 0;
    if (state->idatTable[*entryIndex].length == 0) pelm::go_to_next_chunk(*state, *input, *entryIndex);
    if (*entryIndex >= state->idatIndexed) return 0;
    uint32_t &left = state->idatTable[*entryIndex].length;
    const uint32_t wanted = std::min(left, PNG_READ_BUFFER_SIZE);
    const uint32_t got = wanted == 0 ? 0 : pelm::read_from_host(*input, input->data, wanted);
    left -= wanted;
    if (got == 0) return 0;
    pelm::note_refill(*input, got);
    return 1;
}

uint32_t __PELMI_PngGetUINT32(const uint8_t *bytes) {
    return static_cast<uint32_t>(bytes[0]) << 24 | static_cast<uint32_t>(bytes[1]) << 16 |
           static_cast<uint32_t>(bytes[2]) << 8 | static_cast<uint32_t>(bytes[3]);
}

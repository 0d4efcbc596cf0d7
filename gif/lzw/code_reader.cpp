#include "gif/lzw/code_reader.h"

#include "frame/bytes.h"
#include "gif/input.h"

namespace pelm {
namespace {

// Steps into the next sub-block; an empty one ends nothing.
bool open_sub_block(CodeReader &reader) {
    const int32_t size = *reader.next++;
    auto held = static_cast<int32_t>(reader.data_end - reader.next);
    // A sub-block counts only with a byte behind it, which tells the next one's size.
    if (size >= held) {
        held = gif_top_up(reader.source, reader.buffer, reader.next, held);
        reader.next = reader.buffer;
        reader.data_end = reader.buffer + held;
    }
    reader.block_end = reader.next;
    if (size < held) {
        reader.block_end += size;
        return true;
    }
    // Required: a file that simply ends is a finished image (docs/oddities.md, "Truncated GIFs succeed").
    const bool file_ended = held > 0 && reader.source->consumed == reader.source->size;
    reader.ending = file_ended ? GIF_ENDED : GIF_FAILED;
    return false;
}

void take_byte(CodeReader &reader) {
    reader.bits |= static_cast<uint64_t>(*reader.next++) << reader.count;
    reader.count += 8;
}

} // namespace

CodeReader open_codes(const GifDecoderState &state, InputSource *source) {
    const GifInput &input = *state.input;
    CodeReader reader{};
    reader.bits = state.savedBitBuffer;
    reader.count = state.savedBitCount;
    reader.next = input.cursor;
    reader.block_end = input.cursor + state.savedBlockLeft;
    reader.data_end = input.cursor + input.bytesLeft;
    reader.source = source;
    reader.buffer = input.buffer;
    return reader;
}

void close_codes(CodeReader &reader, GifDecoderState &state) {
    GifInput &input = *state.input;
    if (reader.ending == GIF_GOES_ON) { // otherwise every bit was needed
        reader.next -= reader.count / 8;
        reader.count %= 8;
    }
    state.savedBitBuffer = static_cast<uint32_t>(reader.bits) & ((1u << reader.count) - 1);
    state.savedBitCount = reader.count;
    state.savedBlockLeft = static_cast<int32_t>(reader.block_end - reader.next);
    input.cursor = input.buffer + (reader.next - input.buffer);
    input.bytesLeft = static_cast<int32_t>(reader.data_end - reader.next);
}

bool fetch_bits(CodeReader &reader, uint32_t size) {
    if (reader.block_end - reader.next >= 8) {
        reader.bits |= read_u64le(reader.next) << reader.count;
        const uint32_t bytes = (63 - reader.count) / 8;
        reader.next += bytes;
        reader.count += 8 * bytes;
        return true;
    }
    while (reader.count < size) {
        if (reader.next != reader.block_end)
            take_byte(reader);
        else if (!open_sub_block(reader))
            return false;
    }
    return true;
}

} // namespace pelm

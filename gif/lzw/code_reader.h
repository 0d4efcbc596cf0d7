// Codes out of the sub-blocks of the image data.
//
// Bytes are taken ahead of need only within a sub-block, and what was not needed is given back when a driver returns:
// the next block is sought right behind the last byte that a code needed, so that is part of the result.
#pragma once

#include "gif/state.h"

namespace pelm {

struct CodeReader {
    uint64_t bits; // not yet used, the next one lowest. Above `count` may be bits that will be read again
    uint32_t count;
    const uint8_t *next;      // byte of the sub-block
    const uint8_t *block_end; // always within the buffer, and a byte of the buffer follows
    const uint8_t *data_end;  // of what the buffer holds
    InputSource *source;
    uint8_t *buffer;
    GifEnding ending; // once there is no further code
};

CodeReader open_codes(const GifDecoderState &state, InputSource *source);

// Gives back what was taken ahead, and saves the rest.
void close_codes(CodeReader &reader, GifDecoderState &state);

// Makes sure of `size` bits, by way of the next sub-blocks. False at the end of the data: `ending` tells how.
bool fetch_bits(CodeReader &reader, uint32_t size);

// The next code of `size` bits. False when there is none.
inline bool read_code(CodeReader &reader, uint32_t size, uint32_t &code) {
    if (reader.count < size && !fetch_bits(reader, size)) return false;
    code = static_cast<uint32_t>(reader.bits) & ((1u << size) - 1);
    reader.bits >>= size;
    reader.count -= size;
    return true;
}

} // namespace pelm

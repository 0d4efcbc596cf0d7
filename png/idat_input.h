// The compressed stream of a PNG as an input of the bit reader (png/inflate/bits.h).
#pragma once

#include "png/reader.h"

namespace pelm {

// Memory: the IDAT chunks joined to one piece, in the caller's memory, once per decode.
void join_idat_chunks(PngDecodeState &state);
MemoryInput memory_input(const PngDecodeState &state);

// Streams: chunk by chunk through the read buffer.
struct StreamInput {
    const uint8_t *next, *end;
    PngDecodeState *state;
    bool ended; // a refill has brought nothing: the host is not asked again in this call
};

// Puts the source to the beginning of the image data. False when nothing can be read there.
bool open_stream(PngDecodeState &state);

StreamInput stream_input(PngDecodeState &state);
bool more(StreamInput &input);

// Gives the unread bytes back to the read buffer, for the next call.
void keep_unread(const StreamInput &input);

} // namespace pelm

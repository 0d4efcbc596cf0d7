// The buffered reader through which the chunk parser and the image-data loops take PNG input.
//
// What needs more bytes than there are fails. Memory is never refilled; the host's read service is not asked for it.
#pragma once

#include "png/state.h"

// Fresh fill of an empty buffer: PNG_DONE, or PNG_INPUT_ENDED when nothing came or more than a buffer is needed.
PELM_EXPORT uint32_t __checkbuffer_util1(PngInputBuffer *input, int32_t need);

// Moves the unread bytes to the front and fills up behind them; results as above.
PELM_EXPORT uint32_t __checkbuffer_util2(PngInputBuffer *input, uint32_t need);

// The next run of bytes of the image data, going from IDAT chunk to IDAT chunk: 1, or 0 when there are none.
PELM_EXPORT uint32_t __checkbuffer_util1_multiPELMI_IDAT(PngDecodeState *state, PngInputBuffer *input,
                                                         uint32_t *entryIndex);

// A big-endian number of four bytes.
PELM_EXPORT uint32_t __PELMI_PngGetUINT32(const uint8_t *bytes);

namespace pelm {

// Whether PNG can be decoded from there at all.
bool is_readable(const InputSource *source);

// Makes the zeroed `input` read from the beginning of a readable source. False without memory for the read buffer.
bool open_reader(PngInputBuffer &input, InputSource &source);

// True when at least `need` bytes (a few) are buffered, after refills if that takes some.
bool have_bytes(PngInputBuffer &input, uint32_t need);

// The caller has made sure that they are there.
inline const uint8_t *take(PngInputBuffer &input, uint32_t count) {
    const uint8_t *const bytes = input.data + input.readPos;
    input.readPos += count;
    input.bytesLeft -= count;
    return bytes;
}

// False when the input ends first.
bool read_byte(PngInputBuffer &input, uint8_t &byte);
bool read_u32(PngInputBuffer &input, uint32_t &value);

// Steps over `count` bytes, moving the source where they are not all buffered. False when it ends first.
bool skip_bytes(PngInputBuffer &input, uint64_t count);

inline bool reads_memory(const PngInputBuffer &input) {
    return input.source->kind == PELM_SOURCE_MEMORY;
}

} // namespace pelm

#include "bmp/run_length.h"

#include <algorithm>

#include "bmp/header.h"
#include "frame/memory.h"
#include "frame/packed.h"

namespace pelm {
namespace {

// Escapes: the second byte behind a count of 0. Higher ones are the length of a stretch of literal indices.
enum : uint8_t { end_of_line = 0, end_of_bitmap = 1, delta = 2 };

constexpr int32_t longest_literal_bytes = 256; // 255 indices and a byte of padding

void open_memory(CodeBytes &codes, const InputSource &input, uint32_t offset) {
    const auto size = static_cast<uint32_t>(std::max(input.size, 0));
    codes.in_memory = true;
    codes.at = input.data + std::min(offset, size);
    codes.end = input.data + size;
}

bool refill(CodeBytes &codes) {
    if (codes.in_memory) return false;
    const int32_t got = fill_staging(codes.staging, 0);
    codes.at = codes.staging.bytes;
    codes.end = codes.at + got;
    return got > 0;
}

// False when the codes run out before `count` bytes.
bool collect(CodeBytes &codes, uint8_t *bytes, ptrdiff_t count) {
    while (count > 0) {
        if (codes.at == codes.end && !refill(codes)) return false;
        const ptrdiff_t piece = std::min(count, codes.end - codes.at);
        std::copy_n(codes.at, piece, bytes);
        codes.at += piece;
        bytes += piece;
        count -= piece;
    }
    return true;
}

// The next `count` bytes: where they are, or in `room` when a refill parts them. NULL when the codes run out before.
inline const uint8_t *take(CodeBytes &codes, uint8_t *room, ptrdiff_t count) {
    if (codes.end - codes.at < count) return collect(codes, room, count) ? room : nullptr;
    const uint8_t *const bytes = codes.at;
    codes.at += count;
    return bytes;
}

// Required: codes beyond the width are read and dropped; only an escape ends the row (docs/oddities.md, "Run-length
// codes").
int32_t room_for(const RunLengthReader &reader, int32_t count) {
    return std::min(count, reader.width - reader.covered);
}

void add_run(RunLengthReader &reader, int32_t count, uint8_t value) {
    count = room_for(reader, count);
    uint8_t *const to = reader.row + reader.covered;
    if (reader.bits == 8) {
        std::fill_n(to, count, value);
    } else {
        const uint8_t pair[2] = {static_cast<uint8_t>(value >> 4), static_cast<uint8_t>(value & 15)};
        for (int32_t i = 0; i < count; ++i)
            to[i] = pair[i & 1];
    }
    reader.covered += count;
}

// Literal indices fill whole bytes, and these an even number of them: every code begins an even number of bytes behind
// the first one.
bool add_literals(RunLengthReader &reader, int32_t count) {
    uint8_t room[longest_literal_bytes];
    const int32_t filled = reader.bits == 8 ? count : (count + 1) / 2;
    const uint8_t *const bytes = take(reader.codes, room, filled + filled % 2);
    if (bytes == nullptr) return false;
    count = room_for(reader, count);
    uint8_t *const to = reader.row + reader.covered;
    if (reader.bits == 8) {
        std::copy_n(bytes, count, to);
    } else {
        for (int32_t i = 0; i < count; ++i)
            to[i] = static_cast<uint8_t>(packed_sample<4>(bytes, i));
    }
    reader.covered += count;
    return true;
}

// Required: a delta is read and moves nothing (docs/oddities.md, "Run-length codes").
bool skip_delta(CodeBytes &codes) {
    uint8_t room[2];
    return take(codes, room, 2) != nullptr;
}

void clear_rest(const RunLengthReader &reader, int32_t end) {
    if (reader.covered < end) std::fill(reader.row + reader.covered, reader.row + end, uint8_t{0});
}

// Up to the escape that ends the row: only there is what the codes do not set cleared, for a row may be declared to be
// far longer than the file. False when the codes run out before it.
// Required: the end of the bitmap ends a row like any other (docs/oddities.md, "Run-length codes").
bool expand_row(RunLengthReader &reader) {
    const int32_t not_zero = reader.covered; // indices of the row before
    reader.covered = 0;
    uint8_t room[2];
    while (const uint8_t *const code = take(reader.codes, room, 2)) {
        const uint8_t count = code[0];
        const uint8_t value = code[1];
        if (count != 0) {
            add_run(reader, count, value);
        } else if (value == end_of_line || value == end_of_bitmap) {
            clear_rest(reader, not_zero);
            return true;
        } else if (!(value == delta ? skip_delta(reader.codes) : add_literals(reader, value))) {
            return false;
        }
    }
    return false;
}

} // namespace

bool is_run_length(const BmpState &state) {
    return (state.compression == rle8 && state.bitsPerPixel == 8) ||
           (state.compression == rle4 && state.bitsPerPixel == 4);
}

bool open_rows(RunLengthReader &reader, const BmpState &state, int32_t) {
    reader = {};
    reader.bits = state.bitsPerPixel;
    reader.width = state.width;
    reader.current = -1;
    reader.covered = state.width; // nothing is cleared yet
    if (state.input->kind == PELM_SOURCE_MEMORY)
        open_memory(reader.codes, *state.input, state.pixelDataOffset);
    else if (!open_staging(reader.codes.staging, state, state.pixelDataOffset))
        return false;
    reader.row = allocate_array<uint8_t>(static_cast<uint32_t>(state.width));
    return reader.row != nullptr;
}

const uint8_t *read_row(RunLengthReader &reader, int32_t index) {
    while (reader.current < index) {
        if (!expand_row(reader)) {
            reader.result = reader.codes.in_memory ? PELM_RESULT_DONE : reader.codes.staging.result;
            return nullptr;
        }
        ++reader.current;
    }
    return reader.row;
}

void close_rows(RunLengthReader &reader) {
    free_block(reader.row);
    close_staging(reader.codes.staging);
}

} // namespace pelm

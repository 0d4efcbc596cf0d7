#include "bmp/row_reader.h"

#include "bmp/header.h"
#include "frame/host.h"

namespace pelm {
namespace {

int64_t offset_of(const RowReader &reader, int32_t index) {
    return reader.first_row_offset + int64_t{reader.stride} * index;
}

const uint8_t *row_in_memory(RowReader &reader, int32_t index) {
    const int64_t offset = offset_of(reader, index);
    const int64_t end = reader.input->size;
    if (offset + reader.bytes_needed > end || offset + reader.bytes_behind >= end) {
        reader.result = PELM_RESULT_DONE;
        return nullptr;
    }
    reader.current = index;
    return reader.row = reader.input->data + static_cast<ptrdiff_t>(offset);
}

// Reads on until a whole row is held. What a row does not fill when the data ends is dropped.
bool hold_a_row(RowReader &reader) {
    uint8_t *const buffer = reader.staging.bytes;
    while (reader.held < reader.stride) {
        if (reader.start != 0 && reader.held != 0)
            ZOTARPELM_OsMemcpy(buffer, buffer + reader.start, static_cast<uint32_t>(reader.held));
        reader.start = 0;
        const int32_t got = fill_staging(reader.staging, reader.held);
        if (got == 0) {
            reader.result = reader.staging.result;
            return false;
        }
        reader.held += got;
    }
    return true;
}

const uint8_t *row_in_stream(RowReader &reader, int32_t index) {
    while (reader.current < index) {
        if (reader.row != nullptr) {
            reader.start += reader.stride;
            reader.held -= reader.stride;
            reader.row = nullptr;
        }
        if (!hold_a_row(reader)) return nullptr;
        reader.row = reader.staging.bytes + reader.start;
        ++reader.current;
    }
    return reader.row;
}

// Pixel for pixel a row counts only with its padding; scaled it may lack that, but not begin in the last two bytes of
// the file.
void set_limits(RowReader &reader, const BmpState &state) {
    const bool padded = state.oneToOne != 0;
    reader.bytes_needed = padded ? reader.stride : row_bytes(state.width, state.bitsPerPixel);
    reader.bytes_behind = padded ? 0 : 2;
}

} // namespace

bool open_rows(RowReader &reader, const BmpState &state, int32_t first) {
    reader = {};
    reader.input = state.input;
    reader.stride = row_stride(state.width, state.bitsPerPixel);
    reader.current = first - 1;
    reader.first_row_offset = state.pixelDataOffset;
    if (state.input->kind == PELM_SOURCE_MEMORY) {
        set_limits(reader, state);
        return true;
    }
    // The first rows of a top-down image may hold no sample, but they are what a sequential stream delivers first.
    if (state.input->kind == PELM_SOURCE_SEQUENTIAL && state.topDown != 0 && state.rowsDone == 0) reader.current = -1;
    return open_staging(reader.staging, state, offset_of(reader, first));
}

const uint8_t *read_row(RowReader &reader, int32_t index) {
    if (reader.row != nullptr && reader.current == index) return reader.row;
    return reader.input->kind == PELM_SOURCE_MEMORY ? row_in_memory(reader, index) : row_in_stream(reader, index);
}

void close_rows(RowReader &reader) {
    close_staging(reader.staging);
}

} // namespace pelm

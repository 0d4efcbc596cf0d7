#include "wbmp/source_rows.h"

#include <algorithm>

#include "frame/memory.h"

namespace pelm {
namespace {

int32_t offset_of(const SourceRows &rows, int32_t index) {
    return rows.first + rows.size * index; // within the input, whose size is an int32_t
}

bool fill_buffer(const SourceRows &rows) {
    int32_t filled = 0;
    while (filled < rows.size) {
        const int32_t wanted = rows.size - filled;
        const int32_t got = ZOTARPELM_Read_IO(rows.input, rows.input->data + filled, wanted);
        if (got < 1) return false;
        filled += std::min(got, wanted);
    }
    return true;
}

} // namespace

bool open_rows(SourceRows &rows, InputSource &input, const WbmpHeader &header) {
    rows = {&input, header.length, row_bytes(header), -1};
    if (input.kind == PELM_SOURCE_MEMORY) return true;
    ZOTARPELM_Seek_IO(&input, header.length, 0);
    input.data = allocate_array<uint8_t>(static_cast<uint32_t>(rows.size));
    return input.data != nullptr || rows.size == 0; // an image without columns needs no buffer
}

const uint8_t *read_row(SourceRows &rows, int32_t index) {
    if (rows.input->kind == PELM_SOURCE_MEMORY) return rows.input->data + offset_of(rows, index);
    if (index == rows.held) return rows.input->data;
    if (index != rows.held + 1) ZOTARPELM_Seek_IO(rows.input, offset_of(rows, index), 0);
    rows.held = index;
    return fill_buffer(rows) ? rows.input->data : nullptr;
}

} // namespace pelm

// What the decoding loop does with the string table. Codes and indices are below gif_table_entries.
#pragma once

#include "gif/state.h"

namespace pelm {

inline void add_string(GifLzwTables &tables, uint32_t prefix_code, uint8_t pixel, uint32_t index) {
    tables.prefix[index] = prefix_code;
    tables.suffix[index] = pixel;
    tables.length[index] = tables.length[prefix_code] + 1;
}

// Writes the `length` pixels of the code's string, the last one first, and returns the first one. Damaged data can make
// the links run in a circle; the length ends the walk.
inline uint8_t put_string(const GifLzwTables &tables, uint32_t code, uint32_t length, uint8_t *out) {
    const uint32_t *const prefix = tables.prefix;
    const uint8_t *const suffix = tables.suffix;
    for (uint8_t *at = out + length; at != out;) {
        *--at = suffix[code];
        code = prefix[code];
    }
    return *out;
}

} // namespace pelm

#include "gif/lzw/fast_strings.h"

namespace pelm {

void begin_fast_strings(GifFastStrings &strings, uint32_t clear_code) {
    for (uint32_t code = 0; code < clear_code + 2; ++code) {
        strings.group[code] = code & 0xFF;
        strings.link[code] = 0;
    }
}

void to_careful_tables(const GifFastStrings &strings, uint32_t clear_code, uint32_t filled, GifLzwTables &tables) {
    const uint32_t roots = clear_code + 2;
    for (uint32_t code = 0; code < gif_table_entries; ++code) {
        const bool is_string = code < roots || code < filled;
        const FastEntry entry = is_string ? fast_entry(strings, code) : FastEntry{0, 0};
        const uint32_t last = last_pixel_of(entry.link);
        tables.suffix[code] = static_cast<uint8_t>(entry.group >> (8 * (last % group_pixels)));
        tables.length[code] = is_string ? last + 1 : 0;
        if (code < roots || !is_string) tables.prefix[code] = 0;
    }
}

} // namespace pelm

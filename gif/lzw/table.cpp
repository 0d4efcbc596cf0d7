// The string table.
#include "gif/lzw/table.h"

#include "gif/working.h"

int32_t PELMI_InitializeTransTBL(uint32_t minCodeSize, GifLzwTables *tables) {
    if (minCodeSize > 11) return 0;
    const uint32_t roots = (1u << minCodeSize) + 2; // the clear and the end code among them
    for (uint32_t code = 0; code < gif_table_entries; ++code) {
        const bool is_root = code < roots;
        tables->prefix[code] = 0;
        tables->suffix[code] = is_root ? static_cast<uint8_t>(code) : 0;
        tables->length[code] = is_root ? 1 : 0;
    }
    return 1;
}

void PELMI_AddToTranslationTable(uint32_t prefixCode, uint8_t pixel, uint32_t index, GifLzwTables *tables) {
    pelm::add_string(*tables, prefixCode, pixel, index);
}

uint8_t PELMI_TranslateCode(uint32_t code, const GifLzwTables *tables, int32_t pos, uint8_t *buffer) {
    const uint32_t length = tables->length[code];
    return pelm::put_string(*tables, code, length == 0 ? 1 : length, buffer + pos);
}

void PELMI_WriteCharacter(uint8_t pixel, int32_t pos, uint8_t *buffer) {
    buffer[pos] = pixel;
}

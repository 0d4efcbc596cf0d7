#include "png/inflate/decoding_table.h"

#include "png/inflate/make_table.h"

namespace pelm {

DecodingTable make_literal_table(const uint8_t *code_lengths, uint32_t count, uint32_t widest, uint32_t *entries) {
    return make_table<HUFFMAN_LITERAL_LENGTH>(code_lengths, count, widest, literal_table_entries, entries);
}

DecodingTable make_distance_table(const uint8_t *code_lengths, uint32_t count, uint32_t widest, uint32_t *entries) {
    return make_table<HUFFMAN_DISTANCE>(code_lengths, count, widest, distance_table_entries, entries);
}

} // namespace pelm

#include "png/inflate/fixed_codes.h"

#include "png/inflate/alphabets.h"

namespace pelm {
namespace {

constexpr uint32_t reversed(uint32_t code, uint32_t length) {
    uint32_t bits = 0;
    for (uint32_t i = 0; i < length; ++i)
        bits |= (code >> i & 1) << (length - 1 - i);
    return bits;
}

constexpr void enter(Symbol (&table)[lookup_entries], uint32_t code, uint32_t length, HuffmanAlphabetKind kind,
                     uint32_t symbol) {
    const Payload payload = payload_of(kind, symbol);
    for (uint32_t i = reversed(code, length); i < lookup_entries; i += 1u << length)
        table[i] = {static_cast<uint16_t>(payload.value), static_cast<uint8_t>(payload.op),
                    static_cast<uint8_t>(length)};
}

constexpr LookupTables make_tables() {
    LookupTables tables{};
    constexpr HuffmanAlphabetKind literals = HUFFMAN_LITERAL_LENGTH;
    for (uint32_t i = 0; i < 144; ++i)
        enter(tables.literal, 0x030 + i, 8, literals, i);
    for (uint32_t i = 0; i < 112; ++i)
        enter(tables.literal, 0x190 + i, 9, literals, 144 + i);
    for (uint32_t i = 0; i < 24; ++i)
        enter(tables.literal, i, 7, literals, 256 + i);
    for (uint32_t i = 0; i < 8; ++i)
        enter(tables.literal, 0x0C0 + i, 8, literals, 280 + i);

    // Distances 30 and 31 do not exist: the place where they would branch off has no zero branch either.
    for (Symbol &missing : tables.distance)
        missing = {0, code_is_missing, 4};
    for (uint32_t i = 0; i < 30; ++i)
        enter(tables.distance, i, 5, HUFFMAN_DISTANCE, i);
    return tables;
}

} // namespace

constexpr LookupTables fixed_lookup = make_tables();

} // namespace pelm

#include "png/inflate/fixed_codes.h"

#include "png/inflate/make_table.h"

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

// Lengths of the codes of all symbols; distances 30 and 31 are no symbols.
struct FixedLengths {
    uint8_t literals[288], distances[30];
};

constexpr FixedLengths make_code_lengths() {
    FixedLengths lengths{};
    for (uint32_t symbol = 0; symbol < 288; ++symbol)
        lengths.literals[symbol] = symbol < 144 || symbol >= 280 ? 8 : symbol < 256 ? 9 : 7;
    for (uint8_t &length : lengths.distances)
        length = 5;
    return lengths;
}

struct Entries {
    uint32_t literals[1 << 9], distances[1 << 5];
};

constexpr Entries make_entries() {
    constexpr FixedLengths lengths = make_code_lengths();
    Entries entries{};
    make_table<HUFFMAN_LITERAL_LENGTH>(lengths.literals, 288, 9, 1 << 9, entries.literals);
    make_table<HUFFMAN_DISTANCE>(lengths.distances, 30, 5, 1 << 5, entries.distances);
    return entries;
}

constexpr Entries entries = make_entries();

} // namespace

constexpr DecodingTable fixed_literals = {entries.literals, 9};
constexpr DecodingTable fixed_distances = {entries.distances, 5};
constexpr LookupTables fixed_lookup = make_tables();

} // namespace pelm

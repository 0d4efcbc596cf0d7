#include "tests/png/support/deflate_builder.h"

#include <algorithm>
#include <cstdlib>
#include <numeric>

#ifdef PELM_TEST_HAS_ZLIB
#include <zlib.h>
#endif

namespace pelm::test {

namespace {

// RFC 1951, section 3.2.5.
struct Range {
    uint32_t base, extra_bits;
};

constexpr Range length_ranges[] = {{3, 0},   {4, 0},   {5, 0},   {6, 0},   {7, 0},  {8, 0},  {9, 0},  {10, 0},
                                   {11, 1},  {13, 1},  {15, 1},  {17, 1},  {19, 2}, {23, 2}, {27, 2}, {31, 2},
                                   {35, 3},  {43, 3},  {51, 3},  {59, 3},  {67, 4}, {83, 4}, {99, 4}, {115, 4},
                                   {131, 5}, {163, 5}, {195, 5}, {227, 5}, {258, 0}};
constexpr Range distance_ranges[] = {{1, 0},     {2, 0},     {3, 0},     {4, 0},      {5, 1},      {7, 1},
                                     {9, 2},     {13, 2},    {17, 3},    {25, 3},     {33, 4},     {49, 4},
                                     {65, 5},    {97, 5},    {129, 6},   {193, 6},    {257, 7},    {385, 7},
                                     {513, 8},   {769, 8},   {1025, 9},  {1537, 9},   {2049, 10},  {3073, 10},
                                     {4097, 11}, {6145, 11}, {8193, 12}, {12289, 12}, {16385, 13}, {24577, 13}};

template <size_t size>
uint32_t range_of(const Range (&ranges)[size], uint32_t value) {
    uint32_t found = 0;
    for (uint32_t i = 0; i < size; ++i)
        if (ranges[i].base <= value) found = i;
    return found;
}

template <size_t size>
uint32_t extra_bits_of(const Range (&ranges)[size], uint32_t index) {
    return index < size ? ranges[index].extra_bits : 0;
}

constexpr uint8_t code_length_order[19] = {16, 17, 18, 0, 8, 7, 9, 6, 10, 5, 11, 4, 12, 3, 13, 2, 14, 1, 15};

std::vector<LengthSymbol> plain_sequence(const DynamicCodes &codes) {
    std::vector<LengthSymbol> sequence;
    for (const uint8_t length : codes.literal_lengths)
        sequence.push_back({length, 0});
    for (const uint8_t length : codes.distance_lengths)
        sequence.push_back({length, 0});
    return sequence;
}

uint32_t run_extra_bits(uint32_t length_symbol) {
    return length_symbol == 16 ? 2 : length_symbol == 17 ? 3 : length_symbol == 18 ? 7 : 0;
}

// A symbol without a code is a slip of the test.
void put_symbol(BitWriter &bits, const std::vector<Code> &codes, uint32_t value) {
    if (value >= codes.size() || codes[value].length == 0) abort();
    bits.put_code(codes[value].bits, codes[value].length);
}

size_t match_length_at(const Bytes &data, size_t at, size_t distance, size_t end) {
    size_t length = 0;
    while (at + length < end && length < 258 && data[at + length] == data[at + length - distance])
        ++length;
    return length;
}

Tokens simple_tokens(const Bytes &data, size_t begin, size_t end, const std::vector<uint32_t> &distances) {
    Tokens tokens;
    for (size_t at = begin; at < end;) {
        size_t best = 0;
        uint32_t best_distance = 0;
        for (const uint32_t distance : distances) {
            if (distance == 0 || distance > at || distance > 32768) continue;
            const size_t length = match_length_at(data, at, distance, end);
            if (length > best) best = length, best_distance = distance;
        }
        if (best >= 3)
            tokens.push_back(match(static_cast<uint32_t>(best), best_distance));
        else
            tokens.push_back(literal(data[at]));
        at += best >= 3 ? best : 1;
    }
    return tokens;
}

} // namespace

void BitWriter::put(uint32_t value, uint32_t count) {
    for (uint32_t i = 0; i < count; ++i, ++bit_count_) {
        if (bit_count_ % 8 == 0) bytes_.push_back(0);
        bytes_.back() = static_cast<uint8_t>(bytes_.back() | (value >> i & 1) << bit_count_ % 8);
    }
}

void BitWriter::put_code(uint32_t code, uint32_t length) {
    for (uint32_t i = length; i-- > 0;)
        put(code >> i & 1, 1);
}

void BitWriter::align() {
    bit_count_ = 8 * bytes_.size();
}

void BitWriter::put_bytes(const Bytes &bytes) {
    align();
    append(bytes_, bytes);
    align();
}

Token symbol(uint32_t value) {
    Token token;
    token.symbol = value;
    return token;
}

Token literal(uint32_t byte) {
    return symbol(byte & 0xFF);
}

Tokens literals(const Bytes &bytes) {
    Tokens tokens;
    for (const uint8_t byte : bytes)
        tokens.push_back(literal(byte));
    return tokens;
}

Token match(uint32_t length, uint32_t distance) {
    // Length 258 has a symbol of its own, although the range before it reaches that far.
    const uint32_t length_index = range_of(length_ranges, length);
    const uint32_t distance_index = range_of(distance_ranges, distance);
    return match_of_symbols(257 + length_index, length - length_ranges[length_index].base, distance_index,
                            distance - distance_ranges[distance_index].base);
}

Token match_of_symbols(uint32_t length_symbol, uint32_t length_extra, uint32_t distance_symbol,
                       uint32_t distance_extra) {
    return {length_symbol,   length_extra,   extra_bits_of(length_ranges, length_symbol - 257), true,
            distance_symbol, distance_extra, extra_bits_of(distance_ranges, distance_symbol)};
}

Bytes expand(const Tokens &tokens, Bytes history) {
    const size_t begin = history.size();
    for (const Token &token : tokens) {
        if (!token.has_distance) {
            if (token.symbol < 256) history.push_back(static_cast<uint8_t>(token.symbol));
            continue;
        }
        const uint32_t length = length_ranges[token.symbol - 257].base + token.extra;
        const size_t distance = distance_ranges[token.distance_symbol].base + token.distance_extra;
        for (uint32_t i = 0; i < length; ++i)
            history.push_back(distance <= history.size() ? history[history.size() - distance] : uint8_t{0});
    }
    return {history.begin() + static_cast<ptrdiff_t>(begin), history.end()};
}

std::vector<Code> canonical_codes(const Bytes &lengths) {
    std::vector<Code> codes(lengths.size());
    uint32_t next = 0;
    for (uint32_t length = 1; length <= 15; ++length) {
        next <<= 1;
        for (size_t i = 0; i < lengths.size(); ++i)
            if (lengths[i] == length) codes[i] = {next++ & ((1u << length) - 1), length};
    }
    return codes;
}

Bytes balanced_lengths(size_t alphabet_size, const std::vector<uint32_t> &used) {
    Bytes lengths(alphabet_size);
    uint8_t deep = 1;
    while (1u << deep < used.size())
        ++deep;
    // 2^deep places; the first symbols take two each until all places are taken.
    const size_t shallow = (size_t{1} << deep) - used.size();
    for (size_t i = 0; i < used.size(); ++i)
        lengths[used[i]] = static_cast<uint8_t>(used.size() > 1 && i < shallow ? deep - 1 : deep);
    return lengths;
}

DynamicCodes codes_for(const Tokens &tokens) {
    std::vector<uint32_t> used_literals = {end_of_block}, used_distances;
    for (const Token &token : tokens) {
        used_literals.push_back(token.symbol);
        if (token.has_distance) used_distances.push_back(token.distance_symbol);
    }
    if (used_distances.empty()) used_distances.push_back(0);
    for (std::vector<uint32_t> *const used : {&used_literals, &used_distances}) {
        std::sort(used->begin(), used->end());
        used->erase(std::unique(used->begin(), used->end()), used->end());
    }
    DynamicCodes codes;
    codes.literal_lengths = balanced_lengths(std::max<size_t>(257, used_literals.back() + 1), used_literals);
    codes.distance_lengths = balanced_lengths(used_distances.back() + 1, used_distances);
    return codes;
}

void Deflate::block_header(uint32_t type, Last last) {
    bits.put(last == Last::yes ? 1 : 0, 1);
    bits.put(type, 2);
}

void Deflate::stored(const Bytes &data, Last last, std::optional<uint32_t> len, std::optional<uint32_t> nlen) {
    block_header(0, last);
    bits.align();
    const uint32_t length = len.value_or(static_cast<uint32_t>(data.size()));
    bits.put(length, 16);
    bits.put(nlen.value_or(~length), 16);
    bits.put_bytes(data);
}

void Deflate::stored_blocks(const Bytes &data, size_t block_size, Last last) {
    size_t at = 0;
    do {
        const size_t size = std::min(block_size, data.size() - at);
        const auto from = data.begin() + static_cast<ptrdiff_t>(at);
        at += size;
        stored({from, from + static_cast<ptrdiff_t>(size)}, at == data.size() ? last : Last::no);
    } while (at < data.size());
}

void Deflate::fixed(const Tokens &tokens_of_block, Last last, EndOfBlock end) {
    block_header(1, last);
    tokens(tokens_of_block, fixed_literal_lengths(), Bytes(32, 5));
    if (end == EndOfBlock::written) tokens({symbol(end_of_block)}, fixed_literal_lengths(), {});
}

void Deflate::dynamic(const Tokens &tokens_of_block, Last last, EndOfBlock end) {
    dynamic(codes_for(tokens_of_block), tokens_of_block, last, end);
}

void Deflate::dynamic(const DynamicCodes &codes, const Tokens &tokens_of_block, Last last, EndOfBlock end) {
    block_header(2, last);
    dynamic_header(codes);
    tokens(tokens_of_block, codes.literal_lengths, codes.distance_lengths);
    if (end == EndOfBlock::written) tokens({symbol(end_of_block)}, codes.literal_lengths, codes.distance_lengths);
}

void Deflate::dynamic_header(const DynamicCodes &codes) {
    Bytes lengths(19);
    std::fill(lengths.begin(), lengths.begin() + 16, uint8_t{4});
    lengths = codes.code_length_lengths.value_or(lengths);
    uint32_t sent = 19;
    while (sent > 4 && lengths[code_length_order[sent - 1]] == 0)
        --sent;
    const uint32_t hclen = codes.hclen.value_or(sent - 4);

    bits.put(codes.hlit.value_or(static_cast<uint32_t>(codes.literal_lengths.size() - 257)), 5);
    bits.put(codes.hdist.value_or(static_cast<uint32_t>(codes.distance_lengths.size() - 1)), 5);
    bits.put(hclen, 4);
    for (uint32_t i = 0; i < hclen + 4; ++i)
        bits.put(lengths[code_length_order[i]], 3);

    const std::vector<Code> length_codes = canonical_codes(lengths);
    for (const LengthSymbol &sent_symbol : codes.sequence.value_or(plain_sequence(codes))) {
        put_symbol(bits, length_codes, sent_symbol.symbol);
        bits.put(sent_symbol.extra, run_extra_bits(sent_symbol.symbol));
    }
}

void Deflate::tokens(const Tokens &tokens_of_block, const Bytes &literal_lengths, const Bytes &distance_lengths) {
    const std::vector<Code> literal_codes = canonical_codes(literal_lengths);
    const std::vector<Code> distance_codes = canonical_codes(distance_lengths);
    for (const Token &token : tokens_of_block) {
        put_symbol(bits, literal_codes, token.symbol);
        bits.put(token.extra, token.extra_bits);
        if (!token.has_distance) continue;
        put_symbol(bits, distance_codes, token.distance_symbol);
        bits.put(token.distance_extra, token.distance_extra_bits);
    }
}

Bytes fixed_literal_lengths() {
    Bytes lengths(288, 8);
    std::fill(lengths.begin() + 144, lengths.begin() + 256, uint8_t{9});
    std::fill(lengths.begin() + 256, lengths.begin() + 280, uint8_t{7});
    return lengths;
}

Bytes fixed_distance_lengths() {
    return Bytes(30, 5);
}

uint32_t adler32_of(const Bytes &data) {
    uint32_t a = 1, b = 0;
    for (const uint8_t byte : data) {
        a = (a + byte) % 65521;
        b = (b + a) % 65521;
    }
    return b << 16 | a;
}

Bytes zlib_stream(const Bytes &deflated, const Bytes &data, uint8_t cmf, uint8_t flg) {
    Bytes stream = {cmf, flg};
    append(stream, deflated);
    append_u32be(stream, adler32_of(data));
    return stream;
}

Bytes zlib_stored(const Bytes &data, size_t block_size) {
    Deflate deflate;
    deflate.stored_blocks(data, block_size, Last::yes);
    return zlib_stream(deflate.bytes(), data);
}

Bytes zlib_simple(const Bytes &data, size_t block_size, const std::vector<uint32_t> &distances) {
    Deflate deflate;
    size_t at = 0;
    do {
        const size_t end = std::min(data.size(), at + block_size);
        deflate.fixed(simple_tokens(data, at, end, distances), end == data.size() ? Last::yes : Last::no);
        at = end;
    } while (at < data.size());
    return zlib_stream(deflate.bytes(), data);
}

#ifdef PELM_TEST_HAS_ZLIB

Bytes zlib_compressed(const Bytes &data, int level) {
    uLongf size = compressBound(static_cast<uLong>(data.size()));
    Bytes stream(size);
    if (compress2(stream.data(), &size, data.data(), static_cast<uLong>(data.size()), level) != Z_OK) abort();
    stream.resize(size);
    return stream;
}

#else

Bytes zlib_compressed(const Bytes &data, int level) {
    return level == 0 ? zlib_stored(data) : zlib_simple(data);
}

#endif

} // namespace pelm::test

#include "tests/png/support/inflate_model.h"

#include <algorithm>

namespace pelm::test {

namespace {

constexpr size_t most_prefixes = 1u << 16;

struct Range {
    uint32_t base, extra_bits;
};

// Of length symbols 257 to 285 and distance symbols 0 to 30. The bases follow from the numbers of extra bits; only
// length 258 has a symbol out of turn, and distance symbol 30, which no encoder writes, stands for 0.
Range length_range(uint32_t symbol) {
    const uint32_t index = symbol - 257;
    if (index == 28) return {258, 0};
    if (index < 8) return {3 + index, 0};
    const uint32_t extra = index / 4 - 1;
    return {3 + ((4 + index % 4) << extra), extra};
}

Range distance_range(uint32_t symbol) {
    if (symbol == 30) return {0, 0};
    if (symbol < 4) return {1 + symbol, 0};
    const uint32_t extra = symbol / 2 - 1;
    return {1 + ((2 + symbol % 2) << extra), extra};
}

} // namespace

// Where no longer code goes on from a code, it stands for its symbol: of several the last one.
void InflateModel::Code::build(const Bytes &lengths) {
    if (known.empty()) known.resize(most_prefixes), symbols.resize(most_prefixes);
    ++generation;
    const std::vector<test::Code> codes = canonical_codes(lengths);
    for (size_t symbol = 0; symbol < codes.size(); ++symbol) {
        if (codes[symbol].length == 0) continue;
        const size_t whole = size_t{1} << codes[symbol].length | codes[symbol].bits;
        symbols[whole] = static_cast<uint16_t>(symbol);
        for (size_t prefix = whole; prefix > 0; prefix /= 2)
            known[prefix] = generation;
    }
}

InflateModel::InflateModel() {
    fixed_literals_.build(fixed_literal_lengths());
    fixed_distances_.build(fixed_distance_lengths());
}

bool InflateModel::ends(InflationEnd end) {
    inflation_.end = end;
    return false;
}

bool InflateModel::take(uint32_t count, uint32_t &value) {
    value = 0;
    if (8 * stream_->size() - position_ < count) return ends(InflationEnd::input_ended);
    for (uint32_t i = 0; i < count; ++i, ++position_)
        value |= ((*stream_)[position_ / 8] >> position_ % 8 & 1u) << i;
    return true;
}

bool InflateModel::take_symbol(const Code &code, uint32_t &symbol) {
    for (size_t prefix = 1;;) {
        uint32_t bit = 0;
        if (!take(1, bit)) return false;
        prefix = prefix * 2 + bit;
        if (!code.has(prefix)) return ends(InflationEnd::bad_code);
        if (code.has(prefix * 2)) continue;
        symbol = code.symbols[prefix];
        return true;
    }
}

const Inflation &InflateModel::inflate(const Bytes &stream) {
    stream_ = &stream;
    position_ = 0;
    inflation_.bytes.clear();
    inflation_.block_ends.clear();
    if (header())
        while (block()) {
        }
    return inflation_;
}

bool InflateModel::header() {
    uint32_t method = 0, flags = 0;
    if (!take(8, method) || !take(8, flags)) return false;
    const bool is_known = (method & 15) == 8 && method >> 4 <= 7 && (flags & 0x20) == 0;
    return is_known || ends(InflationEnd::bad_stream);
}

bool InflateModel::block() {
    uint32_t is_last = 0, type = 0;
    if (!take(1, is_last) || !take(2, type)) return false;
    if (type == 3) return ends(InflationEnd::bad_stream);
    const bool is_whole = type == 0   ? stored()
                          : type == 1 ? symbols(fixed_literals_, fixed_distances_)
                                      : dynamic_header() && symbols(literals_, distances_);
    if (!is_whole) return false;
    inflation_.block_ends.push_back({inflation_.bytes.size(), position_});
    return is_last == 0 || ends(InflationEnd::finished);
}

bool InflateModel::stored() {
    position_ = (position_ + 7) / 8 * 8;
    uint32_t length = 0, complement = 0;
    if (!take(16, length) || !take(16, complement)) return ends(InflationEnd::input_ended_stored);
    if (length != (complement ^ 0xFFFF)) return ends(InflationEnd::bad_stream);
    const size_t from = position_ / 8;
    const size_t count = std::min<size_t>(length, stream_->size() - from);
    const auto first = stream_->begin() + static_cast<ptrdiff_t>(from);
    inflation_.bytes.insert(inflation_.bytes.end(), first, first + static_cast<ptrdiff_t>(count));
    position_ += 8 * count;
    return count == length || ends(InflationEnd::input_ended_stored);
}

bool InflateModel::dynamic_header() {
    static constexpr uint8_t order[19] = {16, 17, 18, 0, 8, 7, 9, 6, 10, 5, 11, 4, 12, 3, 13, 2, 14, 1, 15};
    uint32_t literals = 0, distances = 0, sent = 0;
    if (8 * stream_->size() - position_ < 14) return ends(InflationEnd::input_ended);
    take(5, literals), take(5, distances), take(4, sent);
    literals += 257;
    distances = distances == 31 ? 0 : distances + 1; // 32 of them are none
    Bytes lengths(19);
    for (uint32_t i = 0; i < sent + 4; ++i) {
        uint32_t length = 0;
        if (!take(3, length)) return false;
        lengths[order[i]] = static_cast<uint8_t>(length);
    }
    code_lengths_.build(lengths);
    Bytes both;
    if (!code_lengths(literals + distances, both)) return false;
    const auto border = both.begin() + static_cast<ptrdiff_t>(literals);
    literals_.build({both.begin(), border});
    distances_.build({border, both.end()});
    return true;
}

bool InflateModel::code_lengths(size_t count, Bytes &lengths) {
    while (lengths.size() < count) {
        uint32_t symbol = 0, more = 0;
        if (!take_symbol(code_lengths_, symbol)) return false;
        if (symbol < 16) {
            lengths.push_back(static_cast<uint8_t>(symbol));
            continue;
        }
        if (symbol == 16 && lengths.empty()) return ends(InflationEnd::bad_stream);
        if (!take(symbol == 16 ? 2 : symbol == 17 ? 3 : 7, more)) return false;
        const size_t repeat = (symbol == 18 ? 11 : 3) + more;
        if (lengths.size() + repeat > count) return ends(InflationEnd::bad_stream);
        const uint8_t length = symbol == 16 ? lengths.back() : uint8_t{0};
        lengths.insert(lengths.end(), repeat, length);
    }
    return true;
}

bool InflateModel::symbols(const Code &literals, const Code &distances) {
    for (;;) {
        uint32_t symbol = 0;
        if (!take_symbol(literals, symbol)) return false;
        if (symbol == end_of_block) return true;
        if (symbol < 256)
            inflation_.bytes.push_back(static_cast<uint8_t>(symbol));
        else if (!match(symbol, distances))
            return false;
    }
}

bool InflateModel::match(uint32_t length_symbol, const Code &distances) {
    if (length_symbol > 285) return ends(InflationEnd::bad_code);
    const Range lengths = length_range(length_symbol);
    uint32_t length = 0, distance_symbol = 0, distance = 0;
    if (!take(lengths.extra_bits, length) || !take_symbol(distances, distance_symbol)) return false;
    const Range range = distance_range(distance_symbol);
    if (!take(range.extra_bits, distance)) return false;
    length += lengths.base;
    distance += range.base;
    if (distance == 0) distance = 32768; // what the window's place held a round ago, zeros at first
    Bytes &bytes = inflation_.bytes;
    for (; length > 0; --length) {
        const bool is_before = bytes.size() < distance;
        const uint8_t first = bytes.empty() || range.base == 0 ? uint8_t{0} : bytes[0];
        bytes.push_back(is_before ? first : bytes[bytes.size() - distance]);
    }
    return true;
}

} // namespace pelm::test

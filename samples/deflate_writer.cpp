#include "samples/deflate_writer.h"

#include <algorithm>
#include <cstddef>

namespace pelm_samples {
namespace {

using Bytes = std::vector<uint8_t>;

constexpr size_t shortest_match = 3;
constexpr size_t longest_match = 258;
constexpr size_t farthest_match = 32768;
constexpr size_t hash_size = 1u << 15;

// One row of the tables of RFC 1951, 3.2.5: what a length or distance symbol stands for.
struct Range {
    uint32_t first;
    uint32_t extra_bits;
};

// Symbols 257 to 284: four of each number of extra bits after the first eight. 285 is 258 alone.
Range length_range(uint32_t index) {
    if (index < 8) return {3 + index, 0};
    if (index == 28) return {258, 0};
    const uint32_t bits = index / 4 - 1;
    return {3 + ((4 + index % 4) << bits), bits};
}

// Symbols 0 to 29: two of each number of extra bits after the first four.
Range distance_range(uint32_t symbol) {
    if (symbol < 4) return {1 + symbol, 0};
    const uint32_t bits = symbol / 2 - 1;
    return {1 + ((2 + symbol % 2) << bits), bits};
}

template <class RangeOf>
uint32_t last_not_above(uint32_t value, uint32_t count, RangeOf range_of) {
    uint32_t symbol = count - 1;
    while (range_of(symbol).first > value)
        --symbol;
    return symbol;
}

class BitWriter {
public:
    explicit BitWriter(Bytes &to) : to_(to) {}

    void put(uint32_t value, uint32_t count) { // lowest bit first
        for (uint32_t i = 0; i < count; ++i)
            put_bit(value >> i & 1);
    }

    void put_code(uint32_t code, uint32_t count) { // highest bit first
        while (count-- > 0)
            put_bit(code >> count & 1);
    }

private:
    void put_bit(uint32_t bit) {
        if (used_ == 0) to_.push_back(0);
        to_.back() = static_cast<uint8_t>(to_.back() | bit << used_);
        used_ = (used_ + 1) % 8;
    }

    Bytes &to_;
    uint32_t used_ = 0; // bits of the last byte
};

// The fixed literal and length code.
void put_symbol(BitWriter &bits, uint32_t symbol) {
    if (symbol < 144) return bits.put_code(0x30 + symbol, 8);
    if (symbol < 256) return bits.put_code(0x190 + symbol - 144, 9);
    if (symbol < 280) return bits.put_code(symbol - 256, 7);
    bits.put_code(0xC0 + symbol - 280, 8);
}

void put_match(BitWriter &bits, uint32_t length, uint32_t distance) {
    const uint32_t index = last_not_above(length, 29, length_range);
    put_symbol(bits, 257 + index);
    bits.put(length - length_range(index).first, length_range(index).extra_bits);
    const uint32_t symbol = last_not_above(distance, 30, distance_range);
    bits.put_code(symbol, 5);
    bits.put(distance - distance_range(symbol).first, distance_range(symbol).extra_bits);
}

// Finds matches with the last place where the same three bytes stood.
class Matcher {
public:
    explicit Matcher(const Bytes &data) : data_(data), last_(hash_size, none) {}

    struct Match {
        size_t length; // 0: none
        size_t distance;
    };

    Match at(size_t position, size_t end) const {
        if (end - position < shortest_match) return {0, 0};
        const size_t earlier = last_[hash(position)];
        if (earlier == none || position - earlier > farthest_match) return {0, 0};
        const size_t most = std::min(end - position, longest_match);
        size_t length = 0;
        while (length < most && data_[earlier + length] == data_[position + length])
            ++length;
        return {length < shortest_match ? 0 : length, position - earlier};
    }

    void pass(size_t position) {
        if (data_.size() - position >= shortest_match) last_[hash(position)] = position;
    }

private:
    static constexpr size_t none = ~size_t{0};

    size_t hash(size_t at) const {
        const uint32_t three = static_cast<uint32_t>(data_[at] | data_[at + 1] << 8 | data_[at + 2] << 16);
        return three * 2654435761u >> 17;
    }

    const Bytes &data_;
    std::vector<size_t> last_;
};

void put_block(BitWriter &bits, const Bytes &data, Matcher &matcher, size_t from, size_t end) {
    const bool is_last = end == data.size();
    bits.put(is_last ? 1 : 0, 1);
    bits.put(1, 2); // the fixed codes
    while (from < end) {
        const Matcher::Match match = matcher.at(from, end);
        if (match.length == 0) {
            put_symbol(bits, data[from]);
        } else {
            put_match(bits, static_cast<uint32_t>(match.length), static_cast<uint32_t>(match.distance));
        }
        for (size_t left = std::max<size_t>(match.length, 1); left > 0; --left)
            matcher.pass(from++);
    }
    put_symbol(bits, 256);
}

uint32_t adler32(const Bytes &data) {
    uint32_t a = 1, b = 0;
    for (const uint8_t byte : data) {
        a = (a + byte) % 65521;
        b = (b + a) % 65521;
    }
    return b << 16 | a;
}

} // namespace

std::vector<uint8_t> zlib_stream(std::span<const Bytes> pieces) {
    Bytes data;
    for (const Bytes &piece : pieces)
        data.insert(data.end(), piece.begin(), piece.end());
    Bytes stream = {0x78, 0x01};
    BitWriter bits(stream);
    Matcher matcher(data);
    size_t from = 0;
    for (const Bytes &piece : pieces) {
        put_block(bits, data, matcher, from, from + piece.size());
        from += piece.size();
    }
    for (int shift = 24; shift >= 0; shift -= 8)
        stream.push_back(static_cast<uint8_t>(adler32(data) >> shift));
    return stream;
}

} // namespace pelm_samples

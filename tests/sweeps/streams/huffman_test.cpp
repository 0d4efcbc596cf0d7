// Huffman codes of every kind, complete or not, with data behind them: decompressed as the model does.
#include <gtest/gtest.h>

#include "tests/sweeps/streams/code_sets.h"
#include "tests/sweeps/streams/inflate_ways.h"
#include "tests/sweeps/tally.h"

namespace pelm::sweeps {
namespace {

using test::Deflate;
using test::DynamicCodes;
using test::Last;

// Room for a decoder that looks far ahead, and for more than one long match.
constexpr size_t bytes_behind = 120;

class HuffmanSweep : public testing::Test {
protected:
    // What a block's codes are followed by: all zeros, all ones, or noise.
    Bytes data(uint32_t kind) {
        return kind < 2 ? Bytes(bytes_behind, kind == 0 ? uint8_t{0} : uint8_t{255}) : random.noise(bytes_behind);
    }

    // False when the stream was decompressed otherwise than by the model.
    bool holds(const Deflate &deflate) {
        ++streams;
        const std::string difference = ways.difference(zlib_of(deflate.bytes()), random);
        EXPECT_EQ(difference, "") << "stream " << streams;
        return difference.empty();
    }

    bool holds_with_data(const DynamicCodes &codes, uint32_t kind, Last last = Last::no) {
        Deflate deflate;
        deflate.block_header(2, last);
        deflate.dynamic_header(codes);
        deflate.bits.put(random.next(), random.below(8));
        for (const uint8_t byte : data(kind))
            deflate.bits.put(byte, 8);
        return holds(deflate);
    }

    Random random{1};
    InflateWays ways;
    uint64_t streams = 0;
};

DynamicCodes codes_of(size_t literals, size_t distances) {
    DynamicCodes codes;
    codes.literal_lengths = Bytes(literals);
    codes.distance_lengths = Bytes(distances);
    return codes;
}

// Number n of all combinations of lengths below `base` for these symbols.
void set_lengths(Bytes &lengths, const std::vector<uint32_t> &symbols, uint32_t n, uint32_t base) {
    for (const uint32_t symbol : symbols) {
        lengths[symbol] = static_cast<uint8_t>(n % base);
        n /= base;
    }
}

uint32_t power(uint32_t base, size_t exponent) {
    return exponent == 0 ? 1 : base * power(base, exponent - 1);
}

TEST_F(HuffmanSweep, every_code_of_two_literals_an_end_a_length_and_two_distances) {
    const std::vector<uint32_t> literals = {'a', 'b', 256, 257}, distances = {0, 1};
    const uint32_t of_distances = power(3, distances.size());
    const uint32_t all = power(5, literals.size()) * of_distances;
    const uint32_t step = by_extent(71u, 11u, 1u);
    for (uint32_t n = 0; n < all; n += step) {
        DynamicCodes codes = codes_of(258, 2);
        set_lengths(codes.literal_lengths, literals, n / of_distances, 5);
        set_lengths(codes.distance_lengths, distances, n % of_distances, 3);
        for (uint32_t kind = 0; kind < 4; ++kind)
            if (!holds_with_data(codes, kind)) return;
    }
    tell("streams with codes of up to four bits", streams, 4 * 5625);
}

TEST_F(HuffmanSweep, every_length_of_a_literal_an_end_and_a_length) {
    const std::vector<uint32_t> literals = {200, 256, 285};
    const uint32_t all = power(16, literals.size());
    const uint32_t step = by_extent(41u, 5u, 1u);
    for (uint32_t n = 0; n < all; n += step) {
        DynamicCodes codes = codes_of(286, 2);
        codes.distance_lengths = {1, 1};
        set_lengths(codes.literal_lengths, literals, n, 16);
        for (const uint32_t kind : {0u, 1u, 2u})
            if (!holds_with_data(codes, kind)) return;
    }
    tell("streams with codes of any length", streams, 3 * 4096);
}

TEST_F(HuffmanSweep, every_code_of_four_distances) {
    const std::vector<uint32_t> distances = {0, 3, 29, 30};
    const uint32_t all = power(6, distances.size());
    const uint32_t step = by_extent(31u, 3u, 1u);
    for (uint32_t n = 0; n < all; n += step) {
        DynamicCodes codes = codes_of(286, 31);
        for (const uint32_t symbol : {120u, 256u, 258u, 285u})
            codes.literal_lengths[symbol] = 2;
        set_lengths(codes.distance_lengths, distances, n, 6);
        for (uint32_t kind = 0; kind < 4; ++kind)
            if (!holds_with_data(codes, kind)) return;
    }
    tell("streams with any distances", streams, 4 * 1296);
}

TEST_F(HuffmanSweep, every_code_of_few_code_lengths) {
    struct Few {
        uint32_t sent, base; // codes, and how many lengths each may have
    };
    const uint32_t step = by_extent(61u, 7u, 1u);
    for (const Few &few : {Few{4, 8}, Few{6, 4}, Few{8, 3}}) {
        for (uint32_t n = 0; n < power(few.base, few.sent); n += step) {
            for (uint32_t i = 0; i < 2; ++i) {
                Deflate deflate;
                deflate.block_header(2, Last::no);
                deflate.bits.put(random.next(), 10);
                deflate.bits.put(few.sent - 4, 4);
                for (uint32_t rest = n, k = 0; k < few.sent; ++k, rest /= few.base)
                    deflate.bits.put(rest % few.base, 3);
                for (const uint8_t byte : data(2))
                    deflate.bits.put(byte, 8);
                if (!holds(deflate)) return;
            }
        }
    }
    tell("streams with any code-length codes", streams, 2 * (4096 + 4096 + 6561));
}

// Blocks of any codes: elements of theirs, then noise. Some of them begin where the window is about to wrap.
class FullSize : public HuffmanSweep, public testing::WithParamInterface<uint32_t> {
protected:
    DynamicCodes any_codes() {
        DynamicCodes codes;
        codes.literal_lengths = any_lengths(random, random.one_in(2) ? 286 : random.between(257, 288));
        codes.distance_lengths = any_lengths(random, random.one_in(2) ? 30 : random.between(1, 31));
        const bool has_complete_distances = random.one_in(3);
        if (has_complete_distances) codes.distance_lengths = complete_lengths(random, 30, 30, 0, 15, false);
        return codes;
    }

    static bool is_irregular(const DynamicCodes &codes) {
        return subscription_of(codes.literal_lengths) != Subscription::complete ||
               subscription_of(codes.distance_lengths) != Subscription::complete;
    }

    void count(const DynamicCodes &codes) {
        const Subscription subscription = subscription_of(codes.literal_lengths);
        over += subscription == Subscription::over ? 1 : 0;
        under += subscription == Subscription::under ? 1 : 0;
    }

    bool holds_with_elements(const DynamicCodes &codes) {
        Deflate deflate;
        if (random.one_in(3)) {
            const uint32_t size = random.one_in(2) ? 32768 - random.below(700) : random.below(400);
            deflate.stored(random.noise(size), Last::no);
        }
        deflate.block_header(2, random.one_in(2) ? Last::yes : Last::no);
        deflate.dynamic_header(codes);
        deflate.tokens(any_tokens(random, codes, random.below(120)), codes.literal_lengths, codes.distance_lengths);
        for (uint32_t left = random.below(300); left > 0; --left)
            deflate.bits.put(random.next(), 8);
        return holds(deflate);
    }

    uint64_t over = 0, under = 0;
};

TEST_P(FullSize, codes_over_and_under_subscribed) {
    random = Random(100 + GetParam());
    const uint32_t all = by_extent(20u, 500u, 5000u);
    for (uint32_t irregular = 0; irregular < all;) {
        const DynamicCodes codes = any_codes();
        if (!is_irregular(codes)) continue;
        ++irregular;
        count(codes);
        if (!holds_with_elements(codes)) return;
    }
    EXPECT_GT(over, all / 5);
    EXPECT_GT(under, all / 5);
    tell("streams with irregular codes", streams, 5000);
}

TEST_P(FullSize, complete_codes_of_up_to_15_bits) {
    random = Random(200 + GetParam());
    const uint32_t all = by_extent(20u, 500u, 5000u);
    for (uint32_t i = 0; i < all; ++i) {
        DynamicCodes codes;
        const bool lopsided = random.one_in(2);
        const uint32_t longest = random.between(9, 15);
        codes.literal_lengths = complete_lengths(random, 286, random.between(2, 286), 256, longest, lopsided);
        codes.distance_lengths =
            complete_lengths(random, 30, random.between(2, 30), 29, random.between(5, 15), lopsided);
        if (!holds_with_elements(codes)) return;
    }
    tell("streams with complete codes", streams, 5000);
}

INSTANTIATE_TEST_SUITE_P(Shards, FullSize, testing::Range(0u, 4u));

} // namespace
} // namespace pelm::sweeps

// Matches of every length at every distance, over the window's end and from before the stream's beginning.
#include <gtest/gtest.h>

#include "tests/sweeps/streams/code_sets.h"
#include "tests/sweeps/streams/inflate_ways.h"
#include "tests/sweeps/tally.h"

namespace pelm::sweeps {
namespace {

using test::Deflate;
using test::Last;
using test::Tokens;

constexpr uint32_t window = 32768;

class MatchSweep : public testing::TestWithParam<uint32_t> {
protected:
    bool holds(const Deflate &deflate) {
        ++streams;
        const std::string difference = ways.difference(zlib_of(deflate.bytes()), random);
        EXPECT_EQ(difference, "") << "stream " << streams;
        return difference.empty();
    }

    Random random{GetParam() + 300};
    InflateWays ways;
    uint64_t streams = 0;
};

// A literal behind each match, so that the next one has something else to repeat.
TEST_P(MatchSweep, every_length_at_every_distance) {
    constexpr uint32_t group = 64; // distances per stream
    const uint32_t step = by_extent(16384u, 2048u, group);
    uint64_t matches = 0;
    for (uint32_t first = 1 + group * GetParam(); first <= window; first += 4 * step) {
        Tokens tokens;
        for (uint32_t length = 3; length <= 258; ++length) {
            for (uint32_t distance = first; distance < first + group; ++distance) {
                tokens.push_back(test::match(length, distance));
                tokens.push_back(test::literal(random.byte()));
                ++matches;
            }
        }
        Deflate deflate;
        deflate.stored(random.noise(window + random.below(300)), Last::no);
        deflate.fixed(tokens, Last::yes);
        if (!holds(deflate)) return;
    }
    tell("matches", matches, 256 * window / 4);
}

constexpr uint32_t distances[] = {1,  2,  3,  4,   5,   7,   8,   9,   12,    15,    16,    17,
                                  31, 32, 33, 255, 257, 258, 259, 300, 16384, 32510, 32767, 32768};
constexpr uint32_t lengths[] = {3, 4, 7, 8, 9, 16, 17, 33, 64, 257, 258};

TEST_P(MatchSweep, over_the_windows_end_from_every_place_before_it) {
    const uint32_t step = by_extent(101u, 23u, 1u);
    for (uint32_t before_end = GetParam(); before_end < 330; before_end += 4) {
        for (uint32_t n = before_end % step; n < std::size(distances) * std::size(lengths); n += step) {
            const uint32_t literals = random.below(24);
            Tokens tokens = test::literals(random.noise(literals));
            tokens.push_back(test::match(lengths[n % std::size(lengths)], distances[n / std::size(lengths)]));
            for (uint32_t i = 0; i < 12; ++i) {
                tokens.push_back(test::literal(random.byte()));
                tokens.push_back(
                    test::match(random.between(3, 258), random.between(1, random.one_in(2) ? 40 : window)));
            }
            Deflate deflate;
            const uint32_t round = random.one_in(4) ? window : 0;
            const size_t size = round + window - before_end - literals;
            deflate.stored(random.noise(size % 4096), Last::no);
            deflate.stored(Bytes(size - size % 4096, random.byte()), Last::no);
            deflate.fixed(tokens, Last::yes);
            if (!holds(deflate)) return;
        }
    }
    tell("streams over the window's end", streams, 20000);
}

TEST_P(MatchSweep, from_before_the_beginning) {
    const uint32_t step = by_extent(101u, 11u, 1u);
    for (uint32_t before = GetParam(); before < 70; before += 4) {
        for (uint32_t n = before % step; n < std::size(distances) * std::size(lengths); n += step) {
            Tokens tokens = test::literals(random.noise(before));
            const uint32_t distance = before + distances[n / std::size(lengths)];
            tokens.push_back(test::match(lengths[n % std::size(lengths)], std::min(distance, window)));
            for (uint32_t i = 0; i < 20; ++i) {
                if (random.one_in(2)) tokens.push_back(test::literal(random.byte()));
                tokens.push_back(
                    test::match(random.between(3, 258), random.between(1, random.one_in(2) ? 900 : window)));
            }
            Deflate deflate;
            deflate.fixed(tokens, Last::yes);
            if (!holds(deflate)) return;
        }
    }
    tell("streams with matches from before the beginning", streams, 4400);
}

INSTANTIATE_TEST_SUITE_P(Shards, MatchSweep, testing::Range(0u, 4u));

} // namespace
} // namespace pelm::sweeps

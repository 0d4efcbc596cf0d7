// Streams of blocks of every kind, sound, damaged, cut short and cut into pieces: decompressed as the model does.
#include <gtest/gtest.h>

#include "tests/sweeps/streams/inflate_ways.h"
#include "tests/sweeps/streams/mixed_streams.h"
#include "tests/sweeps/tally.h"

namespace pelm::sweeps {
namespace {

class MixedStreams : public testing::TestWithParam<uint32_t> {
protected:
    bool holds(const Bytes &stream) {
        const std::string difference = ways.difference(stream, random);
        EXPECT_EQ(difference, "");
        return difference.empty();
    }

    bool holds(const Bytes &stream, const test::Inflation &expected, const Way &way) {
        const std::string difference = ways.difference(stream, expected, way);
        EXPECT_EQ(difference, "");
        return difference.empty();
    }

    Random random{GetParam() + 500};
    InflateWays ways;
};

TEST_P(MixedStreams, sound_damaged_and_cut_short) {
    const uint32_t all = by_extent(40u, 1000u, 40000u);
    uint32_t streams = 0;
    while (streams < all) {
        const Bytes sound = mixed_stream(random);
        if (!holds(sound)) return;
        for (uint32_t i = 0; i < 3; ++i)
            if (!holds(damaged(random, sound))) return;
        const Bytes begun(sound.begin(), sound.begin() + random.below(static_cast<uint32_t>(sound.size())));
        if (!holds(begun)) return;
        streams += 5;
    }
    tell("streams, sound and damaged", streams, 40000);
}

// Where a piece ends nothing else does: everywhere within codes, extra bits, headers, stored bytes.
TEST_P(MixedStreams, cut_into_two_at_every_place_and_into_small_pieces) {
    const uint32_t all = by_extent(1u, 3u, 60u);
    for (uint32_t i = 0; i < all; ++i) {
        const Bytes stream = short_mixed_stream(random, 900);
        const test::Inflation expected = ways.model.inflate(stream);
        for (uint32_t at = 1; at < stream.size(); ++at) {
            Way way{.pieces = {at, static_cast<uint32_t>(stream.size())}, .pause_at_blocks = at % 2 == 0};
            if (random.one_in(3)) way.stop_after = random.between(1, 300);
            if (!holds(stream, expected, way)) return;
        }
        for (uint32_t size = 1; size <= 40; ++size)
            if (!holds(stream, expected, {.pieces = {size}})) return;
    }
    tell("decodes of streams in pieces", ways.decodes, 60 * 400);
}

TEST_P(MixedStreams, ending_at_every_place) {
    const uint32_t all = by_extent(1u, 3u, 60u);
    for (uint32_t i = 0; i < all; ++i) {
        const Bytes stream = short_mixed_stream(random, 900);
        for (size_t size = 0; size < stream.size(); ++size) {
            const Bytes begun(stream.begin(), stream.begin() + static_cast<ptrdiff_t>(size));
            const test::Inflation &expected = ways.model.inflate(begun);
            if (!holds(begun, expected, {}) || !holds(begun, expected, {.pieces = {1}})) return;
        }
    }
    tell("decodes of streams cut short", ways.decodes, 60 * 400);
}

// Small outputs, so that a stop falls on every byte of every element.
TEST_P(MixedStreams, stopped_after_every_number_of_bytes) {
    const uint32_t all = by_extent(1u, 3u, 60u);
    for (uint32_t i = 0; i < all; ++i) {
        const Bytes stream = short_mixed_stream(random, 400);
        const test::Inflation expected = ways.model.inflate(stream);
        for (uint32_t stop_after = 1; stop_after < 600; ++stop_after)
            if (!holds(stream, expected, {.stop_after = stop_after, .pause_at_blocks = stop_after % 2 == 0})) return;
    }
    tell("decodes of streams with stops", ways.decodes, 60 * 599);
}

INSTANTIATE_TEST_SUITE_P(Shards, MixedStreams, testing::Range(0u, 4u));

} // namespace
} // namespace pelm::sweeps

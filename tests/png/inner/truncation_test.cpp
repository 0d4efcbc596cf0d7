// Streams that end too early: what was there is delivered, and the answer is not that the data was bad.
#include <gtest/gtest.h>

#include "tests/png/inner/inflating.h"

namespace pelm::test {

namespace {

// For each length of the stream, cut there: the answer by which kind of block the cut falls into.
void expect_ended(const Bytes &stream, size_t size, Stop wanted, const Bytes &whole) {
    for (const ptrdiff_t piece : {0, 1, 3})
        for (const uint32_t stop_after : {0u, 1u}) {
            const Options options = {.piece = piece, .stop_after = stop_after};
            const Outcome got = inflated({stream.begin(), stream.begin() + static_cast<ptrdiff_t>(size)}, options);
            ASSERT_EQ(got.stop, wanted) << size << " of " << stream.size() << " bytes, pieces of " << piece;
            ASSERT_LE(got.bytes.size(), whole.size());
            ASSERT_TRUE(std::equal(got.bytes.begin(), got.bytes.end(), whole.begin())) << size << " bytes";
        }
}

} // namespace

TEST(Truncation, of_a_fixed_block_delivers_every_symbol_that_is_complete) {
    const Bytes data = noise_bytes(60, 1);
    Deflate deflate;
    deflate.fixed(literals(data), Last::yes);
    const Bytes stream = joined({{0x78, 0x9C}, deflate.bytes()});
    for (size_t size = 0; size < stream.size(); ++size)
        ASSERT_NO_FATAL_FAILURE(expect_ended(stream, size, Stop::input_ended, data));
    // The code of the end has seven zeros: not even zeros that are not there stand for it.
    for (size_t size = 2; size < stream.size(); ++size) {
        size_t complete = 0;
        for (size_t bits = 3; complete < data.size(); ++complete) {
            bits += data[complete] < 144 ? 8 : 9;
            if (bits > 8 * (size - 2)) break;
        }
        const Outcome got = inflated({stream.begin(), stream.begin() + static_cast<ptrdiff_t>(size)});
        ASSERT_EQ(got.bytes.size(), complete) << size << " bytes";
    }
}

TEST(Truncation, of_matches) {
    Tokens tokens = literals(noise_bytes(300, 2));
    for (uint32_t i = 0; i < 40; ++i)
        tokens.push_back(match(11 + 6 * i, 257 + i));
    Deflate deflate;
    deflate.fixed(tokens, Last::yes);
    const Bytes stream = joined({{0x78, 0x9C}, deflate.bytes()});
    for (size_t size = 0; size < stream.size(); ++size)
        ASSERT_NO_FATAL_FAILURE(expect_ended(stream, size, Stop::input_ended, expand(tokens)));
}

TEST(Truncation, of_a_dynamic_block_and_its_head) {
    Tokens tokens = literals(noise_bytes(50, 3));
    tokens.push_back(match(200, 33));
    tokens.push_back(match(17, 5));
    Deflate deflate;
    deflate.dynamic(tokens, Last::yes);
    const Bytes stream = joined({{0x78, 0x9C}, deflate.bytes()});
    for (size_t size = 0; size < stream.size(); ++size)
        ASSERT_NO_FATAL_FAILURE(expect_ended(stream, size, Stop::input_ended, expand(tokens)));
}

TEST(Truncation, of_a_stored_block_and_its_length_is_named_otherwise) {
    const Bytes data = noise_bytes(40, 4);
    Deflate deflate;
    deflate.stored(data, Last::yes);
    const Bytes stream = joined({{0x78, 0x9C}, deflate.bytes()});
    for (size_t size = 0; size < stream.size(); ++size) {
        ASSERT_NO_FATAL_FAILURE(
            expect_ended(stream, size, size < 3 ? Stop::input_ended : Stop::input_ended_stored, data));
        const Outcome got = inflated({stream.begin(), stream.begin() + static_cast<ptrdiff_t>(size)});
        ASSERT_EQ(got.bytes.size(), size < 7 ? 0 : size - 7) << size << " bytes";
    }
}

TEST(Truncation, between_blocks) {
    Deflate deflate;
    deflate.stored({1, 2, 3}, Last::no);
    const Bytes stream = joined({{0x78, 0x9C}, deflate.bytes()});
    ASSERT_NO_FATAL_FAILURE(expect_ended(stream, stream.size(), Stop::input_ended, {1, 2, 3}));
    EXPECT_EQ(inflated(stream).bytes, (Bytes{1, 2, 3}));
}

TEST(Truncation, a_code_cut_short_is_not_taken_for_one_that_is_missing) {
    // 'a' 0, end 100; 101, 11 are nobody's. The cut leaves '1' or '10', and nothing is wrong with those.
    DynamicCodes codes;
    codes.literal_lengths = Bytes(257);
    codes.literal_lengths['a'] = 1;
    codes.literal_lengths[256] = 3;
    codes.distance_lengths = {0};
    for (size_t count = 0; count < 8; ++count) {
        Deflate deflate;
        deflate.dynamic(codes, literals(Bytes(count, 'a')), Last::yes);
        const Bytes stream = joined({{0x78, 0x9C}, deflate.bytes()});
        for (size_t size = 0; size < stream.size(); ++size)
            ASSERT_NO_FATAL_FAILURE(expect_ended(stream, size, Stop::input_ended, Bytes(count, 'a')));
    }
}

TEST(Truncation, what_is_not_needed_is_not_missed) {
    // The end of block is the last bit of the last byte.
    for (size_t count = 0; count < 16; ++count) {
        Deflate deflate;
        deflate.fixed(literals(Bytes(count, 200)), Last::yes);
        for (const ptrdiff_t piece : {0, 1}) {
            const Outcome got = inflated(joined({{0x78, 0x9C}, deflate.bytes()}), {.piece = piece});
            EXPECT_EQ(got.stop, Stop::finished) << count;
            EXPECT_EQ(got.bytes, Bytes(count, 200));
        }
    }
}

} // namespace pelm::test

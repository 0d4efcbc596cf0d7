#include <gtest/gtest.h>

#include "tests/png/inner/inflating.h"

namespace pelm::test {

namespace {

void expect_matches(const Bytes &before, const Tokens &tokens) {
    Deflate deflate;
    deflate.stored_blocks(before, 65535, Last::no);
    deflate.fixed(tokens, Last::yes);
    const Bytes wanted = joined({before, expand(tokens, before)});
    for (const Options &options : {Options{}, Options{.piece = 3}, Options{.stop_after = 19}}) {
        const Outcome got = inflated(zlib_stream(deflate), options);
        ASSERT_EQ(got.stop, Stop::finished);
        const auto [wrong, right] = std::mismatch(got.bytes.begin(), got.bytes.end(), wanted.begin(), wanted.end());
        ASSERT_TRUE(got.bytes == wanted) << got.bytes.size() << " bytes, expected " << wanted.size()
                                         << ", first difference at " << wrong - got.bytes.begin();
    }
}

Tokens all_lengths_at(uint32_t distance) {
    Tokens tokens;
    for (uint32_t length = 3; length <= 258; ++length) {
        tokens.push_back(match(length, distance));
        tokens.push_back(literal(length * 7)); // so that the next one has something else to repeat
    }
    return tokens;
}

// A copy of `length` bytes from before the beginning, as it is defined byte by byte.
Bytes lenient_copy(Bytes bytes, uint32_t length, size_t distance) {
    for (; length > 0 && bytes.size() < distance; --length)
        bytes.push_back(bytes.empty() ? uint8_t{0} : bytes[0]);
    for (; length > 0; --length)
        bytes.push_back(bytes[bytes.size() - distance]);
    return bytes;
}

} // namespace

TEST(Match, every_length_at_short_distances_repeats_what_it_writes) {
    for (uint32_t distance = 1; distance <= 40; ++distance)
        ASSERT_NO_FATAL_FAILURE(expect_matches(noise_bytes(64, distance), all_lengths_at(distance)))
            << "distance " << distance;
}

TEST(Match, every_length_at_long_distances) {
    const Bytes before = noise_bytes(33000, 1);
    for (const uint32_t distance : {255u, 256u, 257u, 258u, 259u, 1000u, 4096u, 16384u, 16385u, 24577u, 32000u, 32509u,
                                    32510u, 32511u, 32766u, 32767u, 32768u})
        ASSERT_NO_FATAL_FAILURE(expect_matches(before, all_lengths_at(distance))) << "distance " << distance;
}

TEST(Match, every_distance_is_reached) {
    const Bytes before = noise_bytes(32768, 2);
    Tokens tokens;
    for (uint32_t distance = 1; distance <= 32768; distance += distance < 600 ? 1 : 37)
        tokens.push_back(match(3 + distance % 7, distance));
    for (const uint32_t last : {8192u, 8193u, 12288u, 12289u, 24576u, 24577u, 32768u})
        tokens.push_back(match(5, last));
    expect_matches(before, tokens);
}

// Where the window is full for the first and the second time, and nowhere in particular.
constexpr size_t window_ends[] = {2 * window_size, window_full, window_full + window_room};

TEST(Match, across_the_windows_ends_from_every_place_before_them) {
    for (const size_t end : window_ends)
        for (const uint32_t distance : {1u, 2u, 3u, 258u, 300u, 32767u, 32768u})
            for (size_t before_end = 0; before_end <= 260; before_end += before_end < 3 ? 1 : 85) {
                const Bytes before = noise_bytes(end - before_end, 3);
                ASSERT_NO_FATAL_FAILURE(
                    expect_matches(before, {match(258, distance), literal(1), match(258, distance)}))
                    << "distance " << distance << ", " << before_end << " bytes before " << end;
            }
}

TEST(Match, whose_source_crosses_the_windows_ends) {
    for (const size_t end : window_ends)
        for (size_t behind_end = 0; behind_end <= 260; behind_end += behind_end < 3 ? 1 : 85) {
            const Bytes before = noise_bytes(end + behind_end, 4);
            for (uint32_t distance = 1; distance <= 520; distance += 29)
                ASSERT_NO_FATAL_FAILURE(expect_matches(before, {match(258, distance)}))
                    << "distance " << distance << ", " << behind_end << " bytes behind " << end;
        }
}

TEST(Match, beyond_the_beginning_gives_the_first_byte_until_the_distance_is_reached) {
    Deflate deflate;
    deflate.fixed({literal(0x41), literal(0x42), match(4, 5)}, Last::yes);
    EXPECT_EQ(inflated(zlib_stream(deflate)).bytes, (Bytes{0x41, 0x42, 0x41, 0x41, 0x41, 0x41}));
    EXPECT_EQ(inflated(zlib_stream(deflate)).stop, Stop::finished);
}

TEST(Match, beyond_the_beginning_from_every_place_and_distance) {
    for (const size_t before : {0u, 1u, 2u, 3u, 10u, 100u})
        for (const uint32_t distance : {1u, 2u, 3u, 4u, 5u, 9u, 11u, 12u, 99u, 101u, 300u, 1000u, 32767u, 32768u})
            for (const uint32_t length : {3u, 4u, 5u, 10u, 258u}) {
                const Bytes start = noise_bytes(before, 5);
                Tokens tokens = literals(start);
                tokens.push_back(match(length, distance));
                tokens.push_back(match(7, distance));
                Deflate deflate;
                deflate.fixed(tokens, Last::yes);
                const Bytes wanted = lenient_copy(lenient_copy(start, length, distance), 7, distance);
                for (const Options &options : {Options{}, Options{.stop_after = 1}, Options{.piece = 1}}) {
                    const Outcome got = inflated(zlib_stream(deflate), options);
                    ASSERT_EQ(got.stop, Stop::finished);
                    ASSERT_EQ(got.bytes, wanted) << before << " bytes, length " << length << " distance " << distance;
                }
            }
}

TEST(Match, beyond_the_beginning_up_to_a_whole_window) {
    // One byte, then copies at the largest distance: zeros of nothing, all the first byte until position 32768.
    Tokens tokens = {literal('x'), literal('y')};
    for (int i = 0; i < 140; ++i)
        tokens.push_back(match(258, 32768));
    Deflate deflate;
    deflate.fixed(tokens, Last::yes);
    Bytes wanted = {'x', 'y'};
    for (int i = 0; i < 140; ++i)
        wanted = lenient_copy(wanted, 258, 32768);
    const Outcome got = inflated(zlib_stream(deflate));
    EXPECT_EQ(got.stop, Stop::finished);
    EXPECT_TRUE(got.bytes == wanted);
}

// Distance symbol 30 can be sent in dynamic blocks: no extra bits on a base of 0.
TEST(Match, a_distance_of_0_repeats_what_the_window_held_a_whole_window_ago) {
    const Tokens tokens = {literal('a'), match_of_symbols(258, 0, 30, 0), literal('b')};
    DynamicCodes codes = codes_for(tokens);
    ASSERT_EQ(codes.distance_lengths.size(), 31u);
    Deflate at_start;
    at_start.dynamic(codes, tokens, Last::yes);
    const Outcome got = inflated(zlib_stream(at_start));
    EXPECT_EQ(got.stop, Stop::finished);
    EXPECT_EQ(got.bytes, (Bytes{'a', 0, 0, 0, 0, 'b'}));

    const Bytes before = noise_bytes(32768 + 100, 6);
    Deflate later;
    later.stored_blocks(before, 30000, Last::no);
    later.dynamic(codes, tokens, Last::yes);
    const Bytes wanted = joined({before, {'a'}, {before.begin() + 101, before.begin() + 105}, {'b'}});
    EXPECT_TRUE(inflated(zlib_stream(later)).bytes == wanted);

    const Bytes to_the_end(32768 - 3, 'e');
    Deflate across;
    across.stored(to_the_end, Last::no);
    across.dynamic(codes, tokens, Last::yes);
    EXPECT_TRUE(inflated(zlib_stream(across)).bytes == joined({to_the_end, {'a', 0, 0, 'e', 'e', 'b'}}));
}

TEST(Match, length_258_by_the_symbol_before_its_own) {
    // Symbol 284 with all extra bits set: 227 + 31.
    const Tokens tokens = {literal('q'), match_of_symbols(284, 31, 0, 0), match_of_symbols(285, 0, 0, 0)};
    Deflate deflate;
    deflate.fixed(tokens, Last::yes);
    EXPECT_EQ(inflated(zlib_stream(deflate)).bytes, Bytes(1 + 258 + 258, 'q'));
}

} // namespace pelm::test

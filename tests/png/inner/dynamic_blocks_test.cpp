// Blocks with codes of their own: incomplete, empty and over-subscribed ones, and how their lengths are sent.
#include <algorithm>

#include <gtest/gtest.h>

#include "tests/png/inner/inflating.h"

namespace pelm::test {

TEST(Inflate, an_incomplete_code_serves_as_long_as_its_gaps_are_not_met) {
    DynamicCodes codes;
    codes.literal_lengths = Bytes(257);
    codes.literal_lengths['a'] = 3;
    codes.literal_lengths[256] = 9;
    codes.distance_lengths = {0};
    Deflate deflate;
    deflate.dynamic(codes, literals(text_bytes("aaa")), Last::yes);
    expect_inflates_to(zlib_stream(deflate), text_bytes("aaa"));
}

TEST(Inflate, an_empty_literal_code_is_bad_at_its_first_use) {
    DynamicCodes codes;
    codes.literal_lengths = Bytes(257);
    codes.distance_lengths = {1};
    Deflate deflate;
    deflate.dynamic(codes, {}, Last::yes, EndOfBlock::left_out);
    expect_fails(deflate, Stop::bad_code);
}

TEST(Inflate, an_empty_code_length_code_is_bad) {
    DynamicCodes codes;
    codes.code_length_lengths = Bytes(19);
    codes.hlit = 0;
    codes.hdist = 0;
    codes.sequence = std::vector<LengthSymbol>();
    Deflate deflate;
    deflate.block_header(2, Last::yes);
    deflate.dynamic_header(codes);
    expect_fails(deflate, Stop::bad_code);
}

TEST(Inflate, a_block_without_distance_codes_may_hold_literals) {
    DynamicCodes codes = codes_for(literals(text_bytes("text")));
    codes.distance_lengths = {0};
    Deflate deflate;
    deflate.dynamic(codes, literals(text_bytes("text")), Last::yes);
    expect_inflates_to(zlib_stream(deflate), text_bytes("text"));
}

TEST(Inflate, over_subscribed_codes_decode_as_their_tree_says) {
    // Three codes of one bit: 0, 1, and 0 once more, which the last one keeps.
    DynamicCodes codes;
    codes.literal_lengths = Bytes(257);
    codes.literal_lengths['a'] = codes.literal_lengths['b'] = codes.literal_lengths[256] = 1;
    codes.distance_lengths = {0};
    Deflate deflate;
    deflate.dynamic(codes, {literal('b'), literal('b'), literal('a')}, Last::yes, EndOfBlock::left_out);
    expect_inflates_to(zlib_stream(deflate), text_bytes("bb"));
}

// Half of the long literal codes find their place in the table taken, and the longest distances.
TEST(Inflate, codes_that_the_tables_have_no_room_for_are_decoded_by_their_trees) {
    DynamicCodes codes;
    codes.literal_lengths = {1, 2, 3, 4};
    codes.literal_lengths.resize(4 + 254, 12);
    codes.literal_lengths.resize(4 + 254 + 16, 15);
    codes.distance_lengths = {1, 2, 3, 4, 5, 7, 8, 9};
    codes.distance_lengths.resize(8 + 17, 10);
    codes.distance_lengths.insert(codes.distance_lengths.end(), {11, 12, 13, 14, 15, 15});
    Tokens tokens;
    for (uint32_t byte = 0; byte < 256; ++byte)
        tokens.push_back(literal(byte));
    for (uint32_t distance_symbol = 0; distance_symbol < 30; ++distance_symbol)
        tokens.push_back(match_of_symbols(257 + distance_symbol % 17, 0, distance_symbol, 0));
    Deflate deflate;
    deflate.dynamic(codes, tokens, Last::no);
    deflate.fixed({}, Last::yes);
    expect_inflates_to(zlib_stream(deflate), expand(tokens));

    Inflater inflater(zlib_stream(deflate), {.pause_at_blocks = true});
    ASSERT_EQ(inflater.call(), Stop::block_ended);
    const BlockCodes &made = *inflater.state.dynamic;
    const uint32_t *const literals_end = made.literal_entries + (1u << made.literals.width);
    const uint32_t *const distances_end = made.distance_entries + (1u << made.distances.width);
    EXPECT_EQ(std::count(made.literal_entries, literals_end, exceptional_literal), 64);
    EXPECT_EQ(std::count(made.distance_entries, distances_end, exceptional_distance), 1);
    EXPECT_TRUE(made.trees_are_grown);
}

// Whether the code that no block uses still says what the test has made it say.
TEST(Inflate, a_block_with_the_code_lengths_of_the_one_before_is_decoded_by_its_tables) {
    const Tokens text = literals(text_bytes("some text"));
    Tokens longer = text;
    longer.push_back(literal('Z'));
    const DynamicCodes codes = codes_for(longer);
    Deflate deflate;
    deflate.dynamic(codes, text, Last::no);
    deflate.dynamic(codes, text, Last::no);
    deflate.fixed(text, Last::no);
    deflate.dynamic(codes, text, Last::no);
    deflate.dynamic(codes_for(text), text, Last::yes);
    Inflater inflater(zlib_stream(deflate), {.pause_at_blocks = true});
    ASSERT_EQ(inflater.call(), Stop::block_ended);
    BlockCodes &made = *inflater.state.dynamic;
    uint32_t *const end = made.literal_entries + (1u << made.literals.width);
    uint32_t *const of_z = std::find_if(made.literal_entries, end, [](uint32_t entry) {
        return (entry & entry_is_literal) != 0 && (entry >> 8 & 0xFF) == 'Z';
    });
    ASSERT_NE(of_z, end);
    const uint32_t marked = *of_z ^ 0x100;
    *of_z = marked;
    for (int block = 2; block <= 4; ++block) {
        ASSERT_EQ(inflater.call(), Stop::block_ended);
        EXPECT_EQ(*of_z, marked) << "block " << block;
    }
    EXPECT_EQ(inflater.call(), Stop::finished);
    EXPECT_NE(*of_z, marked) << "other code lengths";
    EXPECT_EQ(inflater.rows.bytes.size(), 5 * text.size());
}

namespace {

// A code of each length: 1 for the end, from 2 on for `first` and the literals behind it.
DynamicCodes stairs(size_t first) {
    DynamicCodes codes;
    codes.literal_lengths.resize(257);
    for (uint8_t length = 2; length <= 15; ++length)
        codes.literal_lengths[first + length - 2] = length;
    codes.literal_lengths[first + 14] = 15;
    codes.literal_lengths[256] = 1;
    return codes;
}

// All of these literals, over and over.
Tokens stairs_literals(uint32_t first, size_t count) {
    Tokens tokens;
    for (size_t i = 0; i < count; ++i)
        tokens.push_back(literal(first + static_cast<uint32_t>(i % 15)));
    return tokens;
}

} // namespace

// Wide ones would cost more than such blocks are worth.
TEST(Inflate, tables_behind_a_small_block_are_narrow_and_decode_the_same) {
    const struct {
        uint32_t first;
        size_t bytes;
        uint32_t width;
    } blocks[] = {{0, 15, 11}, {100, 0, 8}, {0, 1023, 8}, {50, 1024, 8}, {100, 1500, 11}, {20, 15, 11}, {100, 90, 8}};
    Deflate deflate;
    Tokens all;
    for (const auto &block : blocks) {
        const Tokens tokens = stairs_literals(block.first, block.bytes);
        deflate.dynamic(stairs(block.first), tokens, Last::no);
        all.insert(all.end(), tokens.begin(), tokens.end());
    }
    deflate.fixed({}, Last::yes);
    expect_inflates_to(zlib_stream(deflate), expand(all));

    Inflater inflater(zlib_stream(deflate), {.pause_at_blocks = true});
    for (const auto &block : blocks) {
        ASSERT_EQ(inflater.call(), Stop::block_ended);
        EXPECT_EQ(inflater.state.dynamic->literals.width, block.width)
            << "literals from " << block.first << " on, " << block.bytes << " bytes";
    }
}

namespace {

// 257 + 1 lengths in which 'a' and the end have codes of one bit, sent in runs.
DynamicCodes run_codes(const std::vector<LengthSymbol> &sequence, size_t distance_count = 1) {
    DynamicCodes codes;
    codes.literal_lengths = Bytes(257);
    codes.literal_lengths['a'] = codes.literal_lengths[256] = 1;
    codes.distance_lengths = Bytes(distance_count);
    codes.code_length_lengths = Bytes{3, 3, 3, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 3, 3, 3};
    codes.sequence = sequence;
    return codes;
}

const LengthSymbol zeros_97a = {18, 97 - 11}; // in front of 'a'
const LengthSymbol zeros_138 = {18, 127};
const LengthSymbol zeros_20 = {18, 9};

} // namespace

TEST(Inflate, runs_of_code_lengths) {
    // 97 zeros, 'a', 138 + 20 zeros, end, one distance
    Deflate deflate;
    deflate.dynamic(run_codes({zeros_97a, {1, 0}, zeros_138, zeros_20, {1, 0}, {0, 0}}), literals({'a', 'a'}),
                    Last::yes);
    expect_inflates_to(zlib_stream(deflate), {'a', 'a'});
}

TEST(Inflate, a_run_may_go_on_from_literal_into_distance_lengths_and_end_exactly_with_them) {
    // behind the end of block: five more ones for distances 0 to 4 would be over-subscribed but legal; here 16 repeats
    // the 1 of the end for three of four distances, and 17 ends with the last of seven
    DynamicCodes codes = run_codes({zeros_97a, {1, 0}, zeros_138, zeros_20, {1, 0}, {16, 0}, {17, 1}}, 7);
    codes.distance_lengths = {1, 1, 1, 0, 0, 0, 0};
    Deflate deflate;
    deflate.dynamic(codes, literals({'a'}), Last::yes);
    expect_inflates_to(zlib_stream(deflate), {'a'});

    DynamicCodes zeros = run_codes({zeros_97a, {1, 0}, zeros_138, zeros_20, {1, 0}, {18, 0}}, 11);
    Deflate with_zeros;
    with_zeros.dynamic(zeros, literals({'a'}), Last::yes);
    expect_inflates_to(zlib_stream(with_zeros), {'a'});
}

TEST(Inflate, a_run_beyond_the_last_length_is_bad) {
    struct Case {
        LengthSymbol run;
        size_t distances; // one fewer than the run is long
    };
    for (const Case &one :
         {Case{{16, 0}, 2}, {{16, 3}, 5}, {{17, 0}, 2}, {{17, 7}, 9}, {{18, 0}, 10}, {{18, 20}, 30}, {{18, 127}, 30}}) {
        Deflate deflate;
        deflate.block_header(2, Last::yes);
        deflate.dynamic_header(run_codes({zeros_97a, {1, 0}, zeros_138, zeros_20, {1, 0}, one.run}, one.distances));
        expect_fails(deflate, Stop::bad_stream);
    }
}

TEST(Inflate, a_repetition_before_any_length_is_bad) {
    Deflate deflate;
    deflate.block_header(2, Last::yes);
    deflate.dynamic_header(run_codes({{16, 0}}));
    expect_fails(deflate, Stop::bad_stream);
}

TEST(Inflate, a_repetition_repeats_zeros_of_a_run_too) {
    // 94 zeros, 3 zeros by repetition, 'a', ...
    Deflate deflate;
    deflate.dynamic(run_codes({{18, 94 - 11}, {16, 0}, {1, 0}, zeros_138, zeros_20, {1, 0}, {0, 0}}), literals({'a'}),
                    Last::yes);
    expect_inflates_to(zlib_stream(deflate), {'a'});
}

TEST(Inflate, a_distance_count_of_32_means_no_distance_lengths_at_all) {
    DynamicCodes codes = codes_for(literals(text_bytes("no distances")));
    codes.distance_lengths = {};
    codes.hdist = 31;
    Deflate deflate;
    deflate.dynamic(codes, literals(text_bytes("no distances")), Last::yes);
    expect_inflates_to(zlib_stream(deflate), text_bytes("no distances"));
    // and so a match has no distance to go on with
    DynamicCodes with_length = codes_for({literal('a'), symbol(257)});
    with_length.distance_lengths = {};
    with_length.hdist = 31;
    Deflate match_without_distance;
    match_without_distance.dynamic(with_length, {literal('a'), symbol(257)}, Last::yes);
    expect_fails(match_without_distance, Stop::bad_code, {'a'});
    // and a run that goes beyond the 257 others by one is too long
    DynamicCodes run = run_codes({zeros_97a, {1, 0}, zeros_138, {18, 22 - 11}}, 1);
    run.hdist = 31;
    Deflate too_long;
    too_long.block_header(2, Last::yes);
    too_long.dynamic_header(run);
    expect_fails(too_long, Stop::bad_stream);
}

TEST(Inflate, most_lengths_288_and_31) {
    Tokens tokens = {literal('a'), literal('b'), match(258, 2), match(11, 1)};
    DynamicCodes codes = codes_for(tokens);
    codes.literal_lengths.resize(288);
    codes.distance_lengths.resize(31);
    Deflate deflate;
    deflate.dynamic(codes, tokens, Last::yes);
    expect_inflates_to(zlib_stream(deflate), expand(tokens));
}

TEST(Inflate, fewer_code_length_codes_leave_the_others_without_a_code) {
    // Four: 16, 17, 18 and 0. A block of nothing but zeros has no code for its end.
    DynamicCodes codes;
    codes.literal_lengths = Bytes(257);
    codes.distance_lengths = Bytes(1);
    codes.code_length_lengths = Bytes{1, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 1};
    codes.hclen = 0;
    codes.sequence = {{zeros_138, {18, 258 - 138 - 11}}};
    Deflate deflate;
    deflate.dynamic(codes, {}, Last::yes, EndOfBlock::left_out);
    expect_fails(deflate, Stop::bad_code);
}

TEST(Inflate, blocks_of_their_own_codes_follow_each_other) {
    Deflate deflate;
    Bytes wanted;
    for (uint32_t i = 0; i < 40; ++i) {
        const Tokens tokens = {literal(i), literal(i * 5), literal(i * 11), match(3 + i, 1 + i % 3)};
        if (i % 3 == 0)
            deflate.fixed(tokens, i == 39 ? Last::yes : Last::no);
        else
            deflate.dynamic(tokens, i == 39 ? Last::yes : Last::no);
        wanted = joined({wanted, expand(tokens, wanted)});
    }
    expect_inflates_to(zlib_stream(deflate), wanted);
    expect_inflates_to(zlib_stream(deflate), wanted, {.piece = 1, .stop_after = 1, .pause_at_blocks = true});
}

} // namespace pelm::test

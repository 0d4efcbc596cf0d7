#include <algorithm>
#include <memory>

#include <gtest/gtest.h>

#include "png/inflate/fixed_codes.h"
#include "png/inflate/state.h"
#include "tests/png/inner/huffman_model.h"
#include "tests/png/inner/noise.h"

namespace pelm::test {

namespace {

struct Tables {
    std::unique_ptr<HuffmanNodePool> pool = std::make_unique<HuffmanNodePool>();
    std::unique_ptr<LookupTables> tables = std::make_unique<LookupTables>();
};

void fill(Tables &made, Symbol (&table)[lookup_entries], const Bytes &lengths, HuffmanAlphabetKind kind) {
    const HuffmanNode *const root =
        __PELMI_PngBuildHuffmanTable(lengths.data(), static_cast<uint32_t>(lengths.size()), kind, made.pool.get());
    fill_lookup<lookup_width>(table, made.pool->nodes, static_cast<uint32_t>(root - made.pool->nodes));
}

void expect_lookup_equals_walk(const Bytes &lengths, HuffmanAlphabetKind kind) {
    Tables made;
    reset_pool(*made.pool);
    __PELMI_PngBuildHuffmanTable(lengths.data(), 1, HUFFMAN_CODE_LENGTH, made.pool.get()); // some other tree in front
    fill(made, made.tables->literal, lengths, kind);
    const auto wrong = wrong_pattern(ModelTree(lengths, kind), made.tables->literal, made.pool->nodes);
    ASSERT_FALSE(wrong) << "bits " << *wrong << " of " << testing::PrintToString(lengths);
}

// A complete code: one code is split in two again and again.
Bytes complete_lengths(Random &random, size_t symbols) {
    Bytes lengths = {1, 1};
    while (lengths.size() < symbols) {
        const size_t at = random() % lengths.size();
        if (lengths[at] == 15) continue;
        lengths.push_back(++lengths[at]);
    }
    std::shuffle(lengths.begin(), lengths.end(), random);
    return lengths;
}

} // namespace

TEST(Lookup, the_constant_tables_are_those_of_the_fixed_code_lengths) {
    Tables made;
    reset_pool(*made.pool);
    fill(made, made.tables->literal, fixed_literal_lengths(), HUFFMAN_LITERAL_LENGTH);
    fill(made, made.tables->distance, fixed_distance_lengths(), HUFFMAN_DISTANCE);
    for (uint32_t i = 0; i < lookup_entries; ++i) {
        const Symbol literal = fixed_lookup.literal[i], built = made.tables->literal[i];
        EXPECT_TRUE(literal.value == built.value && literal.op == built.op && literal.bits == built.bits) << i;
        const Symbol distance = fixed_lookup.distance[i], built_distance = made.tables->distance[i];
        EXPECT_TRUE(distance.value == built_distance.value && distance.op == built_distance.op &&
                    distance.bits == built_distance.bits)
            << i;
    }
    EXPECT_FALSE(
        wrong_pattern(ModelTree(fixed_literal_lengths(), HUFFMAN_LITERAL_LENGTH), fixed_lookup.literal, nullptr));
    EXPECT_FALSE(wrong_pattern(ModelTree(fixed_distance_lengths(), HUFFMAN_DISTANCE), fixed_lookup.distance, nullptr));
}

TEST(Lookup, finds_for_every_pattern_what_the_walk_finds_in_complete_codes) {
    Random random(1);
    for (const size_t symbols : {2u, 3u, 16u, 100u, 257u, 286u, 288u})
        for (int round = 0; round < 8; ++round)
            ASSERT_NO_FATAL_FAILURE(
                expect_lookup_equals_walk(complete_lengths(random, symbols), HUFFMAN_LITERAL_LENGTH));
    for (int round = 0; round < 16; ++round)
        ASSERT_NO_FATAL_FAILURE(expect_lookup_equals_walk(complete_lengths(random, 31), HUFFMAN_DISTANCE));
}

TEST(Lookup, finds_for_every_pattern_what_the_walk_finds_in_any_other_code) {
    Random random(2);
    for (int round = 0; round < 100; ++round) {
        const bool distances = round % 4 == 0;
        Bytes lengths(distances ? 1 + random() % 31 : 257 + random() % 32);
        const uint32_t unused = random() % 100, longest = random() % 15 + 1;
        for (uint8_t &length : lengths)
            length = static_cast<uint8_t>(random() % 100 < unused ? 0 : 1 + random() % longest);
        ASSERT_NO_FATAL_FAILURE(
            expect_lookup_equals_walk(lengths, distances ? HUFFMAN_DISTANCE : HUFFMAN_LITERAL_LENGTH));
    }
}

TEST(Lookup, codes_of_every_single_length_are_found) {
    for (uint8_t length = 1; length <= 15; ++length)
        for (const size_t symbols : {1u, 2u, 3u, 288u})
            ASSERT_NO_FATAL_FAILURE(expect_lookup_equals_walk(Bytes(symbols, length), HUFFMAN_LITERAL_LENGTH));
    ASSERT_NO_FATAL_FAILURE(expect_lookup_equals_walk(Bytes(288), HUFFMAN_LITERAL_LENGTH));
    ASSERT_NO_FATAL_FAILURE(
        expect_lookup_equals_walk({1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 15}, HUFFMAN_LITERAL_LENGTH));
}

} // namespace pelm::test

#include <algorithm>

#include <gtest/gtest.h>

#include "png/inflate/state.h"
#include "tests/png/inner/huffman_model.h"
#include "tests/png/inner/noise.h"
#include "tests/support/guarded_buffer.h"
#include "tests/support/test_host.h"

namespace pelm::test {

namespace {

// A pool that ends against an inaccessible page and begins with any contents.
struct Pool {
    Pool() {
        std::memset(pool, 0xCD, sizeof *pool);
        reset_pool(*pool);
    }
    const HuffmanNode *build(const Bytes &lengths, HuffmanAlphabetKind kind) {
        return __PELMI_PngBuildHuffmanTable(lengths.data(), static_cast<uint32_t>(lengths.size()), kind, pool);
    }
    const HuffmanNode &at(const HuffmanNode *root, const std::string &path) const {
        for (const char step : path)
            root = &pool->nodes[root->child[step == '0' ? 0 : 1]];
        return *root;
    }

    GuardedBuffer memory;
    HuffmanNodePool *pool = reinterpret_cast<HuffmanNodePool *>(memory.take(sizeof(HuffmanNodePool), Edge::end));
};

std::string text(const Bytes &lengths) {
    std::string list;
    for (const uint8_t length : lengths)
        list += std::to_string(length) + ' ';
    return list;
}

void expect_tree_as_defined(Pool &pool, const Bytes &lengths, HuffmanAlphabetKind kind) {
    const uint32_t before = pool.pool->nodeCount;
    const ModelTree wanted(lengths, kind);
    const HuffmanNode *const root = pool.build(lengths, kind);
    ASSERT_EQ(root, &pool.pool->nodes[before]);
    ASSERT_EQ(pool.pool->nodeCount - before, wanted.node_count()) << "lengths " << text(lengths);
    const auto found = difference(wanted, *pool.pool, root);
    ASSERT_FALSE(found) << *found << ", lengths " << text(lengths);
    ASSERT_LE(pool.pool->nodeCount, HUFFMAN_POOL_NODES) << "lengths " << text(lengths);
}

} // namespace

TEST(Huffman, the_fixed_codes_give_the_fixed_trees) {
    Pool pool;
    expect_tree_as_defined(pool, fixed_literal_lengths(), HUFFMAN_LITERAL_LENGTH);
    EXPECT_EQ(pool.pool->nodeCount, 575u);
    expect_tree_as_defined(pool, fixed_distance_lengths(), HUFFMAN_DISTANCE);

    const HuffmanNode *const literals = &pool.pool->nodes[0];
    const HuffmanNode &end = pool.at(literals, "0000000");
    EXPECT_EQ(end.value, 256u);
    EXPECT_EQ(end.op, 10u);
    EXPECT_EQ(end.codeLength, 7u);
    const HuffmanNode &zero = pool.at(literals, "00110000");
    EXPECT_EQ(zero.value, 0u);
    EXPECT_EQ(zero.op, 0u);
    EXPECT_EQ(zero.codeLength, 8u);
    const HuffmanNode &last = pool.at(literals, "111111111");
    EXPECT_EQ(last.value, 255u);
    EXPECT_EQ(last.codeLength, 9u);
}

TEST(Huffman, a_leaf_carries_base_and_extra_bits_of_its_symbol) {
    Pool pool;
    const HuffmanNode *const lengths = pool.build(fixed_literal_lengths(), HUFFMAN_LITERAL_LENGTH);
    EXPECT_EQ(pool.at(lengths, "0000001").value, 3u); // 257
    EXPECT_EQ(pool.at(lengths, "0000001").op, 16u);
    EXPECT_EQ(pool.at(lengths, "0001001").value, 11u); // 265
    EXPECT_EQ(pool.at(lengths, "0001001").op, 17u);
    EXPECT_EQ(pool.at(lengths, "11000101").value, 258u); // 285
    EXPECT_EQ(pool.at(lengths, "11000101").op, 16u);
    for (const char *const path : {"11000110", "11000111"}) { // 286 and 287
        EXPECT_EQ(pool.at(lengths, path).value, 0u);
        EXPECT_EQ(pool.at(lengths, path).op, 112u);
    }
    const HuffmanNode *const distances = pool.build(Bytes(32, 5), HUFFMAN_DISTANCE);
    EXPECT_EQ(pool.at(distances, "00000").value, 1u);
    EXPECT_EQ(pool.at(distances, "00000").op, 16u);
    EXPECT_EQ(pool.at(distances, "11101").value, 24577u);
    EXPECT_EQ(pool.at(distances, "11101").op, 29u);
    EXPECT_EQ(pool.at(distances, "11110").value, 0u); // 30
    EXPECT_EQ(pool.at(distances, "11110").op, 16u);
    EXPECT_EQ(pool.at(distances, "11111").value, 0u); // 31
    EXPECT_EQ(pool.at(distances, "11111").op, 0u);
}

TEST(Huffman, symbols_of_the_code_length_alphabet_stand_for_themselves) {
    Pool pool;
    expect_tree_as_defined(pool, Bytes(19, 5), HUFFMAN_CODE_LENGTH);
    expect_tree_as_defined(pool, {3, 3, 3, 3, 3, 3, 3, 0, 0, 0, 0, 0, 0, 0, 0, 0, 5, 5, 4}, HUFFMAN_CODE_LENGTH);
}

TEST(Huffman, a_single_symbol_leaves_the_other_branch_of_the_root_missing) {
    for (const auto kind : {HUFFMAN_LITERAL_LENGTH, HUFFMAN_DISTANCE, HUFFMAN_CODE_LENGTH})
        for (size_t symbol = 0; symbol < 19; ++symbol)
            for (uint8_t length = 1; length <= 15; ++length) {
                Pool pool;
                Bytes lengths(19);
                lengths[symbol] = length;
                expect_tree_as_defined(pool, lengths, kind);
                EXPECT_NE(pool.pool->nodes[0].child[0], 0u);
                EXPECT_EQ(pool.pool->nodes[0].child[1], 0u);
                EXPECT_EQ(pool.pool->nodeCount, 1u + length);
            }
}

TEST(Huffman, no_symbol_at_all_gives_a_root_without_branches) {
    Pool pool;
    expect_tree_as_defined(pool, Bytes(288), HUFFMAN_LITERAL_LENGTH);
    expect_tree_as_defined(pool, {}, HUFFMAN_DISTANCE);
    EXPECT_EQ(pool.pool->nodeCount, 2u);
}

TEST(Huffman, a_second_tree_leaves_the_first_one_of_the_pool_as_it_is) {
    Pool pool;
    const HuffmanNode *const first = pool.build(fixed_literal_lengths(), HUFFMAN_LITERAL_LENGTH);
    const std::vector<HuffmanNode> before(pool.pool->nodes, pool.pool->nodes + pool.pool->nodeCount);
    const HuffmanNode *const second = pool.build({1, 2, 3, 3}, HUFFMAN_DISTANCE);
    EXPECT_EQ(second - first, static_cast<ptrdiff_t>(before.size()));
    EXPECT_EQ(std::memcmp(first, before.data(), before.size() * sizeof(HuffmanNode)), 0);
    EXPECT_FALSE(difference(ModelTree({1, 2, 3, 3}, HUFFMAN_DISTANCE), *pool.pool, second));
}

TEST(Huffman, every_code_of_a_small_alphabet_is_built_as_defined) {
    struct Family {
        size_t symbols;
        uint8_t longest;
    };
    for (const Family family : {Family{3, 15}, {4, 6}, {5, 4}, {6, 3}, {9, 2}}) {
        Bytes lengths(family.symbols);
        for (bool done = false; !done;) {
            Pool pool;
            ASSERT_NO_FATAL_FAILURE(expect_tree_as_defined(pool, lengths, HUFFMAN_LITERAL_LENGTH));
            done = true;
            for (uint8_t &length : lengths) {
                if (++length <= family.longest) {
                    done = false;
                    break;
                }
                length = 0;
            }
        }
    }
}

TEST(Huffman, random_lengths_of_whole_blocks_are_built_as_defined_and_fit_the_pool) {
    Random random(11);
    uint32_t most_nodes = 0;
    Pool pool;
    for (int round = 0; round < 1500; ++round) {
        // Lengths between two random bounds, some of them unused.
        const uint32_t a = random() % 15 + 1, b = random() % 15 + 1, unused = random() % 100;
        const auto length = [&] {
            if (random() % 100 < unused) return uint8_t{0};
            return static_cast<uint8_t>(std::min(a, b) + random() % (std::max(a, b) - std::min(a, b) + 1));
        };
        Bytes literals(257 + random() % 32), distances(random() % 32);
        for (uint8_t &entry : literals)
            entry = length();
        for (uint8_t &entry : distances)
            entry = length();
        reset_pool(*pool.pool);
        ASSERT_NO_FATAL_FAILURE(expect_tree_as_defined(pool, literals, HUFFMAN_LITERAL_LENGTH));
        ASSERT_NO_FATAL_FAILURE(expect_tree_as_defined(pool, distances, HUFFMAN_DISTANCE));
        most_nodes = std::max(most_nodes, pool.pool->nodeCount);
    }
    EXPECT_LT(most_nodes, HUFFMAN_POOL_NODES);
}

// Codes of one length are neighbours and share their beginnings, so a few codes of every length, spread far apart by
// over-subscription, take the most nodes.
TEST(Huffman, the_most_spread_out_codes_fit_the_pool) {
    Random random(12);
    uint32_t most_nodes = 0;
    Pool pool;
    for (int round = 0; round < 4000; ++round) {
        Bytes literals(288, 15), distances(31, 15);
        size_t at = 0;
        for (uint8_t length = 1; length < 15; ++length)
            for (uint32_t n = random() % 20; n > 0 && at < literals.size(); --n)
                literals[at++] = length;
        at = 0;
        for (uint8_t length = 1; length < 15; ++length)
            for (uint32_t n = random() % 4; n > 0 && at < distances.size(); --n)
                distances[at++] = length;
        reset_pool(*pool.pool);
        pool.build(literals, HUFFMAN_LITERAL_LENGTH);
        pool.build(distances, HUFFMAN_DISTANCE);
        most_nodes = std::max(most_nodes, pool.pool->nodeCount);
    }
    EXPECT_LT(most_nodes, 1100u);
}

TEST(Huffman, over_subscribed_codes_keep_the_longer_code_or_the_later_symbol) {
    // Three codes of one bit: 0, 1 and again 0, which the last symbol takes.
    Pool pool;
    const HuffmanNode *const root = pool.build({1, 1, 1}, HUFFMAN_CODE_LENGTH);
    EXPECT_EQ(pool.at(root, "0").value, 2u);
    EXPECT_EQ(pool.at(root, "1").value, 1u);
    // Four bits' worth of place for two codes of one bit and one of two: 0, 1, and 100, cut to 00, built first. What
    // stands at 0 then is no leaf any more.
    reset_pool(*pool.pool);
    const HuffmanNode *const deeper = pool.build({1, 1, 2}, HUFFMAN_CODE_LENGTH);
    EXPECT_EQ(pool.at(deeper, "00").value, 2u);
    EXPECT_EQ(pool.at(deeper, "00").codeLength, 2u);
    EXPECT_NE(pool.at(deeper, "0").child[0], 0u);
}

TEST(Huffman, freeing_a_pool_clears_the_pointer_and_an_empty_one_is_left_alone) {
    TestHost &host = TestHost::get();
    host.reset();
    auto *pool = static_cast<HuffmanNodePool *>(ZOTARPELM_OsMalloc(sizeof(HuffmanNodePool)));
    PELMI_FreePNGHuffmanMemory(&pool);
    EXPECT_EQ(pool, nullptr);
    PELMI_FreePNGHuffmanMemory(&pool);
    PELMI_FreePNGHuffmanMemory(nullptr);
    EXPECT_TRUE(host.live_blocks().empty());
    EXPECT_TRUE(host.violations.empty());
    EXPECT_EQ(host.allocations, std::vector<uint32_t>{50008});
}

} // namespace pelm::test

#include "frame/finished_colours.h"

#include <gtest/gtest.h>

#include <random>

#include "frame/processor.h"
#include "tests/support/guarded_buffer.h"

namespace pelm::test {
namespace {

constexpr int32_t most_pixels = 6000;

template <int32_t size>
FinishedColours some_colours(uint32_t depth) {
    uint8_t pixels[4 * 256] = {};
    std::minstd_rand random(depth);
    for (size_t i = 0; i < sizeof pixels; ++i)
        if (i % 4 < size) pixels[i] = static_cast<uint8_t>(random() >> 8);
    FinishedColours colours;
    fill_finished_colours(colours, pixels, depth, size);
    return colours;
}

// Stretches of one byte and of many, short and long ones in turn.
std::vector<uint8_t> row_with_runs(size_t bytes, uint32_t seed) {
    std::minstd_rand random(seed);
    std::vector<uint8_t> row;
    while (row.size() < bytes) {
        const size_t length = (random() >> 8) % (random() % 2 == 0 ? 200 : 20);
        const bool is_flat = random() % 3 != 0;
        const auto value = static_cast<uint8_t>(random() >> 8);
        for (size_t i = 0; i < length; ++i)
            row.push_back(is_flat ? value : static_cast<uint8_t>(random() >> 8));
    }
    row.resize(bytes);
    return row;
}

// Samples and output both end at an inaccessible page.
template <int32_t depth, int32_t size>
void expect_colours_of_row(int32_t count, const std::vector<uint8_t> &row) {
    static const FinishedColours colours = some_colours<size>(depth);
    GuardedBuffer row_area, out_area;
    uint8_t *const samples = row_area.take(row.size(), Edge::end);
    std::copy(row.begin(), row.end(), samples);
    const auto bytes = static_cast<size_t>(count) * size;
    uint8_t *const out = out_area.take(bytes, Edge::end);
    write_dense_run<StoreFinished<size>>(FinishedRow<depth>{samples, &colours}, 0, count, out);
    for (int32_t x = 0; x < count; ++x)
        ASSERT_EQ(memcmp(out + ptrdiff_t{x} * size, &colours.pixels[packed_sample<depth>(row.data(), x)], size), 0)
            << "pixel " << x << " of " << count << ", " << depth << " bits, " << size << " bytes";
}

template <int32_t depth, int32_t size>
void expect_colours_of_samples(int32_t count, uint32_t seed) {
    expect_colours_of_row<depth, size>(count, row_with_runs(static_cast<size_t>(count * depth + 7) / 8, seed));
}

// Bytes below 16, but for the one at `large`.
std::vector<uint8_t> row_of_small_samples(size_t bytes, size_t large) {
    std::vector<uint8_t> row = row_with_runs(bytes, 5);
    for (uint8_t &byte : row)
        byte &= 15;
    if (large < bytes) row[large] = 16;
    return row;
}

template <int32_t depth>
void expect_colours_in_every_size() {
    // Lengths around those from which rows are looked at for runs, and long rows.
    for (const int32_t bytes : {1, 7, 8, 255, 256, 257, 263, 264, 700})
        for (int32_t more = 0; more < 8 / depth; ++more)
            for (uint32_t seed = 1; seed <= 3; ++seed) {
                const int32_t count = std::min(bytes * 8 / depth + more, most_pixels);
                expect_colours_of_samples<depth, 2>(count, seed);
                expect_colours_of_samples<depth, 3>(count, seed);
                expect_colours_of_samples<depth, 4>(count, seed);
            }
}

} // namespace

TEST(FinishedColours, are_those_of_the_samples_in_runs_and_between_them) {
    expect_colours_in_every_size<1>();
    expect_colours_in_every_size<2>();
    expect_colours_in_every_size<4>();
    expect_colours_in_every_size<8>();
}

TEST(FinishedColours, are_those_of_the_samples_where_sixteen_colours_do) {
    for (const int32_t count : {15, 16, 255, 256, 257, 271, 272, 300})
        for (const int32_t large : {0, 1, 15, 16, 17, 31, 250, 299, 300}) {
            const auto row = row_of_small_samples(static_cast<size_t>(count), static_cast<size_t>(large));
            expect_colours_of_row<8, 2>(count, row);
            expect_colours_of_row<8, 3>(count, row);
            expect_colours_of_row<8, 4>(count, row);
        }
}

TEST(FinishedColours, of_sixteen_are_written_by_shuffles_up_to_a_larger_sample) {
    if (kernels() < Kernels::shuffles) return;
    const FinishedColours colours = some_colours<4>(8);
    std::vector<uint8_t> out(4 * 64);
    for (const int32_t large : {0, 15, 16, 40, 63, 64}) {
        const auto row = row_of_small_samples(64, static_cast<size_t>(large));
        EXPECT_EQ(write_sixteen_colours(colours.pixels, 4, row.data(), 64, out.data()), large / 16 * 16) << large;
        EXPECT_EQ(write_sixteen_colours(colours.pixels, 2, row.data(), 63, out.data()), std::min(large, 48) / 16 * 16);
    }
}

TEST(FinishedColours, of_a_row_of_one_sample_fill_it) {
    std::vector<uint8_t> out(4 * 4096);
    const FinishedColours colours = some_colours<4>(8);
    const std::vector<uint8_t> row(4096, 77);
    EXPECT_TRUE(hints_of_row(row.data(), 4096).has_runs);
    write_dense_run<StoreFinished<4>>(FinishedRow<8>{row.data(), &colours}, 0, 4096, out.data());
    for (size_t x = 0; x < row.size(); ++x)
        ASSERT_EQ(memcmp(&out[4 * x], &colours.pixels[77], 4), 0) << x;
}

} // namespace pelm::test

#include <cstdlib>

#include <gtest/gtest.h>

#include "png/unfilter.h"
#include "tests/png/inner/noise.h"
#include "tests/png/support/png_builder.h"
#include "tests/support/guarded_buffer.h"

namespace pelm::test {

namespace {

constexpr uint8_t distances[] = {1, 2, 3, 4, 6, 8};

int32_t paeth(int32_t a, int32_t b, int32_t c) {
    const int32_t pa = std::abs(b - c), pb = std::abs(a - c), pc = std::abs(a + b - 2 * c);
    if (pa <= pb && pa <= pc) return a;
    return pb <= pc ? b : c;
}

// The table of filters, byte by byte.
Bytes unfiltered(uint8_t filter, Bytes row, const Bytes &above, uint32_t distance) {
    if (filter > 4 && !row.empty()) row[0] = 0;
    for (size_t i = 0; i < row.size(); ++i) {
        const int32_t a = i < distance ? 0 : row[i - distance];
        const int32_t b = above[i];
        const int32_t c = i < distance ? 0 : above[i - distance];
        int32_t x = row[i];
        if (filter == 1) x += a;
        if (filter == 2) x += b;
        if (filter == 3) x += (a + b) >> 1;
        if (filter == 4) x += paeth(a, b, c);
        row[i] = static_cast<uint8_t>(x);
    }
    return row;
}

// Both rows end flush against an inaccessible page.
Bytes by_decoder(uint8_t filter, const Bytes &row, const Bytes &above, uint8_t distance) {
    GuardedBuffer row_memory, above_memory;
    uint8_t *const now = row_memory.take(row.size() + 1, Edge::end);
    uint8_t *const before = above_memory.take(above.size(), Edge::end);
    now[0] = filter;
    std::copy(row.begin(), row.end(), now + 1);
    std::copy(above.begin(), above.end(), before);
    PngDecodeState state{};
    state.bytesPerPixel = distance;
    __PELMI_PngReadFilterRow(&state, now + 1, before, static_cast<uint32_t>(row.size()));
    EXPECT_TRUE(row_memory.intact() && above_memory.intact());
    EXPECT_EQ(now[0], filter);
    EXPECT_EQ(Bytes(before, before + above.size()), above);
    return Bytes(now + 1, now + 1 + row.size());
}

} // namespace

TEST(Unfilter, every_filter_at_every_distance_and_length_equals_the_plain_definition) {
    for (const uint8_t distance : distances)
        for (uint8_t filter = 0; filter <= 6; ++filter)
            for (size_t length = 0; length <= 40; ++length)
                for (uint32_t seed = 1; seed <= 3; ++seed) {
                    const Bytes row = noise_bytes(length, seed), above = noise_bytes(length, seed + 100);
                    ASSERT_EQ(by_decoder(filter, row, above, distance), unfiltered(filter, row, above, distance))
                        << "filter " << int{filter} << " distance " << int{distance} << " length " << length;
                }
}

TEST(Unfilter, undoes_what_an_encoder_did) {
    for (const uint8_t distance : distances)
        for (uint8_t filter = 0; filter <= 4; ++filter) {
            const Bytes row = noise_bytes(1000, 7), above = noise_bytes(1000, 8);
            const Bytes filtered = filtered_row(filter, row, above, distance);
            EXPECT_EQ(by_decoder(filter, {filtered.begin() + 1, filtered.end()}, above, distance), row)
                << "filter " << int{filter} << " distance " << int{distance};
        }
}

TEST(Unfilter, below_a_row_of_zeros) {
    const Bytes row = {10, 20, 30, 40, 250}, zeros(5);
    EXPECT_EQ(by_decoder(2, row, zeros, 2), row);
    EXPECT_EQ(by_decoder(3, row, zeros, 2), (Bytes{10, 20, 35, 50, static_cast<uint8_t>(250 + 17)}));
    EXPECT_EQ(by_decoder(4, row, zeros, 2), (Bytes{10, 20, 40, 60, static_cast<uint8_t>(250 + 40)}));
    EXPECT_EQ(by_decoder(1, row, zeros, 2), by_decoder(4, row, zeros, 2));
}

TEST(Unfilter, a_row_shorter_than_a_pixel) {
    const Bytes row = {1, 2, 3}, above = {100, 200, 255};
    EXPECT_EQ(by_decoder(1, row, above, 4), row);
    EXPECT_EQ(by_decoder(2, row, above, 4), (Bytes{101, 202, 2}));
    EXPECT_EQ(by_decoder(3, row, above, 4), (Bytes{51, 102, 130}));
    EXPECT_EQ(by_decoder(4, row, above, 4), (Bytes{101, 202, 2}));
}

TEST(Unfilter, an_unknown_filter_only_clears_the_first_byte) {
    for (int filter = 5; filter <= 255; ++filter) {
        const Bytes row = {9, 8, 7, 6}, above = {1, 1, 1, 1};
        EXPECT_EQ(by_decoder(static_cast<uint8_t>(filter), row, above, 1), (Bytes{0, 8, 7, 6})) << "filter " << filter;
        EXPECT_EQ(by_decoder(static_cast<uint8_t>(filter), {}, {}, 1), Bytes()) << "filter " << filter;
    }
}

TEST(Unfilter, the_average_keeps_the_carry_of_its_sum) {
    EXPECT_EQ(by_decoder(3, {255, 1}, {0, 255}, 1), (Bytes{255, 0}));
}

TEST(Unfilter, ties_of_the_paeth_predictor_go_to_left_then_above) {
    for (int a = 0; a < 256; a += 5)
        for (int b = 0; b < 256; b += 5)
            for (int c = 0; c < 256; c += 3) {
                const Bytes above = {static_cast<uint8_t>(c), static_cast<uint8_t>(b)};
                const Bytes row = {static_cast<uint8_t>(a - c), 0};
                PngDecodeState state{};
                state.bytesPerPixel = 1;
                Bytes now = {4, row[0], row[1]};
                __PELMI_PngReadFilterRow(&state, now.data() + 1, above.data(), 2);
                ASSERT_EQ(now[2], paeth(a, b, c)) << a << ' ' << b << ' ' << c;
            }
}

} // namespace pelm::test

#include <cstdlib>

#include <gtest/gtest.h>

#include "png/unfilter.h"
#include "tests/png/inner/noise.h"
#include "tests/png/support/png_builder.h"
#include "tests/support/guarded_buffer.h"
#include "tests/support/kernels.h"
#include "tests/sweeps/extent.h"

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

// Rows between inaccessible pages, at whose start or end they lie.
class Rows {
public:
    explicit Rows(Edge edge)
        : edge_(edge), now_(now_memory_.take(room, edge)), above_(above_memory_.take(room, edge)) {}

    Bytes by_decoder(uint8_t filter, const Bytes &row, const Bytes &above, uint8_t distance) {
        const bool at_end = edge_ == Edge::end;
        uint8_t *const now = at_end ? now_ + room - row.size() - 1 : now_;
        uint8_t *const before = at_end ? above_ + room - above.size() : above_;
        now[0] = filter;
        std::copy(row.begin(), row.end(), now + 1);
        std::copy(above.begin(), above.end(), before);
        if (!at_end) now[row.size() + 1] = 0xA7;
        if (at_end) now[-1] = 0xA7;
        PngDecodeState state{};
        state.bytesPerPixel = distance;
        __PELMI_PngReadFilterRow(&state, now + 1, before, static_cast<uint32_t>(row.size()));
        EXPECT_EQ(at_end ? now[-1] : now[row.size() + 1], 0xA7) << "written beside the row";
        EXPECT_EQ(now[0], filter);
        EXPECT_EQ(Bytes(before, before + above.size()), above);
        return Bytes(now + 1, now + 1 + row.size());
    }

private:
    static constexpr size_t room = 4096;
    Edge edge_;
    GuardedBuffer now_memory_, above_memory_;
    uint8_t *now_, *above_;
};

Bytes by_decoder(uint8_t filter, const Bytes &row, const Bytes &above, uint8_t distance) {
    return Rows(Edge::end).by_decoder(filter, row, above, distance);
}

// Neighbours that are often alike, as pictures have them: the predictors' ties and zeros.
Bytes smooth_bytes(size_t size, uint32_t seed) {
    Bytes bytes = noise_bytes(size, seed);
    for (uint8_t &byte : bytes)
        byte = static_cast<uint8_t>((byte & 3) == 0 ? byte : 250 + (byte & 7));
    return bytes;
}

void compare_with_definition(size_t length, uint8_t distance, uint8_t filter, Rows &at_start, Rows &at_end) {
    for (uint32_t seed = 1; seed <= 2; ++seed) {
        const auto make = seed == 1 ? noise_bytes : smooth_bytes;
        const auto own_seed = static_cast<uint32_t>(length) * 8 + seed;
        const Bytes row = make(length, own_seed), above = make(length, own_seed + 10000);
        const Bytes expected = unfiltered(filter, row, above, distance);
        for (Rows *rows : {&at_start, &at_end})
            ASSERT_EQ(rows->by_decoder(filter, row, above, distance), expected)
                << "filter " << int{filter} << " distance " << int{distance} << " length " << length;
    }
}

} // namespace

TEST(Unfilter, every_filter_at_every_distance_and_length_equals_the_plain_definition) {
    Rows at_start(Edge::start), at_end(Edge::end);
    for (const Kernels kind : all_kernels()) {
        const WithKernels with(kind);
        SCOPED_TRACE(static_cast<int>(kind));
        for (const uint8_t distance : distances)
            for (uint8_t filter = 0; filter <= 6; ++filter)
                for (size_t length = 0; length <= 200; ++length)
                    ASSERT_NO_FATAL_FAILURE(compare_with_definition(length, distance, filter, at_start, at_end));
    }
}

// Those that PNG does not have, too.
TEST(Unfilter, every_other_distance_equals_the_plain_definition) {
    Rows at_start(Edge::start), at_end(Edge::end);
    for (const Kernels kind : all_kernels()) {
        const WithKernels with(kind);
        SCOPED_TRACE(static_cast<int>(kind));
        for (const uint8_t distance : std::initializer_list<uint8_t>{5, 7, 9, 100, 255})
            for (uint8_t filter = 0; filter <= 4; ++filter)
                for (size_t length = 0; length <= 40; ++length)
                    ASSERT_NO_FATAL_FAILURE(compare_with_definition(length, distance, filter, at_start, at_end));
    }
}

// Pictures with flat places: stretches of one pixel over and over, as residuals zeros, and here and there a byte that
// is not.
Bytes flat_places(size_t size, const Bytes &pixel, uint32_t seed) {
    Random random(seed);
    Bytes bytes(size);
    for (size_t i = 0; i < size;) {
        const size_t end = std::min(size, i + 1 + random() % 300);
        const bool is_flat = random() % 4 != 0;
        for (; i < end; ++i)
            bytes[i] = is_flat ? pixel[i % pixel.size()] : static_cast<uint8_t>(random() >> 24);
    }
    if (size > 0 && seed % 2 == 0) ++bytes[random() % size];
    return bytes;
}

TEST(Unfilter, flat_places_equal_the_plain_definition) {
    Rows at_start(Edge::start), at_end(Edge::end);
    for (const uint8_t distance : distances)
        for (uint32_t seed = 1; seed <= 400; ++seed) {
            const size_t length = 50 + seed * 5;
            const Bytes row = flat_places(length, Bytes(1), seed);
            const Bytes above = flat_places(length, noise_bytes(distance, seed), seed + 1000);
            const Bytes expected = unfiltered(4, row, above, distance);
            for (const Kernels kind : all_kernels()) {
                const WithKernels with(kind);
                for (Rows *rows : {&at_start, &at_end})
                    ASSERT_EQ(rows->by_decoder(4, row, above, distance), expected)
                        << "distance " << int{distance} << " length " << length << ", kernels "
                        << static_cast<int>(kind);
            }
        }
}

// Zeros as residuals are what makes a row that is mostly like the one above it, whatever that looks like.
TEST(Unfilter, rows_like_those_above_come_back) {
    Rows at_start(Edge::start), at_end(Edge::end);
    for (const uint8_t distance : distances)
        for (uint32_t seed = 1; seed <= 400; ++seed) {
            Random random(seed);
            const size_t length = 50 + seed * 5;
            const Bytes above = noise_bytes(length, seed);
            Bytes row = above;
            for (uint32_t changes = random() % 6; changes > 0; --changes) {
                const size_t from = random() % length, end = std::min<size_t>(length, from + 1 + random() % 40);
                for (size_t i = from; i < end; ++i)
                    row[i] = static_cast<uint8_t>(random() >> 24);
            }
            const Bytes filtered = filtered_row(4, row, above, distance);
            for (const Kernels kind : all_kernels()) {
                const WithKernels with(kind);
                for (Rows *rows : {&at_start, &at_end})
                    ASSERT_EQ(rows->by_decoder(4, {filtered.begin() + 1, filtered.end()}, above, distance), row)
                        << "distance " << int{distance} << " length " << length << ", kernels "
                        << static_cast<int>(kind);
            }
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

// Below bytes c and b in turn lie all bytes a and the one after each: every second predictor sees a, b and c.
TEST(Unfilter, the_paeth_predictor_is_right_for_all_neighbours) {
    const auto b_step = sweeps::by_extent(17u, 5u, 1u), c_step = sweeps::by_extent(15u, 3u, 1u);
    for (const uint32_t distance : distances) {
        PngDecodeState state{};
        state.bytesPerPixel = static_cast<uint8_t>(distance);
        Bytes row(512 * distance), above(512 * distance);
        for (size_t i = 0; i < row.size(); ++i)
            row[i] = static_cast<uint8_t>(i / distance % 2 == 0 ? i / distance / 2 : i * 37);
        for (uint32_t b = 0; b < 256; b += b_step)
            for (uint32_t c = 0; c < 256; c += c_step) {
                for (size_t i = 0; i < above.size(); ++i)
                    above[i] = static_cast<uint8_t>(i / distance % 2 == 0 ? c : b);
                const Bytes filtered = filtered_row(4, row, above, distance);
                for (const Kernels kind : all_kernels()) {
                    const WithKernels with(kind);
                    Bytes now = filtered;
                    __PELMI_PngReadFilterRow(&state, now.data() + 1, above.data(), static_cast<uint32_t>(row.size()));
                    ASSERT_TRUE(std::equal(row.begin(), row.end(), now.begin() + 1, now.end()))
                        << "b " << b << " c " << c << ", distance " << distance << ", kernels "
                        << static_cast<int>(kind);
                }
            }
    }
}

} // namespace pelm::test

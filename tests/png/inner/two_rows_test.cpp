#include <gtest/gtest.h>

#include "png/unfilter_plain.h"
#include "png/unfilter_two_rows.h"
#include "tests/png/inner/noise.h"
#include "tests/support/guarded_buffer.h"
#include "tests/support/kernels.h"

namespace pelm::test {

namespace {

constexpr uint8_t filters[] = {FILTER_AVERAGE, FILTER_PAETH};

// Three rows, each between inaccessible pages, at whose start or end it lies.
class ThreeRows {
public:
    explicit ThreeRows(Edge edge) : edge_(edge) {
        for (size_t i = 0; i < 3; ++i)
            memory_[i] = areas_[i].take(room, edge);
    }

    // Where the row of this length lies, filled.
    uint8_t *fill(size_t i, const Bytes &bytes) {
        uint8_t *const row = edge_ == Edge::end ? memory_[i] + room - bytes.size() : memory_[i];
        std::copy(bytes.begin(), bytes.end(), row);
        return row;
    }

private:
    static constexpr size_t room = 1024;
    Edge edge_;
    GuardedBuffer areas_[3];
    uint8_t *memory_[3];
};

void compare(ThreeRows &memory, size_t length, uint8_t distance, uint8_t first_filter, uint8_t second_filter) {
    const auto seed = static_cast<uint32_t>(length);
    const Bytes above = noise_bytes(length, seed + 1);
    Bytes first = noise_bytes(length, seed + 2), second = noise_bytes(length, seed + 3);
    const auto count = static_cast<uint32_t>(length);
    const TwoRows rows = {.first = memory.fill(0, first),
                          .second = memory.fill(1, second),
                          .above = memory.fill(2, above),
                          .length = count,
                          .distance = distance,
                          .first_filter = first_filter,
                          .second_filter = second_filter};
    unfilter_two_rows(rows);
    unfilter_plain(first_filter, first.data(), above.data(), count, distance);
    unfilter_plain(second_filter, second.data(), first.data(), count, distance);
    ASSERT_EQ(Bytes(rows.first, rows.first + length), first) << length << " bytes, distance " << int{distance};
    ASSERT_EQ(Bytes(rows.second, rows.second + length), second) << length << " bytes, distance " << int{distance};
    ASSERT_EQ(Bytes(rows.above, rows.above + length), above);
}

} // namespace

TEST(UnfilterTwoRows, give_what_one_row_after_the_other_gives) {
    ThreeRows at_start(Edge::start), at_end(Edge::end);
    for (const uint8_t distance : std::initializer_list<uint8_t>{3, 4, 6, 8})
        for (const uint8_t first : filters)
            for (const uint8_t second : filters)
                for (size_t length = 0; length <= 200; ++length)
                    for (ThreeRows *rows : {&at_start, &at_end})
                        ASSERT_NO_FATAL_FAILURE(compare(*rows, length, distance, first, second))
                            << "filters " << int{first} << " and " << int{second};
}

TEST(UnfilterTwoRows, pay_for_average_and_paeth_of_large_pixels) {
    Bytes first = noise_bytes(3000, 1), second = noise_bytes(3000, 2);
    const Bytes above = noise_bytes(3000, 3);
    TwoRows rows = {first.data(), second.data(), above.data(), 3000, 0, 0, 0};
    for (rows.distance = 1; rows.distance <= 9; ++rows.distance)
        for (rows.first_filter = 0; rows.first_filter <= 6; ++rows.first_filter)
            for (rows.second_filter = 0; rows.second_filter <= 6; ++rows.second_filter) {
                const bool is_large =
                    rows.distance == 3 || rows.distance == 4 || rows.distance == 6 || rows.distance == 8;
                const bool are_chains = rows.first_filter >= 3 && rows.first_filter <= 4 && rows.second_filter >= 3 &&
                                        rows.second_filter <= 4;
                EXPECT_EQ(two_rows_pay(rows), lanes_are_fast && is_large && are_chains)
                    << "filters " << int{rows.first_filter} << " and " << int{rows.second_filter} << ", distance "
                    << rows.distance;
            }
    rows.distance = 4;
    rows.first_filter = rows.second_filter = FILTER_PAETH;
    const WithKernels with(Kernels::plain);
    EXPECT_FALSE(two_rows_pay(rows));
}

TEST(UnfilterTwoRows, do_not_pay_where_the_first_one_has_runs) {
    Bytes first(3000), second(3000);
    const Bytes above(3000, 77);
    TwoRows rows = {first.data(), second.data(), above.data(), 3000, 0, FILTER_PAETH, FILTER_PAETH};
    for (const uint8_t distance : std::initializer_list<uint8_t>{3, 4, 6, 8}) {
        rows.distance = distance;
        rows.first_filter = FILTER_PAETH;
        EXPECT_FALSE(two_rows_pay(rows)) << int{distance};
        rows.first_filter = FILTER_AVERAGE;
        EXPECT_EQ(two_rows_pay(rows), lanes_are_fast) << int{distance};
    }
}

} // namespace pelm::test

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
    for (uint32_t distance = 1; distance <= 9; ++distance)
        for (uint8_t first = 0; first <= 6; ++first)
            for (uint8_t second = 0; second <= 6; ++second) {
                const bool is_large = distance == 3 || distance == 4 || distance == 6 || distance == 8;
                const bool are_chains = first >= 3 && first <= 4 && second >= 3 && second <= 4;
                EXPECT_EQ(two_rows_pay(first, second, distance), lanes_are_fast && is_large && are_chains)
                    << "filters " << int{first} << " and " << int{second} << ", distance " << distance;
            }
    const WithKernels with(Kernels::plain);
    EXPECT_FALSE(two_rows_pay(FILTER_PAETH, FILTER_PAETH, 4));
}

} // namespace pelm::test

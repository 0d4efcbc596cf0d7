// The exported helpers for the header's integers, directly.
#include <gtest/gtest.h>

#include "tests/support/wbmp_builder.h"
#include "wbmp/working.h"

namespace pelm::test {
namespace {

struct Integer {
    int32_t position, groups;
    Bytes packed;
};

Integer decoded(const Bytes &data, int32_t position = 0) {
    Integer integer{position, -1, Bytes(data.size() + 2, 0xEE)};
    PELMI_WBMPdecodeMultibyte(data.data(), static_cast<int32_t>(data.size()), &integer.position, &integer.groups,
                              integer.packed.data());
    return integer;
}

// As the decoder reads a side.
int32_t value_of(const Bytes &data) {
    const Integer integer = decoded(data);
    return PELMI_WBMPgetMultibyte2Int(integer.packed.data(), integer.groups, integer.groups);
}

TEST(WbmpMultibyte, a_byte_below_128_is_one_group) {
    const Integer integer = decoded({0x05, 0x81, 0x01});
    EXPECT_EQ(integer.position, 1);
    EXPECT_EQ(integer.groups, 1);
    EXPECT_EQ(integer.packed, (Bytes{0x0A, 0xEE, 0xEE, 0xEE, 0xEE})) << "only what is needed is written";
}

TEST(WbmpMultibyte, groups_are_packed_without_gaps_from_the_high_end) {
    // 1010101 0110011 1111000, then zeros
    const Integer integer = decoded({0x80 | 0x55, 0x80 | 0x33, 0x78});
    EXPECT_EQ(integer.groups, 3);
    EXPECT_EQ(integer.packed[0], 0xAA);
    EXPECT_EQ(integer.packed[1], 0xCF);
    EXPECT_EQ(integer.packed[2], 0xC0);
    EXPECT_EQ(integer.packed[3], 0xEE);
}

TEST(WbmpMultibyte, reading_starts_at_the_position) {
    const Integer integer = decoded({0xFF, 0xFF, 0x81, 0x00, 0x07}, 2);
    EXPECT_EQ(integer.position, 4);
    EXPECT_EQ(integer.groups, 2);
    EXPECT_EQ(PELMI_WBMPgetMultibyte2Int(integer.packed.data(), 2, 2), 128);
}

TEST(WbmpMultibyte, the_end_of_the_data_ends_the_integer) {
    const Integer cut = decoded({0x81, 0x82});
    EXPECT_EQ(cut.position, 2);
    EXPECT_EQ(cut.groups, 2);
    EXPECT_EQ(PELMI_WBMPgetMultibyte2Int(cut.packed.data(), 2, 2), 130);
    const Integer none = decoded({0x81, 0x02}, 2);
    EXPECT_EQ(none.position, 2);
    EXPECT_EQ(none.groups, 0);
    EXPECT_EQ(none.packed[0], 0xEE);
    EXPECT_EQ(decoded({}).groups, 0);
    EXPECT_EQ(decoded({0x01}, 7).position, 7);
}

TEST(WbmpMultibyte, sequences_of_any_length_hold_seven_bits_a_byte) {
    Noise noise(3);
    for (size_t length = 1; length <= 40; ++length) {
        Bytes data(length);
        std::vector<bool> bits;
        for (size_t i = 0; i < length; ++i) {
            const uint32_t group = noise.below(128);
            data[i] = static_cast<uint8_t>(group | (i + 1 < length ? 0x80 : 0));
            for (int bit = 6; bit >= 0; --bit)
                bits.push_back((group >> bit & 1) != 0);
        }
        bits.resize((bits.size() + 7) / 8 * 8);
        const Integer integer = decoded(data);
        ASSERT_EQ(integer.groups, static_cast<int32_t>(length));
        for (size_t i = 0; i < bits.size(); ++i)
            ASSERT_EQ((integer.packed[i / 8] >> (7 - i % 8) & 1) != 0, bits[i]) << length << " bytes, bit " << i;
        EXPECT_EQ(integer.packed[bits.size() / 8], 0xEE) << length;
    }
}

TEST(WbmpMultibyte, every_value_of_up_to_three_bytes_comes_back) {
    for (uint32_t value = 0; value < 1u << 21; ++value)
        ASSERT_EQ(value_of(multi_byte(value)), static_cast<int32_t>(value));
    for (size_t length = 1; length <= 4; ++length)
        EXPECT_EQ(value_of(multi_byte(97, length)), 97) << length;
}

TEST(WbmpMultibyte, four_bytes_are_exact_below_2_to_the_27th_and_negative_from_there_on) {
    for (const uint32_t value : {1u << 21, 12345678u, (1u << 27) - 1})
        EXPECT_EQ(value_of(multi_byte(value)), static_cast<int32_t>(value));
    EXPECT_EQ(value_of(multi_byte(1u << 27)), -(1 << 27));
    EXPECT_EQ(value_of(multi_byte((1u << 28) - 1)), -1);
}

TEST(WbmpMultibyte, the_division_is_signed_and_truncates) {
    const uint8_t packed[] = {0xFF, 0xFF, 0xFF, 0xF1, 0x12, 0x34};
    EXPECT_EQ(PELMI_WBMPgetMultibyte2Int(packed, 4, 0), -15);
    EXPECT_EQ(PELMI_WBMPgetMultibyte2Int(packed, 4, 1), -7);
    EXPECT_EQ(PELMI_WBMPgetMultibyte2Int(packed, 4, 4), 0);
    EXPECT_EQ(PELMI_WBMPgetMultibyte2Int(packed, 3, 3), 0xFFFFFF / 8);
    EXPECT_EQ(PELMI_WBMPgetMultibyte2Int(packed, 0, 0), 0);
    EXPECT_EQ(PELMI_WBMPgetMultibyte2Int(packed, -3, -3), 0);
    EXPECT_EQ(PELMI_WBMPgetMultibyte2Int(packed, 6, 0), static_cast<int32_t>(0xFFF11234u)) << "the last four count";
}

TEST(WbmpMultibyte, powers_that_wrap_divide_everything_away) {
    const uint8_t lowest[] = {0x80, 0, 0, 0};
    EXPECT_EQ(PELMI_WBMPgetMultibyte2Int(lowest, 4, 30), -2);
    EXPECT_EQ(PELMI_WBMPgetMultibyte2Int(lowest, 4, 31), 1) << "2 to the 31st is negative itself";
    EXPECT_EQ(PELMI_WBMPgetMultibyte2Int(lowest, 4, 32), 0);
    EXPECT_EQ(PELMI_WBMPgetMultibyte2Int(lowest, 4, INT32_MAX), 0);
}

TEST(WbmpPow, multiplies_as_often_as_the_exponent_says) {
    for (const int32_t base : {-7, -1, 0, 1, 2, 3, 10, 65537, INT32_MAX, INT32_MIN}) {
        uint32_t product = 1;
        for (int32_t exponent = 0; exponent <= 70; ++exponent) {
            EXPECT_EQ(PELMI_WBMPpow(base, exponent), static_cast<int32_t>(product)) << base << " to the " << exponent;
            product *= static_cast<uint32_t>(base);
        }
    }
    EXPECT_EQ(PELMI_WBMPpow(2, 10), 1024);
    EXPECT_EQ(PELMI_WBMPpow(2, 31), INT32_MIN);
    EXPECT_EQ(PELMI_WBMPpow(-1, INT32_MAX), -1);
}

TEST(WbmpPow, is_1_for_exponents_below_1) {
    for (const int32_t exponent : {0, -1, -31, INT32_MIN})
        for (const int32_t base : {0, 2, -5})
            EXPECT_EQ(PELMI_WBMPpow(base, exponent), 1);
}

} // namespace
} // namespace pelm::test

#include <gtest/gtest.h>

#include "png/inflate/bits.h"
#include "tests/png/inner/noise.h"
#include "tests/support/guarded_buffer.h"

namespace pelm::test {

namespace {

uint32_t bits_from(const Bytes &bytes, size_t bit, uint32_t count) {
    uint32_t value = 0;
    for (uint32_t i = 0; i < count; ++i)
        value |= static_cast<uint32_t>(bytes[(bit + i) / 8] >> (bit + i) % 8 & 1) << i;
    return value;
}

struct Place {
    uint32_t byte, bits_left;
    bool operator==(const Place &) const = default;
};

Place after_reading(Place place, uint32_t n, const Bytes &bytes, uint32_t &value) {
    value = __PELMI_PngReadBits(bytes.data(), &place.byte, &place.bits_left, n);
    return place;
}

std::ostream &operator<<(std::ostream &out, Place place) {
    return out << "byte " << place.byte << ", " << place.bits_left << " bits left";
}

// Hands out its bytes in pieces, and counts what it was asked for behind the end.
struct PieceInput {
    const uint8_t *next, *end;
    const uint8_t *last;
    ptrdiff_t piece;
    int asked_behind_end = 0;
};

bool more(PieceInput &input) {
    if (input.end == input.last) return ++input.asked_behind_end, false;
    input.next = input.end;
    input.end += std::min(input.piece, input.last - input.end);
    return true;
}

PieceInput pieces_of(const Bytes &bytes, ptrdiff_t piece) {
    return {bytes.data(), bytes.data(), bytes.data() + bytes.size(), piece};
}

} // namespace

TEST(ReadBits, returns_a_whole_untouched_byte_and_moves_one_on) {
    uint32_t value = 0;
    EXPECT_EQ(after_reading({1, 8}, 8, {0x11, 0xA5, 0x33, 0x44}, value), (Place{2, 8}));
    EXPECT_EQ(value, 0xA5u);
}

TEST(ReadBits, the_last_bits_of_a_byte_leave_the_next_byte_untouched) {
    uint32_t value = 0;
    EXPECT_EQ(after_reading({0, 3}, 3, {0xE0, 0, 0}, value), (Place{1, 8}));
    EXPECT_EQ(value, 7u);
}

TEST(ReadBits, reads_up_to_17_bits_from_every_place_in_a_byte) {
    const Bytes bytes = noise_bytes(64, 1);
    for (uint32_t byte = 0; byte < 32; ++byte)
        for (uint32_t left = 1; left <= 8; ++left)
            for (uint32_t n = 0; n <= 17; ++n) {
                uint32_t value = 0;
                const Place after = after_reading({byte, left}, n, bytes, value);
                const uint32_t from = 8 * byte + 8 - left;
                ASSERT_EQ(value, bits_from(bytes, from, n)) << "byte " << byte << " left " << left << " n " << n;
                ASSERT_EQ(8 * after.byte + 8 - after.bits_left, from + n) << "left " << left << " n " << n;
                ASSERT_GE(after.bits_left, 1u);
                ASSERT_LE(after.bits_left, 8u);
            }
}

TEST(ReadBits, gives_what_is_left_of_three_bytes_for_larger_counts) {
    const Bytes bytes = {0x12, 0x34, 0x56};
    const uint32_t three_bytes = 0x563412;
    for (uint32_t left = 1; left <= 8; ++left)
        for (uint32_t n = 18; n <= 40; ++n) {
            const uint32_t mask = n >= 32 ? ~0u : (1u << n) - 1;
            uint32_t value = 0;
            const Place after = after_reading({0, left}, n, bytes, value);
            EXPECT_EQ(value, three_bytes >> (8 - left) & mask) << "left " << left << " n " << n;
            const bool next_byte = left <= n % 8;
            const Place wanted = {n / 8 + (next_byte ? 1 : 0), next_byte ? left + 8 - n % 8 : left - n % 8};
            EXPECT_EQ(after, wanted) << "left " << left << " n " << n;
        }
}

TEST(ReadBits, needs_no_more_than_two_bytes_beyond_the_current_one) {
    GuardedBuffer memory;
    uint8_t *const bytes = memory.take(3, Edge::end);
    bytes[0] = bytes[1] = bytes[2] = 0xFF;
    uint32_t position = 0, left = 1;
    EXPECT_EQ(__PELMI_PngReadBits(bytes, &position, &left, 17), 0x1FFFFu);
}

TEST(BitReader, any_sequence_of_counts_reads_the_same_bits_whatever_pieces_the_input_comes_in) {
    const Bytes bytes = noise_bytes(3000, 2);
    for (const ptrdiff_t piece : {1, 2, 3, 4, 5, 7, 8, 9, 15, 16, 100, 3000}) {
        Random random(static_cast<uint32_t>(piece));
        PieceInput input = pieces_of(bytes, piece);
        BitReader reader{};
        for (size_t at = 0; at + 16 <= 8 * bytes.size();) {
            const uint32_t count = random() % 17;
            uint32_t value = 0;
            ASSERT_TRUE(take_bits(reader, input, count, value)) << "piece " << piece << " bit " << at;
            ASSERT_EQ(value, bits_from(bytes, at, count)) << "piece " << piece << " bit " << at;
            at += count;
        }
        EXPECT_EQ(input.asked_behind_end, 0) << "piece " << piece;
    }
}

TEST(BitReader, stays_within_the_input_and_reads_its_last_bit) {
    for (size_t size = 0; size <= 20; ++size) {
        const Bytes bytes = noise_bytes(size, 3);
        GuardedBuffer memory;
        uint8_t *const copy = memory.take(size, Edge::end);
        std::copy(bytes.begin(), bytes.end(), copy);
        MemoryInput input = {copy, copy + size};
        BitReader reader{};
        for (size_t bit = 0; bit < 8 * size; ++bit) {
            uint32_t value = 2;
            refill(reader, input);
            ASSERT_TRUE(take_bits(reader, input, 1, value)) << size << " bytes, bit " << bit;
            ASSERT_EQ(value, bits_from(bytes, bit, 1)) << size << " bytes, bit " << bit;
        }
        uint32_t value = 0;
        EXPECT_FALSE(take_bits(reader, input, 1, value)) << size << " bytes";
        EXPECT_TRUE(take_bits(reader, input, 0, value)) << size << " bytes";
    }
}

TEST(BitReader, a_count_that_is_not_there_is_refused_and_fewer_bits_are_still_read) {
    const Bytes bytes = {0xA5, 0x0F};
    for (const ptrdiff_t piece : {1, 2}) {
        PieceInput input = pieces_of(bytes, piece);
        BitReader reader{};
        uint32_t value = 0;
        ASSERT_TRUE(take_bits(reader, input, 3, value));
        EXPECT_FALSE(take_bits(reader, input, 14, value));
        ASSERT_TRUE(take_bits(reader, input, 13, value));
        EXPECT_EQ(value, 0x0FA5u >> 3);
        EXPECT_FALSE(take_bits(reader, input, 1, value));
    }
}

TEST(BitReader, missing_bits_are_peeked_as_zeros) {
    const Bytes bytes = {0xFF};
    PieceInput input = pieces_of(bytes, 1);
    BitReader reader{};
    refill(reader, input);
    EXPECT_EQ(reader.count, 8u);
    EXPECT_EQ(peek(reader, 16), 0xFFu);
}

TEST(BitReader, whole_bytes_come_first_from_what_it_holds_and_then_from_the_input) {
    const Bytes bytes = noise_bytes(50, 4);
    for (const ptrdiff_t piece : {1, 3, 8, 50})
        for (uint32_t bits_before = 0; bits_before <= 16; ++bits_before)
            for (const uint32_t count : {0u, 1u, 2u, 7u, 8u, 9u, 40u, 48u}) {
                PieceInput input = pieces_of(bytes, piece);
                BitReader reader{};
                uint32_t value = 0;
                ASSERT_TRUE(take_bits(reader, input, bits_before, value));
                align_to_byte(reader);
                const size_t from = (bits_before + 7) / 8;
                const size_t there = std::min<size_t>(count, bytes.size() - from);
                Bytes got(count + 1, 0xEE);
                ASSERT_EQ(take_bytes(reader, input, got.data(), count), there);
                for (size_t i = 0; i < there; ++i)
                    ASSERT_EQ(got[i], bytes[from + i]) << "piece " << piece << " bits " << bits_before << " byte " << i;
                EXPECT_EQ(got[there], 0xEE);
                const size_t left = bytes.size() - from - there;
                ASSERT_EQ(take_bits(reader, input, 8, value), left > 0);
                EXPECT_TRUE(left == 0 || value == bytes[from + there]);
            }
}

TEST(BitReader, aligning_drops_only_the_rest_of_the_byte) {
    const Bytes bytes = noise_bytes(40, 5);
    for (uint32_t count = 0; count <= 16; ++count) {
        PieceInput input = pieces_of(bytes, 40);
        BitReader reader{};
        uint32_t value = 0;
        ASSERT_TRUE(take_bits(reader, input, count, value));
        align_to_byte(reader);
        ASSERT_TRUE(take_bits(reader, input, 8, value));
        EXPECT_EQ(value, bytes[(count + 7) / 8]) << "after " << count << " bits";
    }
}

} // namespace pelm::test

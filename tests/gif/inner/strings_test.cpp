// The table of strings.
#include "tests/gif/inner/decoding_record.h"

namespace pelm::test {
namespace {

class GifStrings : public GifTest {
protected:
    std::vector<uint32_t> prefix = std::vector<uint32_t>(4096, 77);
    Bytes suffix = Bytes(4096, 78);
    std::vector<uint32_t> length = std::vector<uint32_t>(4096, 79);
    GifLzwTables tables{prefix.data(), suffix.data(), length.data()};
};

TEST_F(GifStrings, a_new_table_has_roots_and_two_codes_more_and_nothing_behind) {
    for (uint32_t size = 0; size <= 11; ++size) {
        EXPECT_NE(PELMI_InitializeTransTBL(size, &tables), 0);
        for (uint32_t i = 0; i < 4096; ++i) {
            const bool known = i <= (1u << size) + 1;
            ASSERT_EQ(prefix[i], 0u);
            ASSERT_EQ(suffix[i], known ? i & 255 : 0u) << i;
            ASSERT_EQ(length[i], known ? 1u : 0u) << i;
        }
    }
}

TEST_F(GifStrings, no_table_is_made_above_eleven_bits) {
    for (const uint32_t size : {12u, 13u, 31u, 32u, 255u, 0xFFFFFFFFu}) {
        EXPECT_EQ(PELMI_InitializeTransTBL(size, &tables), 0);
        EXPECT_EQ(prefix, std::vector<uint32_t>(4096, 77));
        EXPECT_EQ(suffix, Bytes(4096, 78));
        EXPECT_EQ(length, std::vector<uint32_t>(4096, 79));
    }
}

TEST_F(GifStrings, an_added_string_is_one_longer_than_the_one_it_extends) {
    PELMI_InitializeTransTBL(2, &tables);
    PELMI_AddToTranslationTable(3, 200, 6, &tables);
    PELMI_AddToTranslationTable(6, 1, 7, &tables);
    PELMI_AddToTranslationTable(4000, 9, 4095, &tables); // a code without a string
    EXPECT_EQ(prefix[7], 6u);
    EXPECT_EQ(suffix[6], 200);
    EXPECT_EQ(length[6], 2u);
    EXPECT_EQ(length[7], 3u);
    EXPECT_EQ(length[4095], 1u);
}

TEST_F(GifStrings, a_string_is_written_whole_and_its_first_pixel_told) {
    PELMI_InitializeTransTBL(2, &tables);
    PELMI_AddToTranslationTable(3, 200, 6, &tables);
    PELMI_AddToTranslationTable(6, 1, 7, &tables);
    Bytes buffer(8, 99);
    EXPECT_EQ(PELMI_TranslateCode(7, &tables, 2, buffer.data()), 3);
    EXPECT_EQ(buffer, (Bytes{99, 99, 3, 200, 1, 99, 99, 99}));
    EXPECT_EQ(PELMI_TranslateCode(2, &tables, 7, buffer.data()), 2);
    EXPECT_EQ(PELMI_TranslateCode(4000, &tables, 6, buffer.data()), 0) << "a code without a string is one pixel of 0";
    EXPECT_EQ(buffer[6], 0);
    buffer[6] = 99;
    PELMI_WriteCharacter(55, 0, buffer.data());
    EXPECT_EQ(buffer, (Bytes{55, 99, 3, 200, 1, 99, 99, 2}));
}

TEST_F(GifStrings, packed_colours_have_ten_bits_for_each_channel) {
    const Bytes raw = {255, 0, 0, 0x12, 0x34, 0x56, 0, 255, 0, 0, 0, 255, 9, 9, 9};
    uint32_t table[] = {1, 1, 1, 1, 1};
    PELMI_MakeColorTable(raw.data(), 4, table);
    EXPECT_EQ(table[0], 255u << 20);
    EXPECT_EQ(table[1], 0x12u << 20 | 0x34u << 10 | 0x56u);
    EXPECT_EQ(table[2], 255u << 10);
    EXPECT_EQ(table[3], 255u);
    EXPECT_EQ(table[4], 1u);
}

} // namespace
} // namespace pelm::test

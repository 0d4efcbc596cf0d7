// Image data: codes right and wrong, and the sub-blocks that they are cut into.
#include "tests/gif/support/gif_check.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

const ColourTable table = distinct_table(256);

// An image of one row with the given data.
Bytes row_of(uint16_t width, int min_code_size, const Bytes &packed) {
    GifFile file;
    file.screen(width, 1, table).descriptor({0, 0, width, 1}).data(min_code_size, packed);
    return file.trailer().bytes;
}

Bytes code_row(uint16_t width, int min_code_size, const Codes &codes) {
    return row_of(width, min_code_size, packed_codes(codes, min_code_size));
}

class GifCodes : public GifTest {
protected:
    static constexpr GifCall stills[] = {GifCall::one_shot, GifCall::iterative, GifCall::line};

    // All three calls do as the model, and the row shows these indices.
    static void expect_row(const Bytes &file, const Bytes &indices) {
        const uint16_t width = static_cast<uint16_t>(indices.size());
        for (const GifCall call : stills)
            EXPECT_EQ(gif_difference(file, own_size(width, 1, 1), call, {}, 1), "");
        EXPECT_EQ(checked_decode(file, own_size(width, 1, 1)).output, rgb_of(indices, table));
        expect_on_a_wider_screen(file, width);
    }
    // There, what lies behind the row shows as well: pixels that were decoded and moved on.
    static void expect_on_a_wider_screen(Bytes file, uint16_t width) {
        const uint16_t wider = static_cast<uint16_t>(width + 5);
        file[6] = static_cast<uint8_t>(wider);
        file[7] = static_cast<uint8_t>(wider >> 8);
        for (const GifCall call : stills)
            EXPECT_EQ(gif_difference(file, own_size(wider, 1, 1), call, {}, 1), "");
    }
    static void expect_as_modelled(const Bytes &file, uint16_t width, uint16_t height) {
        for (const GifCall call : stills)
            EXPECT_EQ(gif_difference(file, own_size(width, height, 1), call, {}, height), "") << name_of(call);
    }
};

TEST_F(GifCodes, clear_and_end_codes_alone_write_nothing_and_succeed) {
    const Bytes file = code_row(3, 2, {4, 5});
    const GifOutcome outcome = checked_decode(file, own_size(3, 1));
    EXPECT_EQ(outcome.result, 1);
    EXPECT_EQ(outcome.output, Bytes(12, 0)) << "rows that are not reached are cleared";
    expect_as_modelled(file, 3, 1);
}

TEST_F(GifCodes, the_string_that_is_not_yet_in_the_table_is_the_previous_one_and_its_first_pixel) {
    expect_row(code_row(6, 2, {4, 1, 6, 7, 5}), {1, 1, 1, 1, 1, 1});
    expect_row(code_row(6, 2, {4, 1, 2, 6, 8, 5}), {1, 2, 1, 2, 1, 2});
}

TEST_F(GifCodes, codes_grow_wider_when_the_table_has_filled_their_width_and_not_earlier) {
    // Roots 3 bits wide until entry 7 is there; the fourth code after the first is 4 bits wide.
    const Codes codes = {4, 0, 1, 2, 3, 0, 5};
    EXPECT_EQ(code_widths(codes, 2), (std::vector<int>{3, 3, 3, 3, 4, 4, 4}));
    expect_row(code_row(5, 2, codes), {0, 1, 2, 3, 0});
}

TEST_F(GifCodes, the_first_code_behind_a_clear_code_adds_no_entry) {
    expect_row(code_row(7, 2, {4, 0, 1, 4, 2, 3, 6, 0, 5}), {0, 1, 2, 3, 2, 3, 0});
}

TEST_F(GifCodes, clear_codes_in_a_row_and_at_the_end_are_fine) {
    expect_row(code_row(4, 2, {4, 4, 4, 0, 1, 4, 4, 2, 3, 4, 5}), {0, 1, 2, 3});
}

TEST_F(GifCodes, every_minimum_code_size_decodes_its_roots) {
    for (int size = 1; size <= 11; ++size) {
        const uint32_t colours = std::min(256u, 1u << size);
        const Bytes indices = noise_pixels(700, colours, static_cast<uint32_t>(size));
        expect_row(row_of(700, size, lzw_data(indices, size)), indices);
    }
}

TEST_F(GifCodes, minimum_code_size_zero_knows_one_root) {
    expect_row(code_row(9, 0, Codes(9, 0)), Bytes(9, 0));
    expect_row(code_row(4, 0, {1, 0, 1, 0, 1, 1, 0, 0}), Bytes(4, 0));
}

TEST_F(GifCodes, minimum_code_size_one_never_grows_wider) {
    const Codes codes = {2, 0, 1, 1, 0, 1, 0, 0, 1, 1, 3};
    for (const int width : code_widths(codes, 1))
        EXPECT_EQ(width, 2);
    expect_row(code_row(9, 1, codes), {0, 1, 1, 0, 1, 0, 0, 1, 1});
}

TEST_F(GifCodes, roots_above_255_show_their_low_byte) {
    expect_row(code_row(4, 10, {1024, 256 + 7, 512 + 9, 1023, 5, 1025}), {7, 9, 255, 5});
}

TEST_F(GifCodes, the_table_freezes_when_4096_entries_are_there) {
    // Roots only: one entry each. Code 4095 must be there afterwards, and later additions must not.
    Codes codes = {256};
    Bytes indices;
    for (uint32_t i = 0; i < 4096 - 258 + 1 + 50; ++i) {
        const uint8_t root = static_cast<uint8_t>(i * 7 + i / 256);
        codes.push_back(root);
        indices.push_back(root);
    }
    codes.push_back(4095);
    indices.push_back(indices[4095 - 258]);
    indices.push_back(indices[4095 - 258 + 1]);
    codes.push_back(258);
    indices.push_back(indices[0]);
    indices.push_back(indices[1]);
    codes.push_back(257);
    expect_row(code_row(static_cast<uint16_t>(indices.size()), 8, codes), indices);
}

TEST_F(GifCodes, a_clear_code_thaws_a_frozen_table) {
    for (const bool clears : {true, false}) {
        LzwOptions options;
        options.clears_full_table = clears;
        const Bytes indices = noise_pixels(30000, 16, 8);
        Codes codes = lzw_codes(indices, 4, options);
        if (!clears) codes.insert(codes.end() - 1, {16, 3, 18, 19});
        Bytes expected = indices;
        if (!clears) expected.insert(expected.end(), {3, 3, 3, 3, 3, 3});
        expect_row(code_row(static_cast<uint16_t>(expected.size()), 4, codes), expected);
    }
}

TEST_F(GifCodes, a_code_beyond_the_next_one_counts_as_the_next_one) {
    expect_row(code_row(4, 2, {4, 1, 7, 0, 5}), {1, 1, 1, 0});
}

TEST_F(GifCodes, a_previous_code_outside_the_table_counts_as_zero) {
    const Bytes data = packed_codes({8, 3, 15, 15, 14, 9}, 3);
    expect_as_modelled(row_of(20, 3, data), 20, 1);
}

TEST_F(GifCodes, the_code_behind_a_clear_code_is_a_root_without_a_check) {
    expect_row(code_row(3, 2, {4, 7, 1, 6, 5}), {7, 1, 1});
    expect_as_modelled(code_row(40, 2, {4, 0, 1, 2, 8, 9, 10, 4, 7, 6, 0, 6, 7, 8, 9, 5}), 40, 1);
}

TEST_F(GifCodes, strings_from_before_a_clear_code_can_begin_longer_ones) {
    // Every repetition makes a string longer by one. A clear code keeps them: roots are 3 bits wide, and 7 is a string
    // of three pixels, from which each round goes on.
    Codes codes = {4, 0};
    for (int round = 0; round < 4; ++round) {
        for (uint32_t code = 6; code < 400; ++code)
            codes.push_back(code);
        codes.insert(codes.end(), {4, 7});
    }
    GifFile file;
    file.screen(90, 3600, table).descriptor({0, 0, 90, 3600}).data(2, packed_codes(codes, 2)).trailer();
    expect_as_modelled(file.bytes, 90, 3600);
}

TEST_F(GifCodes, a_string_of_more_than_4096_pixels_counts_as_code_zero) {
    // With minimum code size 11 every code fits the width of roots. 4095 has the longest string after each round, and
    // the unchecked root 4095 behind a clear code makes it the beginning of longer ones.
    Codes codes = {2048, 5};
    for (uint32_t code = 2050; code < 4096; ++code)
        codes.push_back(code); // each is the string before and one pixel: 2 to 2047 pixels
    codes.insert(codes.end(), {2048, 4095, 5, 2050});
    for (uint32_t code = 2052; code < 4096; ++code)
        codes.push_back(code);                                          // 2049 to 4092 pixels
    codes.insert(codes.end(), {2048, 4095, 5, 2050, 2052, 2053, 2054}); // 4093 to 4096 pixels
    const Codes longest = {2055};                                       // 4096 and one more
    for (const Codes &behind : {Codes{2055, 9}, Codes{2055, 2056, 9, 2057}, Codes{2056, 9, 2056, 2057},
                                Codes{2056, 2057, 2058, 2055, 7}, Codes{9, 2055, 2055, 2060, 2060}}) {
        if (quick() && behind.size() != 4) continue;
        Codes all = codes;
        all.insert(all.end(), longest.begin(), longest.end());
        all.insert(all.end(), behind.begin(), behind.end());
        all.push_back(2049);
        GifFile file;
        file.screen(4000, 2150, table).descriptor({0, 0, 4000, 2150}).data(11, packed_codes(all, 11)).trailer();
        const GifOutcome outcome = checked_decode(file.bytes, {1, 0, 0x700, 40, 2150});
        EXPECT_EQ(outcome.output[outcome.output.size() - 1], 0) << "the string was reached, and the data ended";
        EXPECT_EQ(gif_difference(file.bytes, {1, 0, 0x700, 40, 2150}, GifCall::iterative), "");
    }
}

TEST_F(GifCodes, strings_may_be_much_longer_than_a_row) {
    Codes codes = {4, 3};
    for (uint32_t code = 6; code < 300; ++code)
        codes.push_back(code);
    codes.push_back(5);
    const Bytes data = packed_codes(codes, 2);
    for (const uint16_t width : std::initializer_list<uint16_t>{1, 2, 3, 7, 250}) {
        GifFile file;
        const uint16_t height = 100;
        file.screen(width, height, table).descriptor({0, 0, width, height}).data(2, data).trailer();
        expect_as_modelled(file.bytes, width, height);
    }
}

class GifSubBlocks : public GifCodes {};

TEST_F(GifSubBlocks, may_be_of_any_size) {
    const Bytes indices = noise_pixels(900, 256, 4);
    const Bytes packed = lzw_data(indices, 8);
    for (int largest = 1; largest <= 255; largest += largest < 20 ? 1 : 47) {
        GifFile file;
        file.screen(900, 1, table).descriptor({0, 0, 900, 1}).data(8, packed, static_cast<uint8_t>(largest));
        expect_row(file.trailer().bytes, indices);
    }
}

TEST_F(GifSubBlocks, empty_ones_in_between_are_skipped) {
    const Bytes indices = noise_pixels(60, 8, 4);
    GifFile file;
    file.screen(60, 1, table).descriptor({0, 0, 60, 1});
    file.data_in(3, lzw_data(indices, 3), {0, 1, 0, 0, 2, 0, 3, 0, 0, 0, 1, 200});
    expect_row(file.trailer().bytes, indices);
}

TEST_F(GifSubBlocks, data_goes_on_behind_a_terminator) {
    const Bytes indices = noise_pixels(60, 8, 4);
    const Bytes packed = lzw_data(indices, 3);
    const auto middle = packed.begin() + static_cast<ptrdiff_t>(packed.size() / 2);
    GifFile file;
    file.screen(60, 1, table).descriptor({0, 0, 60, 1}).data(3, {packed.begin(), middle});
    const Bytes rest(middle, packed.end());
    file.raw({static_cast<uint8_t>(rest.size())}).raw(rest).raw({0}).trailer();
    expect_row(file.bytes, indices);
}

TEST_F(GifSubBlocks, the_last_one_needs_a_byte_behind_it) {
    const Bytes indices = noise_pixels(60, 8, 4);
    GifFile file;
    file.screen(60, 1, table).descriptor({0, 0, 60, 1}).data(3, lzw_data(indices, 3));
    Bytes with_terminator = file.bytes;
    expect_row(with_terminator, indices);
    with_terminator.pop_back();
    EXPECT_EQ(checked_decode(with_terminator, own_size(60, 1, 1)).output, Bytes(180, 0));
}

} // namespace
} // namespace pelm::test

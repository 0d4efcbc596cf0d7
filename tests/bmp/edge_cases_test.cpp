// Single cases that are easy to get wrong, with their bytes written out by hand.
#include "tests/bmp/expectations.h"

namespace pelm::test {
namespace {

constexpr uint8_t b_ = background;

class BmpEdgeCases : public HostedTest {
protected:
    // From memory, into a buffer of just the box.
    static Bytes decoded(const BmpFile &file, const BmpRequest &request) {
        TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
        const size_t size =
            static_cast<size_t>(request.box_width * request.box_height * buffer_bytes_per_pixel(request.format));
        const BmpDecode decode = decode_bmp(source, request, size);
        EXPECT_EQ(decode.result, 1);
        EXPECT_EQ(decode.misbehaviour, "");
        EXPECT_TRUE(decode.live_blocks.empty());
        return decode.output;
    }

    static int32_t result_of(const BmpFile &file) {
        TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
        return decode_bmp(source, {1, 0, 0, 8, 8}, 192).result;
    }
};

BmpFile one_pixel(uint16_t bits, const Bytes &row) {
    BmpFile file;
    file.bits = bits;
    file.rows = {row};
    return file;
}

TEST_F(BmpEdgeCases, a_whole_file_written_out_by_hand) {
    Bytes bytes = {'B', 'M', 70, 0,  0,  0,  0, 0, 0, 0, 54, 0, 0, 0,                    // file header
                   40,  0,   0,  0,  2,  0,  0, 0, 2, 0, 0,  0, 1, 0, 24, 0, 0, 0, 0, 0, // 2 x 2, 24 bits, plain
                   16,  0,   0,  0,  0,  0,  0, 0, 0, 0, 0,  0, 0, 0, 0,  0, 0, 0, 0, 0, // sizes and counts
                   1,   2,   3,  4,  5,  6,  0, 0,                                       // lower row
                   7,   8,   9,  10, 11, 12, 0, 0};                                      // upper row
    for (const uint32_t kind : all_kinds) {
        TestSource source(kind, bytes);
        EXPECT_EQ(decode_bmp(source, {1, 0, 0, 2, 2}, 12).output, (Bytes{9, 8, 7, 12, 11, 10, 3, 2, 1, 6, 5, 4}));
    }
    bytes[22] = 0xFE; // a height of -2
    bytes[23] = bytes[24] = bytes[25] = 0xFF;
    TestSource source(PELM_SOURCE_MEMORY, bytes);
    EXPECT_EQ(decode_bmp(source, {1, 0, 0, 2, 2}, 12).output, (Bytes{3, 2, 1, 6, 5, 4, 9, 8, 7, 12, 11, 10}));
}

TEST_F(BmpEdgeCases, a_core_file_written_out_by_hand) {
    Bytes bytes(54, 0xDD); // what lies between the core header and offset 54 does not matter
    const Bytes start = {'B', 'M', 0, 0, 0, 0, 0, 0, 0, 0, 62, 0, 0, 0, 12, 0, 0, 0, 3, 0, 1, 0, 1, 0, 8, 0, 0, 0};
    std::copy(start.begin(), start.end(), bytes.begin());
    const Bytes rest = {1, 2, 3, 0, 4, 5, 6, 0, 1, 0, 1, 0};
    bytes.insert(bytes.end(), rest.begin(), rest.end());
    for (const uint32_t kind : all_kinds) {
        TestSource source(kind, bytes);
        EXPECT_EQ(decode_bmp(source, {1, 0, 0, 3, 1}, 9).output, (Bytes{6, 5, 4, 3, 2, 1, 6, 5, 4}));
    }
}

TEST_F(BmpEdgeCases, a_header_size_of_296_is_read_as_40) {
    BmpFile file = one_pixel(24, {1, 2, 3});
    file.header_size = 296;
    EXPECT_EQ(decoded(file, {1, 0, 0, 1, 1}), (Bytes{3, 2, 1}));
}

TEST_F(BmpEdgeCases, header_sizes_108_and_124_are_refused) {
    for (const uint32_t size : {108u, 124u}) {
        BmpFile file = one_pixel(24, {1, 2, 3});
        file.header_size = size;
        EXPECT_EQ(result_of(file), 0);
    }
}

TEST_F(BmpEdgeCases, a_core_header_followed_by_a_compression_is_refused) {
    for (const uint32_t compression : {1u, 2u, 4u, 5u}) {
        BmpFile file = one_pixel(24, {1, 2, 3});
        file.header_size = 12;
        file.compression = compression;
        EXPECT_EQ(result_of(file), 0) << compression;
    }
}

TEST_F(BmpEdgeCases, pixel_data_at_54_gives_13_palette_entries_from_the_first_pixel_bytes) {
    BmpFile file;
    file.width = 16;
    file.height = 4;
    file.bits = 8;
    for (uint8_t row = 0; row < 4; ++row) {
        Bytes pixels;
        for (uint8_t x = 0; x < 16; ++x)
            pixels.push_back(static_cast<uint8_t>(row * 16 + x));
        file.rows.push_back(pixels);
    }
    // Entry i is the pixel bytes 4i to 4i + 2, for i below 13; the others are black.
    const Bytes output = decoded(file, {1, 0, 0, 16, 4});
    for (int index = 0; index < 64; ++index) {
        const auto at = output.begin() + 3 * ((3 - index / 16) * 16 + index % 16);
        const int blue = 4 * index;
        const Bytes expected = index < 13 ? Bytes{static_cast<uint8_t>(blue + 2), static_cast<uint8_t>(blue + 1),
                                                  static_cast<uint8_t>(blue)}
                                          : Bytes{0, 0, 0};
        EXPECT_EQ(Bytes(at, at + 3), expected) << "index " << index;
    }
}

TEST_F(BmpEdgeCases, a_small_24_bit_picture_is_centred_and_its_surroundings_stay) {
    BmpFile file;
    file.width = 1;
    file.height = 2;
    file.rows = {{1, 2, 3}, {4, 5, 6}};
    EXPECT_EQ(decoded(file, {1, 0, 0, 3, 3}), (Bytes{b_, b_, b_, 6,  5,  4,  b_, b_, b_, //
                                                     b_, b_, b_, 3,  2,  1,  b_, b_, b_, //
                                                     b_, b_, b_, b_, b_, b_, b_, b_, b_}));
}

TEST_F(BmpEdgeCases, pictures_of_2_and_3_bits_write_nothing_and_succeed) {
    for (const int bits : {2, 3})
        EXPECT_EQ(decoded(one_pixel(static_cast<uint16_t>(bits), {0xFF}), {1, 0, 0, 2, 2}), Bytes(12, background));
}

TEST_F(BmpEdgeCases, output_formats_2_3_and_4_leave_the_buffer_unchanged_and_succeed) {
    for (const uint32_t format : {2u, 3u, 4u})
        EXPECT_EQ(decoded(one_pixel(24, {1, 2, 3}), {format, 0, 0, 2, 2}), Bytes(16, background));
}

TEST_F(BmpEdgeCases, a_one_bit_row_of_10_pixels_uses_two_bits_of_its_second_byte) {
    BmpFile file;
    file.width = 10;
    file.bits = 1;
    file.palette = {1, 2, 3, 0, 4, 5, 6, 0};
    const Bytes zero = {3, 2, 1}, one = {6, 5, 4};
    Bytes expected;
    for (const char bit : std::string("1010001101")) {
        const Bytes &color = bit == '1' ? one : zero;
        expected.insert(expected.end(), color.begin(), color.end());
    }
    for (const uint8_t rest : {uint8_t{0}, uint8_t{0x3F}}) {
        file.rows = {{0xA3, static_cast<uint8_t>(0x40 | rest)}};
        EXPECT_EQ(decoded(file, {1, 0, 0, 10, 1}), expected);
    }
}

TEST_F(BmpEdgeCases, a_four_bit_row_of_odd_width_uses_the_high_nibble_of_its_last_byte) {
    BmpFile file;
    file.width = 3;
    file.bits = 4;
    for (uint8_t i = 0; i < 16; ++i)
        append(file.palette, {i, static_cast<uint8_t>(i + 16), static_cast<uint8_t>(i + 32), 0xFF});
    for (const uint8_t low : {uint8_t{0}, uint8_t{15}}) {
        file.rows = {{0x9A, static_cast<uint8_t>(0xB0 | low)}};
        EXPECT_EQ(decoded(file, {1, 0, 0, 3, 1}), (Bytes{41, 25, 9, 42, 26, 10, 43, 27, 11}));
    }
}

TEST_F(BmpEdgeCases, a_one_bit_picture_in_format_5_is_opaque_palette_colours) {
    BmpFile file;
    file.width = 2;
    file.bits = 1;
    file.palette = {1, 2, 3, 0, 4, 5, 6, 0};
    file.rows = {{0x40}};
    EXPECT_EQ(decoded(file, {5, 0, 0, 2, 1}), (Bytes{255, 3, 2, 1, 255, 6, 5, 4}));
}

BmpFile bit_fields(uint16_t pixel, std::vector<uint32_t> masks) {
    BmpFile file = one_pixel(16, {static_cast<uint8_t>(pixel), static_cast<uint8_t>(pixel >> 8)});
    file.compression = masks.empty() ? 0 : 3;
    file.masks = std::move(masks);
    return file;
}

TEST_F(BmpEdgeCases, white_of_16_bits_is_widened_with_zeros) {
    EXPECT_EQ(decoded(bit_fields(0x7FFF, {}), {1, 0, 0, 1, 1}), (Bytes{248, 248, 248}));
    EXPECT_EQ(decoded(bit_fields(0x7FFF, {0x7C00, 0x03E0, 0x001F}), {1, 0, 0, 1, 1}), (Bytes{248, 248, 248}));
    EXPECT_EQ(decoded(bit_fields(0x0FFF, {0x0F00, 0x00F0, 0x000F}), {1, 0, 0, 1, 1}), (Bytes{240, 240, 240}));
    EXPECT_EQ(decoded(bit_fields(0xFFFF, {0xF800, 0x07E0, 0x001F}), {1, 0, 0, 1, 1}), (Bytes{248, 252, 248}));
    // The 444 colours keep their four bits at the top of the RGB565 fields.
    EXPECT_EQ(decoded(bit_fields(0x0FFF, {0x0F00, 0x00F0, 0x000F}), {0, 0, 0, 1, 1}), (Bytes{0x9E, 0xF7}));
    EXPECT_EQ(decoded(bit_fields(0x7FFF, {}), {0, 0, 0, 1, 1}), (Bytes{0xDF, 0xFF}));
}

TEST_F(BmpEdgeCases, swapped_masks_are_refused) {
    EXPECT_EQ(result_of(bit_fields(0, {0x001F, 0x07E0, 0xF800})), 0);
}

TEST_F(BmpEdgeCases, a_32_bit_pixel_with_a_fourth_byte_of_0_is_opaque) {
    for (const uint8_t fourth : {uint8_t{0}, uint8_t{128}, uint8_t{255}}) {
        const BmpFile file = one_pixel(32, {1, 2, 3, fourth});
        EXPECT_EQ(decoded(file, {7, 0, 0, 1, 1}), (Bytes{3, 2, 1, 255}));
        EXPECT_EQ(decoded(file, {8, 0, 0, 1, 1}), (Bytes{1, 2, 3, 255}));
        EXPECT_EQ(decoded(file, {5, 0, 0, 1, 1}), (Bytes{255, 3, 2, 1}));
        EXPECT_EQ(decoded(file, {7, 0, 0x700, 1, 1}), (Bytes{0, 0, 0, 255}));
    }
}

TEST_F(BmpEdgeCases, white_reduces_to_252_from_32_bits_and_to_255_from_24) {
    EXPECT_EQ(decoded(flat_bmp(variant_named("thirty_two_bits"), 4, 4, 0xFFFFFFFF), {1, 0, 0, 2, 2}), Bytes(12, 252));
    EXPECT_EQ(decoded(flat_bmp(variant_named("twenty_four_bits"), 4, 4, 0xFFFFFF), {1, 0, 0, 2, 2}), Bytes(12, 255));
}

TEST_F(BmpEdgeCases, four_by_four_reduces_to_two_by_two_averages) {
    BmpFile file;
    file.width = 4;
    file.height = -4;
    for (uint8_t y = 0; y < 4; ++y) {
        Bytes row;
        for (uint8_t x = 0; x < 4; ++x)
            append(row, {static_cast<uint8_t>(y * 4 + x), 100, static_cast<uint8_t>(200 + y)});
        file.rows.push_back(row);
    }
    // Blue of the first block: (0 + 1 + 4 + 5) / 4 = 2; red: (200 + 200 + 201 + 201) / 4 = 200.
    EXPECT_EQ(decoded(file, {1, 0, 0, 2, 2}), (Bytes{200, 100, 2, 200, 100, 4, 202, 100, 10, 202, 100, 12}));
}

TEST_F(BmpEdgeCases, scaled_format_6_exchanges_red_and_blue_except_from_32_bits) {
    for (const BmpVariant &variant : bmp_variants) {
        const bool indexed = variant.bits <= 8;
        const uint32_t red = indexed              ? 0
                             : variant.bits == 16 ? (variant.compression == 3 ? variant.masks[0] : 0x7C00)
                                                  : 0xFF0000;
        const BmpFile file = flat_bmp(variant, 2, 2, red, indexed ? Bytes{0, 0, 255, 0, 0, 0, 0, 0} : Bytes{});
        const Bytes plain = decoded(file, {6, 0, 0, 2, 2});
        const Bytes scaled = decoded(file, {6, 0, 0, 1, 1});
        const bool four_bits = variant.masks[0] == 0x0F00;
        const uint8_t in_high = four_bits ? 0xF0 : 0xF8;
        const uint8_t in_low = four_bits ? 0x1E : 0x1F;
        EXPECT_EQ(Bytes(plain.begin(), plain.begin() + 3), (Bytes{0, in_high, 255})) << variant.name;
        // 255 / 4 summed four times is 252, whose top five bits are the same.
        EXPECT_EQ(scaled, variant.bits == 32 ? (Bytes{0, in_high, 255}) : (Bytes{in_low, 0, 255})) << variant.name;
        // Format 0 is never reversed.
        EXPECT_EQ(decoded(file, {0, 0, 0, 1, 1}), (Bytes{0, in_high})) << variant.name;
    }
}

TEST_F(BmpEdgeCases, stretching_to_its_own_size_gives_the_same_colours) {
    for (const BmpVariant &variant : bmp_variants) {
        if (variant.bits == 32) continue; // loses its low two bits
        const BmpFile file = noise_bmp(variant, 9, 7, false);
        EXPECT_EQ(decoded(file, {1, 0, 0x700, 9, 7}), decoded(file, {1, 0, 0, 9, 7})) << variant.name;
    }
    const BmpFile file = one_pixel(32, {7, 130, 255, 0});
    EXPECT_EQ(decoded(file, {1, 0, 0x700, 1, 1}), (Bytes{252, 128, 4}));
}

TEST_F(BmpEdgeCases, the_second_sample_of_a_width_is_three_times_the_width_divided_by_four) {
    // Width 5 to 2: (3 x 5) >> 2 is 3, 3 x (5 >> 2) would be 3; width 7 to 2: 5, and 3. Columns of 2 units each.
    BmpFile file;
    file.width = 7;
    file.rows = {{}};
    for (uint8_t x = 0; x < 7; ++x)
        append(file.rows[0], {static_cast<uint8_t>(x * 40), 0, 0});
    // Column 0: points 1 and 5, source columns 0 and 2. Column 1: points 8 and 12, source columns 4 and 6.
    EXPECT_EQ(decoded(file, {1, 0, 0x700, 2, 1}), (Bytes{0, 0, 40, 0, 0, 200}));
}

TEST_F(BmpEdgeCases, exact_placement_turned_keeps_the_unturned_row_length) {
    // 2 x 1 turned by 90: the cursor is 0 + ((2 - 1) >> 1) + 2 x ((1 - 2) >> 1) = -2, then one row of two further on.
    BmpFile file;
    file.width = 2;
    file.rows = {{1, 2, 3, 4, 5, 6}};
    TestSource quarter(PELM_SOURCE_MEMORY, file_bytes(file));
    EXPECT_EQ(decode_bmp(quarter, {1, 1, 0x100, 1, 2}, 6).output, (Bytes{6, 5, 4, b_, b_, b_}));
    TestSource three_quarters(PELM_SOURCE_MEMORY, file_bytes(file));
    // 270: 0 + 2 x (1 - 1) = 0, then two pixels back.
    EXPECT_EQ(decode_bmp(three_quarters, {1, 3, 0x100, 1, 2}, 6).output, (Bytes{3, 2, 1, b_, b_, b_}));
}

TEST_F(BmpEdgeCases, a_decode_can_be_repeated_with_the_same_records) {
    for (const uint32_t kind : all_kinds) {
        TestSource source(kind, file_bytes(noise_bmp(variant_named("eight_bits"), 9, 7, false)), 50);
        const BmpDecode first = decode_bmp(source, {1, 0, 0, 9, 7}, 189);
        const BmpDecode second = decode_bmp(source, {1, 0, 0, 9, 7}, 189);
        EXPECT_EQ(first.result, 1);
        EXPECT_EQ(second.result, 1);
        EXPECT_EQ(first.output, second.output);
        EXPECT_NE(first.output, Bytes(189, background));
    }
}

} // namespace
} // namespace pelm::test

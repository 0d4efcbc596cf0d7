// Run-length codes by hand: each of them, and where they end.
#include "tests/bmp/expectations.h"
#include "tests/support/run_length_codes.h"
#include "tests/support/two_step.h"

namespace pelm::test {
namespace {

// Entry i is the grey i, so that pixels are indices.
Bytes grey_palette() {
    Bytes palette;
    for (int i = 0; i < 256; ++i)
        palette.insert(palette.end(), 4, static_cast<uint8_t>(i));
    return palette;
}

class BmpRunLength : public HostedTest {
protected:
    // The pixels of a picture of grey indices, from the top left; background where nothing was written.
    static Bytes decoded(int bits, int32_t width, int32_t height, const Bytes &codes) {
        const BmpFile file = run_length_bmp(bits, width, height, codes, grey_palette());
        Bytes bytes = file_bytes(file);
        bytes.resize(file.rows_at() + codes.size());
        const BmpRequest request{1, 0, 0, width, std::abs(height)};
        const size_t pixels = static_cast<size_t>(width * std::abs(height));
        Bytes first;
        for (const uint32_t kind : all_kinds) {
            TestHost::get().reset();
            TestSource source(kind, bytes, 64);
            const BmpDecode decode = decode_by(two_steps(request), source, request, 3 * pixels);
            EXPECT_EQ(decode.result, 1);
            EXPECT_EQ(decode.misbehaviour, "");
            EXPECT_TRUE(decode.live_blocks.empty());
            Bytes indices;
            for (size_t i = 0; i < pixels; ++i)
                indices.push_back(decode.output[3 * i]);
            if (first.empty()) first = indices;
            EXPECT_EQ(indices, first) << "kind " << kind;
        }
        return first;
    }
};

constexpr uint8_t b = background;

TEST_F(BmpRunLength, a_count_repeats_an_index) {
    EXPECT_EQ(decoded(8, 5, 1, {3, 7, 2, 9, 0, 0}), (Bytes{7, 7, 7, 9, 9}));
}

TEST_F(BmpRunLength, a_count_of_4_bits_alternates_two_indices) {
    EXPECT_EQ(decoded(4, 6, 1, {5, 0x7A, 1, 0x34, 0, 0}), (Bytes{7, 10, 7, 10, 7, 3}));
}

TEST_F(BmpRunLength, rows_are_stored_from_the_bottom_up_unless_the_height_is_negative) {
    EXPECT_EQ(decoded(8, 1, 3, {1, 1, 0, 0, 1, 2, 0, 0, 1, 3, 0, 0}), (Bytes{3, 2, 1}));
    BmpFile file = run_length_bmp(8, 1, -3, {1, 1, 0, 0, 1, 2, 0, 0, 1, 3, 0, 0}, grey_palette());
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
    const BmpRequest request{1, 0, 0, 1, 3};
    EXPECT_EQ(decode_by(two_steps(request), source, request, 9).output, (Bytes{1, 1, 1, 2, 2, 2, 3, 3, 3}));
}

TEST_F(BmpRunLength, literal_indices_are_padded_to_an_even_number_of_bytes) {
    EXPECT_EQ(decoded(8, 5, 1, {0, 3, 7, 8, 9, 0xEE, 2, 4, 0, 0}), (Bytes{7, 8, 9, 4, 4}));
    EXPECT_EQ(decoded(8, 5, 1, {0, 4, 7, 8, 9, 6, 1, 4, 0, 0}), (Bytes{7, 8, 9, 6, 4}));
    EXPECT_EQ(decoded(4, 7, 1, {0, 3, 0x78, 0x9E, 4, 0x12, 0, 0}), (Bytes{7, 8, 9, 1, 2, 1, 2}));
    EXPECT_EQ(decoded(4, 7, 1, {0, 5, 0x78, 0x9A, 0xBE, 0xEE, 2, 0x12, 0, 0}), (Bytes{7, 8, 9, 10, 11, 1, 2}));
    EXPECT_EQ(decoded(4, 7, 1, {0, 6, 0x78, 0x9A, 0xBC, 0xEE, 1, 0x12, 0, 0}), (Bytes{7, 8, 9, 10, 11, 12, 1}));
}

TEST_F(BmpRunLength, even_offsets_count_from_the_first_code) {
    // With 15 palette bytes before them the codes begin at an odd place of the file.
    BmpFile file = run_length_bmp(4, 5, 1, {0, 5, 0x12, 0x34, 0x5E, 0xEE, 0, 0}, Bytes(64, 0));
    for (size_t i = 0; i < 64; ++i)
        file.palette[i] = static_cast<uint8_t>(i / 4);
    file.gap = Bytes(1, 0xDD);
    for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM}) {
        TestSource source(kind, file_bytes(file), 8);
        const BmpRequest request{1, 0, 0, 5, 1};
        EXPECT_EQ(decode_by(two_steps(request), source, request, 15).output,
                  (Bytes{1, 1, 1, 2, 2, 2, 3, 3, 3, 4, 4, 4, 5, 5, 5}));
    }
}

TEST_F(BmpRunLength, pixels_without_a_code_have_index_0) {
    EXPECT_EQ(decoded(8, 4, 2, {4, 5, 0, 0, 1, 7, 0, 0}), (Bytes{7, 0, 0, 0, 5, 5, 5, 5}));
    EXPECT_EQ(decoded(4, 4, 3, {4, 0x55, 0, 0, 0, 0, 1, 0x70, 0, 0}), (Bytes{7, 0, 0, 0, 0, 0, 0, 0, 5, 5, 5, 5}));
}

TEST_F(BmpRunLength, a_delta_moves_nothing) {
    EXPECT_EQ(decoded(8, 4, 2, {1, 5, 0, 2, 2, 1, 1, 6, 0, 0, 0, 2, 0, 0, 2, 7, 0, 0}),
              (Bytes{7, 7, 0, 0, 5, 6, 0, 0}));
    EXPECT_EQ(decoded(4, 4, 1, {1, 0x50, 0, 2, 255, 255, 1, 0x60, 0, 0}), (Bytes{5, 6, 0, 0}));
}

TEST_F(BmpRunLength, the_end_of_the_bitmap_ends_a_row_and_no_more) {
    EXPECT_EQ(decoded(8, 2, 3, {2, 1, 0, 1, 2, 2, 0, 1, 2, 3, 0, 0}), (Bytes{3, 3, 2, 2, 1, 1}));
}

TEST_F(BmpRunLength, rows_do_not_end_at_the_width) {
    EXPECT_EQ(decoded(8, 2, 2, {9, 1, 5, 2, 0, 0, 0, 5, 3, 4, 5, 6, 7, 0xEE, 8, 8, 0, 0}), (Bytes{3, 4, 1, 1}));
    EXPECT_EQ(decoded(4, 2, 2, {9, 0x12, 5, 2, 0, 0, 0, 5, 0x34, 0x56, 0x7E, 0xEE, 8, 8, 0, 0}), (Bytes{3, 4, 1, 2}));
}

TEST_F(BmpRunLength, a_row_that_is_not_ended_is_dropped) {
    EXPECT_EQ(decoded(8, 2, 2, {2, 1, 0, 0, 2, 2}), (Bytes{b, b, 1, 1}));
    EXPECT_EQ(decoded(8, 2, 2, {2, 1, 0, 0, 2, 2, 0}), (Bytes{b, b, 1, 1}));
    EXPECT_EQ(decoded(8, 2, 1, {}), (Bytes{b, b}));
    EXPECT_EQ(decoded(8, 2, 1, {0, 3, 1, 2}), (Bytes{b, b}));
    EXPECT_EQ(decoded(8, 2, 1, {2, 1, 0, 2, 9}), (Bytes{b, b}));
    EXPECT_EQ(decoded(8, 2, 1, {0, 3, 1, 2, 3}), (Bytes{b, b}));
}

TEST_F(BmpRunLength, codes_behind_the_last_row_are_not_looked_at) {
    EXPECT_EQ(decoded(8, 2, 1, {2, 1, 0, 0, 0, 1, 2, 9, 0, 0}), (Bytes{1, 1}));
}

TEST_F(BmpRunLength, codes_of_the_other_depth_are_plain_rows) {
    for (const auto &[name, compression] : {std::pair{"four_bits", 1u},
                                            {"eight_bits", 2u},
                                            {"one_bit", 1u},
                                            {"one_bit", 2u},
                                            {"twenty_four_bits", 1u},
                                            {"twenty_four_bits", 2u},
                                            {"thirty_two_bits", 1u},
                                            {"eight_bits", 6u},
                                            {"four_bits", 6u}})
        for (const uint32_t kind : all_kinds) {
            BmpFile file = noise_bmp(variant_named(name), 9, 7, false);
            file.compression = compression;
            BmpSubject subject(file, kind, 60);
            for (const BmpRequest &request : {BmpRequest{1, 0, 0, 9, 7}, BmpRequest{7, 1, 0, 5, 5}})
                EXPECT_EQ(subject.difference(two_steps(request), request, subject.expect(request)), "");
        }
}

TEST_F(BmpRunLength, one_call_and_bands_refuse_codes) {
    for (const int bits : {4, 8}) {
        BmpFile file = run_length_bmp(bits, 2, 1, {2, 1, 0, 0}, grey_palette());
        TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
        ImageDecodeInfo info{};
        info.input = &source.source;
        uint8_t output[4];
        EXPECT_EQ(ZOTARPELMI_DecodeBMP(&info, output, 2, 1), 0);
        EXPECT_EQ(ZOTARPELMI_DecodeBMPIter(&info, output, 2, 1), 0);
        EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, output, 2, 1, 1), 0);
        EXPECT_TRUE(host.live_blocks().empty());
    }
}

} // namespace
} // namespace pelm::test

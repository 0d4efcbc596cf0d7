// Files cut at every length, from every kind of source, 1:1 and scaled: which rows still land, against the model.
#include "tests/bmp/expectations.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

class BmpTruncation : public HostedTest, public ::testing::WithParamInterface<BmpVariant> {
protected:
    void expect_every_length(BmpFile file, const std::vector<BmpRequest> &requests) {
        const size_t whole = file_bytes(file).size();
        const size_t step = quick() ? 3 : 1;
        // A large palette is cut in larger steps.
        for (size_t length = 0; length <= whole; length += length + 8 < file.rows_at() && length > 70 ? 5 : step)
            for (const uint32_t kind : all_kinds)
                for (const int32_t buffer_size : kind == PELM_SOURCE_MEMORY ? std::vector{0} : std::vector{0, 100}) {
                    BmpSubject subject(file, length, kind, buffer_size);
                    for (const BmpRequest &request : requests)
                        ASSERT_TRUE(decodes_as_computed(subject, request));
                }
    }
};

TEST_P(BmpTruncation, a_file_cut_anywhere_gives_the_rows_that_are_whole) {
    for (const bool top_down : {false, true})
        for (const int32_t width : {1, 5, 8, 9}) {
            BmpFile file = noise_bmp(GetParam(), width, 6, top_down);
            file.palette.resize(std::min<size_t>(file.palette.size(), 4 * 20));
            expect_every_length(file, {{1, 0, 0, width, 6}, {0, 1, 0x100, 6, width}, {7, 3, 0, 9, 11}});
        }
}

TEST_P(BmpTruncation, a_scaled_file_cut_anywhere_gives_the_rows_whose_samples_are_all_there) {
    for (const bool top_down : {false, true})
        for (const int32_t width : {1, 5, 8, 9}) {
            BmpFile file = noise_bmp(GetParam(), width, 7, top_down);
            file.palette.resize(std::min<size_t>(file.palette.size(), 4 * 20));
            expect_every_length(file,
                                {{1, 0, 0x700, 4, 3}, {6, 2, 0x700, 3, 17}, {8, 1, 0, 5, 5}, {1, 0, 0x700, width, 7}});
        }
}

TEST_P(BmpTruncation, pixels_before_and_behind_the_stated_offset) {
    for (const uint32_t offset : {0u, 10u, 54u, 58u, 70u, 200u, 1000u, 100000u, 0x7FFFFFF0u})
        for (const bool top_down : {false, true})
            for (const uint32_t kind : all_kinds) {
                BmpFile file = noise_bmp(GetParam(), 5, 6, top_down);
                file.pixel_data_offset = offset;
                BmpSubject subject(file, kind, 64);
                for (const BmpRequest &request :
                     {BmpRequest{1, 0, 0, 5, 6}, BmpRequest{1, 0, 0, 3, 3}, BmpRequest{1, 3, 0x700, 9, 3}})
                    EXPECT_TRUE(decodes_as_computed(subject, request)) << "offset " << offset;
            }
}

INSTANTIATE_TEST_SUITE_P(Variants, BmpTruncation, ::testing::ValuesIn(bmp_variants),
                         [](const auto &variant) { return std::string(variant.param.name); });

class BmpCutting : public HostedTest {};

TEST_F(BmpCutting, a_last_row_without_its_padding_is_missing_at_its_own_size_and_present_when_scaled) {
    BmpFile file;
    file.width = 1;
    file.height = 2;
    file.rows = {{10, 10, 10}, {20, 20, 20}}; // strides of 4
    Bytes bytes = file_bytes(file);
    bytes.pop_back();
    TestSource plain(PELM_SOURCE_MEMORY, bytes);
    const uint8_t b = background;
    EXPECT_EQ(decode_bmp(plain, {1, 0, 0, 1, 2}, 6).output, (Bytes{b, b, b, 10, 10, 10}));
    TestSource scaled(PELM_SOURCE_MEMORY, bytes);
    EXPECT_EQ(decode_bmp(scaled, {1, 0, 0x700, 1, 2}, 6).output, (Bytes{20, 20, 20, 10, 10, 10}));
    for (const uint32_t kind : stream_kinds) {
        TestSource stream(kind, bytes);
        EXPECT_EQ(decode_bmp(stream, {1, 0, 0x700, 1, 2}, 6).output, (Bytes{b, b, b, 10, 10, 10}));
    }
}

TEST_F(BmpCutting, a_scaled_row_that_starts_in_the_last_two_bytes_is_not_looked_at) {
    BmpFile file = flat_bmp(variant_named("eight_bits"), 1, 1, 1, {1, 1, 1, 0, 9, 9, 9, 0});
    Bytes bytes = file_bytes(file);
    ASSERT_EQ(bytes.size(), 54u + 8 + 4);
    for (const size_t row_size : {4u, 3u, 2u, 1u, 0u}) {
        bytes.resize(54 + 8 + row_size);
        TestSource source(PELM_SOURCE_MEMORY, bytes);
        const uint8_t expected = row_size > 2 ? 9 : background;
        EXPECT_EQ(decode_bmp(source, {1, 0, 0x700, 1, 1}, 3).output, Bytes(3, expected)) << row_size << " bytes";
    }
}

TEST_F(BmpCutting, offsets_beyond_31_bits_show_nothing_and_do_no_harm) {
    for (const char *const variant : {"twenty_four_bits", "sixteen_bits_565", "thirty_two_bits"})
        for (const uint32_t offset : {0x7FFFFFFFu, 0x80000000u, 0x80000036u, 0xFFFFFFF0u, 0xFFFFFFFFu})
            for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT})
                for (const uint32_t placement : {0u, 0x700u})
                    for (const bool top_down : {false, true}) {
                        host.reset();
                        BmpFile file = noise_bmp(variant_named(variant), 5, 6, top_down);
                        file.pixel_data_offset = offset;
                        TestSource source(kind, file_bytes(file));
                        // Stretched to a single row, a top-down decode begins at the second one.
                        const int32_t box_height = placement == 0 ? 6 : 1;
                        const size_t size = static_cast<size_t>(15 * box_height);
                        const BmpDecode decode = decode_bmp(source, {1, 0, placement, 5, box_height}, size);
                        EXPECT_EQ(decode.result, 1) << variant << ", offset " << offset << ", kind " << kind;
                        EXPECT_EQ(decode.output, Bytes(size, background)) << variant << ", offset " << offset;
                        EXPECT_EQ(decode.misbehaviour, "");
                        EXPECT_TRUE(decode.live_blocks.empty());
                        for (const SeekCall &seek : host.seeks)
                            EXPECT_GE(seek.offset, 0) << "offset " << offset;
                    }
}

} // namespace
} // namespace pelm::test

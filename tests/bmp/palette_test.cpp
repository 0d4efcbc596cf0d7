// How many palette entries are read, from where, and what the entries that were not read look like.
#include "bmp/working.h"
#include "tests/bmp/expectations.h"

namespace pelm::test {
namespace {

const BmpVariant &indexed8 = variant_named("eight_bits");

class BmpPalette : public HostedTest {};

// A file whose header states another offset of the pixels than they have, with something readable everywhere.
BmpFile file_stating(uint32_t offset, const char *variant = "eight_bits") {
    BmpFile file = noise_bmp(variant_named(variant), 6, 5, false);
    file.pixel_data_offset = offset;
    return file;
}

// The size that the record's palette was read with: what a stream was asked for behind the header.
int32_t palette_read_size(TestHost &host, const BmpFile &file) {
    host.reset();
    Bytes bytes = file_bytes(file);
    bytes.resize(54 + 4 * 0x8000 + 1000);
    TestSource source(PELM_SOURCE_STREAM, bytes);
    ImageDecodeInfo info{};
    info.input = &source.source;
    BmpState *const state = PELMI_BMP_Initialize(&info, 6, 5, nullptr);
    if (state == nullptr) return -1;
    int32_t size = 0;
    for (size_t i = 1; i < host.reads.size(); ++i)
        size += host.reads[i].asked;
    PELMI_BMP_DeleteDecInfo(state);
    return size;
}

TEST_F(BmpPalette, the_pixel_data_offset_decides_the_number_of_entries) {
    struct Case {
        uint32_t offset;
        int32_t size;
    };
    for (const Case &c : {Case{0, 52},          Case{1, 52},      Case{13, 52},     Case{53, 52},
                          Case{54, 52},         Case{55, 0},      Case{56, 0},      Case{57, 0},
                          Case{58, 4},          Case{61, 4},      Case{62, 8},      Case{118, 64},
                          Case{1078, 1024},     Case{1081, 1024}, Case{1082, 1028}, Case{54 + 4 * 1000, 4000},
                          Case{131125, 131068}, Case{262198, 0},  Case{262201, 0},  Case{262202, 4}})
        EXPECT_EQ(palette_read_size(host, file_stating(c.offset)), c.size) << "offset " << c.offset;
}

TEST_F(BmpPalette, a_negative_number_of_entries_is_refused_and_leaves_nothing) {
    for (const char *const variant : {"one_bit", "four_bits", "eight_bits"})
        for (const uint32_t offset : {131126u, 131127u, 200000u, 262197u, 131126u + 262144u, 0xFFFFFFFFu, 0x80020036u})
            for (const uint32_t kind : all_kinds) {
                BmpSubject subject(file_stating(offset, variant), kind);
                EXPECT_TRUE(subject.expect({1, 0, 0, 6, 5}).refused) << offset;
                EXPECT_TRUE(decodes_as_computed(subject, {1, 0, 0, 6, 5})) << offset;
            }
}

TEST_F(BmpPalette, large_offsets_of_deeper_images_are_not_palettes) {
    for (const char *const variant : {"sixteen_bits_plain", "twenty_four_bits", "thirty_two_bits"})
        for (const uint32_t offset : {131126u, 262197u, 0x7FFFFFFFu}) {
            BmpSubject subject(file_stating(offset, variant));
            EXPECT_TRUE(decodes_as_computed(subject, {1, 0, 0, 6, 5})) << offset;
            EXPECT_EQ(subject.expect({1, 0, 0, 6, 5}).pixels_landed, 0u);
        }
}

TEST_F(BmpPalette, every_stated_offset_decodes_as_computed) {
    for (const char *const variant : {"one_bit", "four_bits", "eight_bits"})
        for (uint32_t offset = 0; offset < 1100; offset += offset < 70 ? 1 : 37)
            for (const uint32_t kind : all_kinds) {
                BmpFile file = file_stating(offset, variant);
                BmpSubject subject(file, kind);
                EXPECT_TRUE(decodes_as_computed(subject, {1, 0, 0, 6, 5})) << "offset " << offset;
                EXPECT_TRUE(decodes_as_computed(subject, {1, 0, 0, 3, 3})) << "offset " << offset;
            }
}

TEST_F(BmpPalette, every_number_of_entries_decodes_as_computed) {
    for (const char *const variant : {"one_bit", "four_bits", "eight_bits"})
        for (const uint32_t entries : {1u, 2u, 3u, 15u, 16u, 17u, 100u, 255u, 256u, 257u, 1000u})
            for (const uint32_t kind : all_kinds) {
                BmpFile file = noise_bmp(variant_named(variant), 33, 9, false);
                file.palette = noise_palette(entries, 5);
                BmpSubject subject(file, kind);
                EXPECT_TRUE(decodes_as_computed(subject, {1, 0, 0, 33, 9})) << entries << " entries";
            }
}

TEST_F(BmpPalette, odd_bytes_between_palette_and_pixels_are_not_an_entry) {
    for (const size_t gap : {1u, 2u, 3u})
        for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM}) {
            BmpFile file = noise_bmp(indexed8, 33, 9, false);
            file.palette = noise_palette(20, 5);
            file.gap = Bytes(gap, 0x99);
            BmpSubject subject(file, kind);
            EXPECT_TRUE(decodes_as_computed(subject, {1, 0, 0, 33, 9}));
        }
}

TEST_F(BmpPalette, the_colour_count_of_the_header_does_not_matter) {
    for (const uint32_t colors_used : {0u, 1u, 2u, 16u, 256u, 257u, 0xFFFFFFFFu}) {
        BmpFile file = noise_bmp(indexed8, 33, 9, false);
        file.colors_used = colors_used;
        for (const uint32_t kind : all_kinds) {
            BmpSubject subject(file, kind);
            EXPECT_TRUE(decodes_as_computed(subject, {1, 0, 0, 33, 9})) << "colours used " << colors_used;
        }
    }
}

TEST_F(BmpPalette, the_palette_stands_at_offset_54_behind_every_header) {
    for (const uint32_t header_size : {12u, 40u, 56u, 60u, 64u, 296u})
        for (const char *const variant : {"one_bit", "four_bits", "eight_bits"})
            for (const uint32_t kind : all_kinds) {
                BmpFile file = noise_bmp(variant_named(variant), 9, 7, false);
                file.header_size = header_size;
                BmpSubject subject(file, kind);
                EXPECT_TRUE(decodes_as_computed(subject, {1, 0, 0, 9, 7})) << "header size " << header_size;
            }
}

TEST_F(BmpPalette, indices_beyond_the_loaded_entries_are_black) {
    BmpFile file = flat_bmp(indexed8, 3, 2, 200, noise_palette(20, 1));
    for (const uint32_t kind : all_kinds) {
        TestSource source(kind, file_bytes(file));
        const BmpDecode decode = decode_bmp(source, {7, 0, 0, 3, 2}, 24);
        EXPECT_EQ(decode.result, 1);
        for (size_t i = 0; i < 24; i += 4)
            EXPECT_EQ((Bytes(decode.output.begin() + static_cast<ptrdiff_t>(i),
                             decode.output.begin() + static_cast<ptrdiff_t>(i) + 4)),
                      (Bytes{0, 0, 0, 255}));
    }
}

TEST_F(BmpPalette, the_block_holds_256_entries_or_all_that_are_read_and_is_cleared) {
    for (const uint32_t entries : {0u, 2u, 16u, 255u, 256u, 257u, 2000u}) {
        BmpFile file = noise_bmp(indexed8, 4, 4, false);
        file.palette = noise_palette(entries, 3);
        if (entries == 0) file.gap = Bytes(1, 0); // offset 55: no entries, where 54 would be 13
        for (const uint32_t kind : all_kinds) {
            host.reset();
            TestSource source(kind, file_bytes(file));
            ImageDecodeInfo info{};
            info.input = &source.source;
            BmpState *const state = PELMI_BMP_Initialize(&info, 4, 4, nullptr);
            ASSERT_NE(state, nullptr);
            ASSERT_GE(host.allocations.size(), 2u);
            EXPECT_EQ(host.allocations[1], std::max(1024u, entries * 4));
            for (uint32_t i = 0; i < std::max(1024u, entries * 4); ++i)
                ASSERT_EQ(state->palette[i], i < entries * 4 ? file.palette[i] : 0) << "byte " << i;
            PELMI_BMP_DeleteDecInfo(state);
        }
    }
}

TEST_F(BmpPalette, memory_that_ends_inside_the_palette_loads_what_is_there) {
    const BmpFile file = noise_bmp(indexed8, 4, 4, false);
    const Bytes bytes = file_bytes(file);
    for (const size_t length : {54u, 55u, 57u, 58u, 500u, 1077u, 1078u}) {
        TestSource source(PELM_SOURCE_MEMORY, Bytes(bytes.begin(), bytes.begin() + static_cast<ptrdiff_t>(length)));
        ImageDecodeInfo info{};
        info.input = &source.source;
        BmpState *const state = PELMI_BMP_Initialize(&info, 4, 4, nullptr);
        ASSERT_NE(state, nullptr);
        for (size_t i = 0; i < 1024; ++i)
            ASSERT_EQ(state->palette[i], 54 + i < length ? bytes[54 + i] : 0) << "byte " << i << " of " << length;
        PELMI_BMP_DeleteDecInfo(state);
    }
}

TEST_F(BmpPalette, a_stream_that_ends_inside_the_palette_leaves_record_and_palette) {
    const BmpFile file = noise_bmp(variant_named("four_bits"), 4, 4, false);
    for (size_t length = 54; length < 54 + 64; ++length)
        for (const uint32_t kind : stream_kinds) {
            host.reset();
            Bytes bytes = file_bytes(file);
            bytes.resize(length);
            TestSource source(kind, bytes);
            const BmpDecode decode = decode_bmp(source, {1, 0, 0, 4, 4}, 48);
            EXPECT_EQ(decode.result, 0);
            EXPECT_EQ(decode.info.decoderState, nullptr);
            EXPECT_EQ(decode.live_blocks, (std::vector<uint32_t>{sizeof(BmpState), 1024}));
            EXPECT_EQ(decode.misbehaviour, "");
        }
}

} // namespace
} // namespace pelm::test

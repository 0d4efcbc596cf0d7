// Which headers are accepted, which are refused, and what a refusal leaves allocated.
#include "bmp/working.h"
#include "tests/bmp/expectations.h"

namespace pelm::test {
namespace {

const BmpVariant &rgb24 = variant_named("twenty_four_bits");

enum class Leaves { nothing, record, record_and_palette };

class BmpHeader : public HostedTest {
protected:
    // Decodes the first `length` bytes of the file and compares result and leftovers.
    void expect_result(int32_t result, const Bytes &bytes, uint32_t kind, Leaves leaves, const std::string &what) {
        host.reset();
        TestSource source(kind, bytes);
        const BmpDecode decode = decode_bmp(source, {1, 0, 0, 16, 16}, 16 * 16 * 3);
        const std::string where = what + ", source kind " + std::to_string(kind);
        EXPECT_EQ(decode.result, result) << where;
        EXPECT_EQ(decode.info.decoderState, nullptr) << where;
        EXPECT_EQ(decode.misbehaviour, "") << where;
        std::vector<uint32_t> left;
        if (leaves != Leaves::nothing) left.push_back(sizeof(BmpState));
        if (leaves == Leaves::record_and_palette) left.push_back(1024);
        EXPECT_EQ(decode.live_blocks, left) << where;
        if (result == 0) {
            EXPECT_EQ(decode.output, Bytes(decode.output.size(), background)) << where;
        }
    }

    void expect_refused(const BmpFile &file, Leaves leaves, const std::string &what) {
        for (const uint32_t kind : all_kinds)
            expect_result(0, file_bytes(file), kind, leaves, what);
    }

    // Decodes and compares with the model, from every kind of source.
    void expect_decoded(const BmpFile &file, const std::string &what) {
        for (const uint32_t kind : all_kinds) {
            BmpSubject subject(file, kind);
            EXPECT_TRUE(decodes_as_computed(subject, {1, 0, 0, 20, 20})) << what;
        }
    }
};

bool is_accepted_header_size(uint32_t low_byte) {
    return low_byte == 12 || low_byte == 40 || (low_byte >= 56 && low_byte <= 64);
}

TEST_F(BmpHeader, only_header_sizes_12_40_and_56_to_64_are_accepted_and_the_others_leave_the_record) {
    for (uint32_t size = 0; size < 256; ++size) {
        BmpFile file = noise_bmp(rgb24, 5, 4, false);
        file.header_size = size;
        if (is_accepted_header_size(size))
            expect_decoded(file, "header size " + std::to_string(size));
        else
            expect_refused(file, Leaves::record, "header size " + std::to_string(size));
    }
}

TEST_F(BmpHeader, only_the_low_byte_of_the_header_size_counts) {
    for (const uint32_t size : {256u + 40, 512u + 12, 0xFFFFFF28u, 0x12345600u + 12, 0x80000000u + 56, 0x100u + 64}) {
        BmpFile file = noise_bmp(rgb24, 5, 4, false);
        file.header_size = size;
        expect_decoded(file, "header size " + std::to_string(size));
    }
    for (const uint32_t size : {256u, 0x28000000u, 0x2800u, 0x0C00u + 108}) {
        BmpFile file = noise_bmp(rgb24, 5, 4, false);
        file.header_size = size;
        expect_refused(file, Leaves::record, "header size " + std::to_string(size));
    }
}

TEST_F(BmpHeader, a_core_header_has_unsigned_16_bit_sizes) {
    BmpFile file = noise_bmp(rgb24, 3, 5, false);
    file.header_size = 12;
    expect_decoded(file, "a small core header");
    file = noise_bmp(variant_named("one_bit"), 1, 40000, false);
    file.header_size = 12;
    BmpSubject subject(file);
    EXPECT_TRUE(decodes_as_computed(subject, {1, 0, 0, 1, 40000})) << "a core header is never top-down";
    file = noise_bmp(variant_named("one_bit"), 40000, 1, false);
    file.header_size = 12;
    BmpSubject wide(file);
    EXPECT_TRUE(decodes_as_computed(wide, {1, 0, 0, 40000, 1})) << "a core header's width has no sign";
}

TEST_F(BmpHeader, the_signature_must_be_bm) {
    for (const std::array<char, 2> signature : {std::array{'b', 'm'}, std::array{'B', 'N'}, std::array{'M', 'B'},
                                                std::array{'\0', 'M'}, std::array{'B', '\0'}}) {
        BmpFile file = noise_bmp(rgb24, 5, 4, false);
        file.signature = signature;
        expect_refused(file, Leaves::nothing, "a wrong signature");
        file.header_size = 108; // the signature is looked at first
        expect_refused(file, Leaves::nothing, "a wrong signature before a wrong header size");
    }
}

bool is_accepted_compression(uint16_t bits, uint32_t compression) {
    if (compression == 1 || compression == 2 || compression == 4 || compression == 5) return false;
    if (compression == 3) return bits == 16;
    return bits != 16 || compression == 0;
}

TEST_F(BmpHeader, compressions_are_accepted_by_bit_count) {
    for (const uint32_t header_size : {12u, 40u, 56u})
        for (const char *const name :
             {"one_bit", "four_bits", "eight_bits", "sixteen_bits_565", "twenty_four_bits", "thirty_two_bits"}) {
            const BmpVariant &variant = variant_named(name);
            for (const uint32_t compression : {0u, 1u, 2u, 3u, 4u, 5u, 6u, 7u, 11u, 12u, 255u, 65535u}) {
                BmpFile file = noise_bmp(variant, 5, 4, false);
                file.header_size = header_size;
                file.compression = compression;
                if (compression != 3) file.masks.clear();
                const std::string what = std::string(name) + ", compression " + std::to_string(compression) +
                                         ", header size " + std::to_string(header_size);
                if (is_accepted_compression(variant.bits, compression))
                    expect_decoded(file, what);
                else
                    expect_refused(file, Leaves::nothing, what);
            }
        }
}

TEST_F(BmpHeader, all_32_bits_of_the_compression_count) {
    for (const uint32_t compression : {0x10001u, 0x80000002u, 0x00010003u, 0xFFFFFFFFu}) {
        BmpFile file = noise_bmp(rgb24, 5, 4, false);
        file.compression = compression;
        expect_decoded(file, "compression " + std::to_string(compression));
    }
}

TEST_F(BmpHeader, bit_counts_without_a_decoder_are_accepted_and_write_nothing) {
    for (const int bits : {2, 3, 5, 6, 7, 9, 15, 17, 23, 25, 31, 33, 40, 48, 64, 256, 65535}) {
        BmpFile file;
        file.width = 5;
        file.height = 4;
        file.bits = static_cast<uint16_t>(bits);
        file.rows.assign(4, Bytes(static_cast<size_t>(file.row_bytes()), 0x11));
        for (const uint32_t kind : all_kinds)
            for (const uint32_t placement : {0u, 0x700u}) {
                BmpSubject subject(file, kind);
                EXPECT_TRUE(decodes_as_computed(subject, {1, 0, placement, 16, 16}));
            }
    }
}

TEST_F(BmpHeader, a_bit_count_of_0_is_refused) {
    BmpFile file;
    file.width = 5;
    file.height = 4;
    file.bits = 0;
    expect_refused(file, Leaves::nothing, "0 bits");
}

TEST_F(BmpHeader, widths_of_0_and_below_are_refused) {
    for (const int32_t width : {0, -1, -5, INT32_MIN})
        for (const int bits : {1, 8, 16, 24, 32}) {
            BmpFile file;
            file.width = width;
            file.height = 4;
            file.bits = static_cast<uint16_t>(bits);
            file.palette = noise_palette(4, 1);
            expect_refused(file, Leaves::nothing, "width " + std::to_string(width));
        }
}

TEST_F(BmpHeader, sizes_beyond_31_bits_are_refused) {
    struct Case {
        int32_t width, height;
        uint16_t bits;
    };
    for (const Case &c :
         {Case{INT32_MAX, 1, 24}, Case{INT32_MAX, 1, 32}, Case{INT32_MAX, 1, 8}, Case{INT32_MAX, 1, 4},
          Case{0x08000000, 1, 16}, Case{0x04000000, 1, 32}, Case{1, INT32_MIN, 24}, Case{1, INT32_MIN, 1},
          Case{1, INT32_MAX, 24}, Case{1, 0x20000000, 24}, Case{1, -0x20000000, 24}, Case{65536, 65536, 24},
          Case{30000, 30000, 32}, Case{40000, -40000, 16}}) {
        BmpFile file;
        file.width = c.width;
        file.height = c.height;
        file.bits = c.bits;
        file.palette = noise_palette(4, 1);
        const std::string what =
            std::to_string(c.width) + " x " + std::to_string(c.height) + " x " + std::to_string(c.bits);
        expect_refused(file, Leaves::nothing, what);
    }
}

TEST_F(BmpHeader, the_largest_sizes_that_fit_are_accepted) {
    struct Case {
        int32_t width, height;
        uint16_t bits;
    };
    for (const Case &c : {Case{1, 0x1FFFFFFF, 24}, Case{1, -0x1FFFFFFF, 24}, Case{89478485, 1, 24},
                          Case{67108863, 1, 32}, Case{2147483640, 1, 1}}) {
        BmpFile file;
        file.width = c.width;
        file.height = c.height;
        file.bits = c.bits;
        file.palette = noise_palette(4, 1);
        host.reset();
        // Reduced so far that little is allocated; there are no rows.
        TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
        const BmpDecode decode = decode_bmp(source, {1, 0, 0x700, 2, 2}, 12);
        EXPECT_EQ(decode.result, 1) << described(file, 0);
        EXPECT_EQ(decode.output, Bytes(12, background)) << described(file, 0);
        EXPECT_EQ(decode.live_blocks.size(), 0u);
        EXPECT_EQ(decode.misbehaviour, "");
    }
}

TEST_F(BmpHeader, a_stream_that_ends_inside_the_header_leaves_the_record) {
    const Bytes bytes = file_bytes(noise_bmp(rgb24, 5, 4, false));
    for (size_t length = 0; length < 54; ++length)
        for (const uint32_t kind : stream_kinds)
            expect_result(0, Bytes(bytes.begin(), bytes.begin() + static_cast<ptrdiff_t>(length)), kind, Leaves::record,
                          "length " + std::to_string(length));
}

TEST_F(BmpHeader, memory_below_54_bytes_is_refused_before_anything_is_allocated) {
    const Bytes bytes = file_bytes(noise_bmp(rgb24, 5, 4, false));
    for (size_t length = 0; length < 54; ++length) {
        expect_result(0, Bytes(bytes.begin(), bytes.begin() + static_cast<ptrdiff_t>(length)), PELM_SOURCE_MEMORY,
                      Leaves::nothing, "length " + std::to_string(length));
        EXPECT_TRUE(host.allocations.empty());
    }
    TestSource source(PELM_SOURCE_MEMORY, bytes);
    for (const int32_t size : {-1, INT32_MIN}) {
        source.source.size = size;
        ImageDecodeInfo info{};
        info.input = &source.source;
        uint8_t output[16];
        EXPECT_EQ(ZOTARPELMI_DecodeBMP(&info, output, 2, 2), 0);
        EXPECT_TRUE(host.allocations.empty());
    }
}

TEST_F(BmpHeader, memory_without_data_is_refused_before_anything_is_allocated) {
    InputSource source{};
    source.kind = PELM_SOURCE_MEMORY;
    source.size = 1000;
    ImageDecodeInfo info{};
    info.input = &source;
    uint8_t output[16];
    EXPECT_EQ(ZOTARPELMI_DecodeBMP(&info, output, 2, 2), 0);
    EXPECT_EQ(info.decoderState, nullptr);
    EXPECT_TRUE(host.allocations.empty());
}

TEST_F(BmpHeader, unknown_kinds_of_source_are_refused) {
    const Bytes bytes = file_bytes(noise_bmp(rgb24, 5, 4, false));
    for (const uint32_t kind : {3u, 5u, 6u, 0x80000000u, 0xFFFFFFFFu})
        expect_result(0, bytes, kind, Leaves::nothing, "an unknown kind");
}

TEST_F(BmpHeader, three_triples_of_masks_are_accepted) {
    for (const char *const name : {"sixteen_bits_565", "sixteen_bits_555", "sixteen_bits_444"})
        for (const uint32_t header_size : {12u, 40u, 56u, 64u}) {
            BmpFile file = noise_bmp(variant_named(name), 7, 5, false);
            file.header_size = header_size;
            expect_decoded(file, name);
        }
}

TEST_F(BmpHeader, other_masks_are_refused) {
    const std::array<uint32_t, 3> wrong[] = {{0x001F, 0x07E0, 0xF800},
                                             {0xF800, 0x07E0, 0x001E},
                                             {0xF800, 0x03E0, 0x001F},
                                             {0x7C00, 0x07E0, 0x001F},
                                             {0x0F00, 0x00F0, 0x001F},
                                             {0x000F, 0x00F0, 0x0F00},
                                             {0, 0, 0},
                                             {0x1F800, 0x07E0, 0x001F},
                                             {0xFFFFF800, 0x07E0, 0x001F},
                                             {0x7C00, 0x03E0, 0},
                                             {0xF000, 0x0F00, 0x00F0},
                                             {0xF800, 0x107E0, 0x001F},
                                             {0xF800, 0x07E0, 0x8000001F}};
    for (const std::array<uint32_t, 3> &masks : wrong) {
        BmpFile file = noise_bmp(variant_named("sixteen_bits_565"), 5, 4, false);
        file.masks.assign(masks.begin(), masks.end());
        expect_refused(file, Leaves::nothing, "masks " + std::to_string(masks[0]) + " ...");
    }
}

TEST_F(BmpHeader, masks_cut_short_leave_the_record_of_a_stream) {
    const Bytes bytes = file_bytes(noise_bmp(variant_named("sixteen_bits_565"), 5, 4, false));
    for (size_t length = 54; length < 66; ++length) {
        const Bytes cut(bytes.begin(), bytes.begin() + static_cast<ptrdiff_t>(length));
        expect_result(0, cut, PELM_SOURCE_MEMORY, Leaves::nothing, "masks cut at " + std::to_string(length));
        for (const uint32_t kind : stream_kinds)
            expect_result(0, cut, kind, Leaves::record, "masks cut at " + std::to_string(length));
    }
    for (const uint32_t kind : all_kinds)
        expect_result(1, Bytes(bytes.begin(), bytes.begin() + 66), kind, Leaves::nothing, "whole masks");
}

TEST_F(BmpHeader, sixteen_bits_without_bit_fields_are_555_whatever_stands_at_offset_54) {
    BmpFile file = noise_bmp(variant_named("sixteen_bits_plain"), 5, 4, false);
    file.gap = Bytes(12, 0xFF);
    for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT}) {
        BmpSubject subject(file, kind);
        EXPECT_TRUE(decodes_as_computed(subject, {1, 0, 0, 5, 4}));
    }
}

TEST_F(BmpHeader, refusals_leave_the_size_words_of_the_request_alone) {
    BmpFile file = noise_bmp(rgb24, 5, 4, false);
    file.compression = 4;
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
    ImageDecodeInfo info{};
    info.input = &source.source;
    info.outputWidth = 77;
    info.outputHeight = 78;
    uint8_t output[3];
    EXPECT_EQ(ZOTARPELMI_DecodeBMP(&info, output, 1, 1), 0);
    EXPECT_EQ(info.outputWidth, 77);
    EXPECT_EQ(info.outputHeight, 78);
    EXPECT_EQ(info.decodeStarted, 0u);
}

TEST_F(BmpHeader, the_record_of_a_decode_says_what_the_header_says) {
    for (const BmpVariant &variant : bmp_variants)
        for (const bool top_down : {false, true}) {
            host.reset();
            const BmpFile file = noise_bmp(variant, 9, 6, top_down);
            TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
            ImageDecodeInfo info{};
            info.input = &source.source;
            info.outputFormat = 7;
            uint8_t output[12 * 7 * 4];
            BmpState *const state = PELMI_BMP_Initialize(&info, 12, 7, output);
            ASSERT_NE(state, nullptr) << variant.name;
            EXPECT_EQ(info.decoderState, state);
            EXPECT_EQ(info.decodeStarted, 1u);
            EXPECT_EQ(info.outputWidth, 9);
            EXPECT_EQ(info.outputHeight, 6);
            EXPECT_EQ(state->width, 9);
            EXPECT_EQ(state->height, 6);
            EXPECT_EQ(state->bitsPerPixel, variant.bits);
            EXPECT_EQ(state->pixelDataOffset, file.rows_at());
            EXPECT_EQ(state->compression, 0u) << "kept by the run-length decoding entry only";
            EXPECT_EQ(state->palette != nullptr, variant.bits <= 8);
            EXPECT_EQ(state->scaledWidth, 9);
            EXPECT_EQ(state->scaledHeight, 6);
            EXPECT_NE(state->accumulators, nullptr);
            EXPECT_EQ(state->oneToOne, 1u);
            EXPECT_EQ(state->requestedWidth, 12);
            EXPECT_EQ(state->rotation, 0);
            EXPECT_EQ(state->topDown, top_down ? 1u : 0u);
            EXPECT_EQ(state->input, &source.source);
            EXPECT_EQ(state->outputFormat, 7u);
            EXPECT_EQ(state->rowsDone, 0);
            PELMI_BMP_DeleteDecInfo(state);
            EXPECT_EQ(host.live_bytes(), 0u);
        }
}

TEST_F(BmpHeader, the_record_of_a_16_bit_decode_holds_masks_and_shifts) {
    struct Case {
        const char *variant;
        std::array<uint32_t, 3> masks, shifts;
    };
    for (const Case &c : {Case{"sixteen_bits_plain", {0x7C00, 0x03E0, 0x001F}, {1, 1, 0}},
                          Case{"sixteen_bits_565", {0xF800, 0x07E0, 0x001F}, {0, 0, 0}},
                          Case{"sixteen_bits_555", {0x7C00, 0x03E0, 0x001F}, {1, 1, 0}},
                          Case{"sixteen_bits_444", {0x0F00, 0x00F0, 0x000F}, {4, 3, 1}}}) {
        for (const uint32_t kind : all_kinds) {
            TestSource source(kind, file_bytes(noise_bmp(variant_named(c.variant), 3, 2, false)));
            ImageDecodeInfo info{};
            info.input = &source.source;
            BmpState *const state = PELMI_BMP_Initialize(&info, 3, 2, nullptr);
            ASSERT_NE(state, nullptr);
            EXPECT_EQ((std::array{state->redMask, state->greenMask, state->blueMask}), c.masks) << c.variant;
            EXPECT_EQ((std::array{state->redShift, state->greenShift, state->blueShift}), c.shifts) << c.variant;
            PELMI_BMP_DeleteDecInfo(state);
        }
    }
}

TEST_F(BmpHeader, the_accumulators_start_at_zero) {
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(noise_bmp(rgb24, 5, 4, false)));
    ImageDecodeInfo info{};
    info.input = &source.source;
    uint8_t output[300];
    info.flags = PELM_PLACE_STRETCH;
    BmpState *const state = PELMI_BMP_Initialize(&info, 10, 10, output);
    ASSERT_NE(state, nullptr);
    for (int i = 0; i < 20; ++i)
        EXPECT_EQ(state->accumulators[i], 0u) << i;
    PELMI_BMP_DeleteDecInfo(state);
}

} // namespace
} // namespace pelm::test

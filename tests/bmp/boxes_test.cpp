// Boxes, buffers and requests at the edge of sense: nothing may be written outside, nothing may crash, and where a
// result is defined it must be that one.
#include <cstring>

#include "bmp/working.h"
#include "tests/bmp/expectations.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

const BmpVariant &rgb24 = variant_named("twenty_four_bits");

bool fits_31_bits(int64_t value) {
    return value >= INT32_MIN && value <= INT32_MAX;
}

class BmpBoxes : public HostedTest {
protected:
    // Decodes with a NULL output, which is never written.
    BmpDecode decode_to_null(const Bytes &bytes, uint32_t kind, const BmpRequest &request) {
        host.reset();
        TestSource source(kind, bytes, 64);
        BmpDecode decode{};
        decode.info = marked_info(&source.source, request);
        decode.result = ZOTARPELMI_DecodeBMP(&decode.info, nullptr, request.box_width, request.box_height);
        decode.live_blocks = host.live_blocks();
        EXPECT_TRUE(host.violations.empty()) << host.violations.front();
        EXPECT_TRUE(source.unchanged());
        EXPECT_EQ(decode.info.decoderState, nullptr);
        EXPECT_TRUE(decode.live_blocks.empty()) << described(request);
        return decode;
    }
};

TEST_F(BmpBoxes, an_empty_or_negative_box_is_not_written) {
    const int32_t sides[] = {INT32_MIN, INT32_MIN + 1, -100000, -7, -1, 0, 1, 5, 7, 1000, INT32_MAX};
    for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_SEQUENTIAL})
        for (const bool top_down : {false, true})
            for (const int32_t box_width : sides)
                for (const int32_t box_height : sides) {
                    if (box_width > 0 && box_height > 0) continue;
                    for (const uint32_t placement : {0u, 0x100u, 0x200u, 0x700u})
                        for (int turns = 0; turns < 4; ++turns) {
                            host.reset();
                            const BmpRequest request{7, turns, placement, box_width, box_height};
                            TestSource source(kind, file_bytes(noise_bmp(rgb24, 7, 5, top_down)), 64);
                            const BmpDecode decode = decode_bmp(source, request, 4096);
                            ASSERT_EQ(decode.output, Bytes(4096, background)) << described(request);
                            ASSERT_EQ(decode.misbehaviour, "") << described(request);
                            ASSERT_TRUE(decode.live_blocks.empty()) << described(request);
                            ASSERT_EQ(decode.info.decoderState, nullptr);
                            const bool turned = turns % 2 == 1;
                            const ScaledSize size = scaled_size(7, 5, turned ? box_height : box_width,
                                                                turned ? box_width : box_height, placement);
                            const bool defined = fits_31_bits(size.width) && fits_31_bits(size.height) &&
                                                 size.width * 8 <= host.faults.largest_block;
                            if (defined) {
                                ASSERT_EQ(decode.result, 1) << described(request) << ", kind " << kind;
                                ASSERT_EQ(decode.info.outputWidth, size.width) << described(request);
                                ASSERT_EQ(decode.info.outputHeight, size.height) << described(request);
                            }
                        }
                }
}

TEST_F(BmpBoxes, a_box_so_negative_that_a_side_cannot_be_named_is_refused) {
    for (const auto &[width, height] : {std::pair{5, 7}, {7, 5}})
        for (const bool sideways : {false, true}) {
            // The other side follows from the box's, and is longer the longer that side of the image is.
            const bool by_width = (width < height) != sideways;
            const BmpRequest request{7, sideways ? 1 : 0, 0, by_width ? INT32_MIN : 4, by_width ? 4 : INT32_MIN};
            EXPECT_EQ(
                decode_to_null(file_bytes(noise_bmp(rgb24, width, height, false)), PELM_SOURCE_MEMORY, request).result,
                0)
                << width << " x " << height << ", " << described(request);
        }
}

TEST_F(BmpBoxes, giant_boxes_without_an_output_do_no_harm) {
    for (const uint32_t kind : all_kinds)
        for (const int32_t box_width : {1, 7, 65536, 1 << 30, INT32_MAX})
            for (const int32_t box_height : {1, 5, 65536, 1 << 30, INT32_MAX})
                for (const uint32_t format : {0u, 1u, 7u})
                    for (const uint32_t placement : {0u, 0x100u})
                        for (int turns = 0; turns < 4; ++turns) {
                            const BmpRequest request{format, turns, placement, box_width, box_height};
                            const BmpDecode decode =
                                decode_to_null(file_bytes(noise_bmp(rgb24, 7, 5, false)), kind, request);
                            const bool fits = int64_t{box_width} * box_height <= INT32_MAX / 4 || placement == 0x100;
                            ASSERT_TRUE(decode.result == 1 || !fits) << described(request);
                        }
}

TEST_F(BmpBoxes, a_buffer_whose_rows_are_too_long_to_step_over_is_refused) {
    for (const uint32_t format : {0u, 1u, 5u, 6u, 7u, 8u})
        for (int turns = 0; turns < 4; ++turns) {
            host.reset();
            const int32_t row_pixels = INT32_MAX / (format == 0 ? 2 : format == 1 || format == 6 ? 3 : 4) + 1;
            const BmpRequest request{format, turns, 0, row_pixels, 5};
            const Bytes file = file_bytes(noise_bmp(rgb24, 7, 5, false));
            TestSource source(PELM_SOURCE_MEMORY, file, 64);
            ImageDecodeInfo info = marked_info(&source.source, request);
            uint8_t byte = background; // of a buffer that nothing may be written to
            EXPECT_EQ(ZOTARPELMI_DecodeBMP(&info, &byte, row_pixels, 5), 0) << described(request);
            EXPECT_EQ(byte, background);
            EXPECT_TRUE(host.live_blocks().empty()) << described(request);
        }
}

TEST_F(BmpBoxes, stretching_to_a_giant_box_fails_for_want_of_memory) {
    for (const uint32_t kind : all_kinds)
        for (const int32_t box_width : {1 << 28, (1 << 29) - 1, 1 << 29, (1 << 29) + 1, 1 << 30, INT32_MAX})
            for (const bool turned : {false, true}) {
                const BmpRequest request{1, turned ? 1 : 0, 0x700, turned ? 1 : box_width, turned ? box_width : 1};
                EXPECT_EQ(decode_to_null(file_bytes(noise_bmp(rgb24, 7, 5, false)), kind, request).result, 0)
                    << described(request);
            }
}

TEST_F(BmpBoxes, boxes_of_one_row_or_column_are_decoded_as_computed) {
    for (const BmpVariant &variant : bmp_variants)
        for (const bool top_down : {false, true}) {
            BmpSubject subject(noise_bmp(variant, 9, 7, top_down));
            for (int32_t n = 1; n <= 40; n += quick() ? 6 : 1)
                for (const uint32_t placement : {0u, 0x100u, 0x700u})
                    for (int turns = 0; turns < 4; ++turns)
                        for (const uint32_t format : {0u, 6u, 8u}) {
                            ASSERT_TRUE(decodes_as_computed(subject, {format, turns, placement, 1, n}));
                            ASSERT_TRUE(decodes_as_computed(subject, {format, turns, placement, n, 1}, Edge::start));
                        }
        }
}

TEST_F(BmpBoxes, a_null_output_decodes_and_writes_nothing) {
    for (const BmpVariant &variant : bmp_variants)
        for (const uint32_t kind : all_kinds)
            for (const int32_t side : {5, 20})
                for (const uint32_t placement : {0u, 0x100u, 0x700u})
                    for (int turns = 0; turns < 4; ++turns) {
                        const BmpRequest request{0, turns, placement, side, side};
                        const BmpSubject subject(noise_bmp(variant, 11, 13, true), kind);
                        const BmpDecode decode = decode_to_null(file_bytes(subject.file()), kind, request);
                        ASSERT_EQ(decode.result, 1);
                        ASSERT_EQ(decode.info.outputWidth, subject.expect(request).size.width);
                        ASSERT_EQ(decode.info.outputHeight, subject.expect(request).size.height);
                    }
}

TEST_F(BmpBoxes, null_requests_and_null_inputs_give_0) {
    uint8_t output[16];
    EXPECT_EQ(ZOTARPELMI_DecodeBMP(nullptr, output, 2, 2), 0);
    EXPECT_EQ(ZOTARPELMI_DecodeBMP(nullptr, nullptr, 0, 0), 0);
    EXPECT_EQ(PELMI_BMP_Initialize(nullptr, 2, 2, output), nullptr);
    EXPECT_EQ(PELMI_BMP_DestroyBMP(nullptr), 0);
    ImageDecodeInfo info{};
    EXPECT_EQ(ZOTARPELMI_DecodeBMP(&info, output, 2, 2), 0);
    EXPECT_EQ(PELMI_BMP_Initialize(&info, 2, 2, output), nullptr);
    EXPECT_EQ(info.decoderState, nullptr);
    EXPECT_TRUE(host.live_blocks().empty());
    EXPECT_TRUE(host.seeks.empty());
    EXPECT_TRUE(host.reads.empty());
}

TEST_F(BmpBoxes, a_height_of_0_that_fits_succeeds_and_writes_nothing) {
    struct Case {
        BmpRequest request;
        int32_t result, width, height;
    };
    const Case cases[] = {
        {{1, 0, 0, 7, 5}, 1, 7, 0},         {{1, 0, 0, 7, 0}, 1, 7, 0},     {{1, 1, 0, 5, 7}, 1, 7, 0},
        {{1, 2, 0x100, 9, 9}, 1, 7, 0},     {{1, 0, 0x700, 4, 3}, 1, 4, 3}, {{1, 1, 0x700, 4, 3}, 1, 3, 4},
        {{1, 0, 0x700, 30, 30}, 1, 30, 30}, {{1, 0, 0, 6, 5}, 0, 0, 0},     {{1, 1, 0, 7, 5}, 0, 0, 0},
        {{1, 0, 0x100, 6, 100}, 0, 0, 0},   {{1, 0, 0x200, 0, 0}, 0, 0, 0}, {{1, 0, 0, 7, -1}, 0, 0, 0},
    };
    for (const BmpVariant &variant : bmp_variants)
        for (const uint32_t kind : all_kinds)
            for (const Case &c : cases) {
                host.reset();
                BmpFile file = noise_bmp(variant, 7, 1, false); // with a row that must not show
                file.height = 0;
                TestSource source(kind, file_bytes(file));
                const BmpDecode decode = decode_bmp(source, c.request, 4096);
                const std::string what = described(c.request) + ", " + variant.name + ", kind " + std::to_string(kind);
                EXPECT_EQ(decode.result, c.result) << what;
                if (c.result == 1) {
                    EXPECT_EQ(decode.info.outputWidth, c.width) << what;
                    EXPECT_EQ(decode.info.outputHeight, c.height) << what;
                }
                EXPECT_EQ(decode.output, Bytes(4096, background)) << what;
                EXPECT_EQ(decode.misbehaviour, "") << what;
                EXPECT_TRUE(decode.live_blocks.empty()) << what;
            }
}

TEST_F(BmpBoxes, giant_pictures_without_rows_do_no_harm) {
    struct Case {
        int32_t width, height;
        uint16_t bits;
    };
    for (const Case &c :
         {Case{INT32_MAX, 1, 1}, Case{INT32_MAX - 7, 1, 1}, Case{INT32_MAX - 7, -1, 1}, Case{1, 0x1FFFFFFF, 32},
          Case{1, -0x1FFFFFFF, 8}, Case{20000, 20000, 24}, Case{500000000, 1, 4}, Case{23170, 23170, 32}})
        for (const uint32_t kind : all_kinds)
            for (const BmpRequest &request : {BmpRequest{1, 0, 0, 20, 20}, BmpRequest{0, 1, 0x100, 20, 20},
                                              BmpRequest{7, 2, 0x700, 20, 20}, BmpRequest{8, 3, 0x700, 1, 400}}) {
                host.reset();
                BmpFile file;
                file.width = c.width;
                file.height = c.height;
                file.bits = c.bits;
                file.palette = c.bits <= 8 ? noise_palette(2, 1) : Bytes{};
                TestSource source(kind, file_bytes(file));
                const BmpDecode decode = decode_bmp(source, request, 4096);
                EXPECT_EQ(decode.output, Bytes(4096, background)) << described(file, 0);
                EXPECT_EQ(decode.misbehaviour, "") << described(file, 0);
                EXPECT_TRUE(decode.live_blocks.empty()) << described(file, 0);
            }
}

TEST_F(BmpBoxes, rows_behind_a_giant_gap_are_not_reached) {
    // The last rows of a tall picture lie beyond 2 GB: what is there is drawn, the rest is not.
    BmpFile file = noise_bmp(rgb24, 100, 3, false);
    file.height = 7000000; // 300 bytes a row
    for (const uint32_t kind : all_kinds) {
        host.reset();
        TestSource source(kind, file_bytes(file), 1000);
        const BmpDecode decode = decode_bmp(source, {1, 0, 0x700, 3, 2}, 18);
        EXPECT_EQ(decode.result, 1);
        EXPECT_EQ(decode.output, Bytes(18, background));
        EXPECT_EQ(decode.misbehaviour, "");
    }
}

// Whatever a header holds, a decode neither crashes nor leaks more than the refusals that leak do, nor writes outside.
TEST_F(BmpBoxes, headers_of_noise_do_no_harm) {
    Noise noise(99);
    const uint32_t sizes[] = {12, 40, 56, 64, 296};
    const int runs = quick() ? 4000 : 40000;
    for (int i = 0; i < runs; ++i) {
        host.reset();
        BmpFile file = noise_header(noise);
        file.header_size = sizes[noise.below(std::size(sizes))];
        file.compression = noise.below(3) == 0 ? noise.below(8) : 0;
        host.faults.largest_block = 1 << 20;
        const BmpRequest request{noise.below(10), static_cast<int>(noise.below(4)), noise.below(8) << 8,
                                 static_cast<int32_t>(noise.below(40)), static_cast<int32_t>(noise.below(40))};
        TestSource source(all_kinds[noise.below(4)], file_bytes(file), static_cast<int32_t>(noise.below(4000)));
        const size_t output_size =
            static_cast<size_t>(request.box_width * request.box_height * buffer_bytes_per_pixel(request.format));
        const BmpDecode decode = decode_bmp(source, request, output_size, i % 2 == 0 ? Edge::end : Edge::start);
        ASSERT_EQ(decode.misbehaviour, "") << described(file, 0) << "; " << described(request);
        ASSERT_EQ(decode.info.decoderState, nullptr) << described(file, 0) << "; " << described(request);
        ASSERT_LE(decode.live_blocks.size(), decode.result == 1 ? 0u : 2u) << described(file, 0);
    }
}

} // namespace
} // namespace pelm::test

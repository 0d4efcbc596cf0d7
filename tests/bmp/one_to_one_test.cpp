// Pictures that the box holds: every depth, format, rotation, placement and row order, against the model.
#include "tests/bmp/expectations.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

class BmpOneToOne : public HostedTest, public ::testing::WithParamInterface<BmpVariant> {
protected:
    // Every format, rotation and placement; margins of either parity.
    static ::testing::AssertionResult every_request_decodes(BmpSubject &subject, int32_t width, int32_t height) {
        for (const uint32_t format : bmp_formats)
            for (int turns = 0; turns < 4; ++turns)
                for (const uint32_t placement : {0u, 0x100u, 0x200u, 0x700u}) {
                    const int32_t more = static_cast<int32_t>((format + static_cast<uint32_t>(turns)) % 4);
                    const auto outcome = decodes_as_computed_at_both_edges(
                        subject, request_for(width, height, format, turns, placement, more, 3 - more));
                    if (!outcome) return outcome;
                }
        return ::testing::AssertionSuccess();
    }
};

TEST_P(BmpOneToOne, every_request_is_decoded_as_computed) {
    std::vector<std::pair<int32_t, int32_t>> sizes;
    const int32_t step = quick() ? 8 : 1;
    for (int32_t n = 1; n <= 33; n += step)
        for (const int32_t other : quick() ? std::vector{1, n, n * 7 % 33 + 1} : std::vector{1, 2, n, n * 7 % 33 + 1})
            sizes.insert(sizes.end(), {{n, other}, {other, n}});
    for (const auto &[width, height] : sizes)
        for (const bool top_down : {false, true}) {
            BmpSubject subject(
                noise_bmp(GetParam(), width, height, top_down, static_cast<uint32_t>(width * 64 + height)));
            ASSERT_TRUE(every_request_decodes(subject, width, height));
        }
}

TEST_P(BmpOneToOne, every_size_up_to_33_is_decoded_as_computed) {
    Noise noise(GetParam().bits);
    const int32_t step = quick() ? 5 : 1;
    for (int32_t width = 1; width <= 33; width += step)
        for (int32_t height = 1; height <= 33; height += step)
            for (const bool top_down : {false, true}) {
                BmpSubject subject(noise_bmp(GetParam(), width, height, top_down, noise.next()));
                for (int i = 0; i < 6; ++i) {
                    const uint32_t placement = std::array{0u, 0x100u, 0x200u}[noise.below(3)];
                    const BmpRequest request = request_for(
                        width, height, bmp_formats[noise.below(6)], static_cast<int>(noise.below(4)), placement,
                        static_cast<int32_t>(noise.below(4)), static_cast<int32_t>(noise.below(4)));
                    ASSERT_TRUE(decodes_as_computed_at_both_edges(subject, request));
                }
            }
}

TEST_P(BmpOneToOne, both_row_orders_of_a_picture_give_the_same_bytes) {
    const Picture picture = noise_picture(13, 9, GetParam().bits, 4);
    for (const uint32_t format : bmp_formats)
        for (int turns = 0; turns < 4; ++turns) {
            Bytes outputs[2];
            for (const bool top_down : {false, true}) {
                BmpFile file = noise_bmp(GetParam(), 13, 9, top_down);
                file.rows = pack_rows(picture, GetParam().bits, top_down);
                TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
                outputs[top_down] = decode_bmp(source, {format, turns, 0, 20, 20}, 20u * 20 * 4).output;
            }
            EXPECT_EQ(outputs[0], outputs[1]) << "format " << format << ", turned " << 90 * turns;
        }
}

TEST_P(BmpOneToOne, formats_without_a_writer_leave_the_buffer_alone) {
    for (const uint32_t format : {2u, 3u, 4u, 9u, 10u, 11u, 12u, 13u, 255u, 256u, 0x80000000u, 0xFFFFFFFFu})
        for (int turns = 0; turns < 4; ++turns)
            for (const uint32_t placement : {0u, 0x100u, 0x700u})
                for (const uint32_t kind : all_kinds) {
                    BmpSubject subject(noise_bmp(GetParam(), 7, 5, false), kind);
                    for (const int32_t more : {-2, 0, 3}) {
                        const BmpRequest request = request_for(7, 5, format, turns, placement, more, more);
                        ASSERT_EQ(subject.expect(request).pixels_landed, 0u);
                        ASSERT_TRUE(decodes_as_computed(subject, request));
                    }
                }
}

TEST_P(BmpOneToOne, an_output_at_any_alignment_is_written) {
    const BmpFile file = noise_bmp(GetParam(), 7, 5, false);
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
    for (const uint32_t format : bmp_formats)
        for (int turns = 0; turns < 4; ++turns) {
            const BmpRequest request = request_for(7, 5, format, turns, 0);
            const Bytes expected = BmpSubject(file).expect(request).output;
            for (size_t shift = 0; shift < 8; ++shift) {
                Bytes memory(expected.size() + 16, background);
                ImageDecodeInfo info = marked_info(&source.source, request);
                ASSERT_EQ(ZOTARPELMI_DecodeBMP(&info, memory.data() + shift, request.box_width, request.box_height), 1);
                const auto start = memory.begin() + static_cast<ptrdiff_t>(shift);
                EXPECT_EQ(Bytes(start, start + static_cast<ptrdiff_t>(expected.size())), expected)
                    << described(request) << ", " << shift << " bytes off";
            }
        }
}

TEST_P(BmpOneToOne, an_input_at_any_alignment_is_read) {
    const BmpFile file = noise_bmp(GetParam(), 7, 5, false);
    const Bytes bytes = file_bytes(file);
    const BmpRequest request{7, 0, 0, 7, 5};
    const Bytes expected = BmpSubject(file).expect(request).output;
    for (size_t shift = 0; shift < 4; ++shift) {
        Bytes memory(shift);
        memory.insert(memory.end(), bytes.begin(), bytes.end());
        InputSource source{};
        source.kind = PELM_SOURCE_MEMORY;
        source.data = memory.data() + shift;
        source.size = static_cast<int32_t>(bytes.size());
        ImageDecodeInfo info = marked_info(&source, request);
        Bytes output(expected.size(), background);
        ASSERT_EQ(ZOTARPELMI_DecodeBMP(&info, output.data(), 7, 5), 1);
        EXPECT_EQ(output, expected) << shift << " bytes off";
    }
}

INSTANTIATE_TEST_SUITE_P(Variants, BmpOneToOne, ::testing::ValuesIn(bmp_variants),
                         [](const auto &variant) { return std::string(variant.param.name); });

} // namespace
} // namespace pelm::test

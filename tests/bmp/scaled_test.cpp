// Pictures that are reduced to fit or stretched: sample points, averages, row orders and odd ratios, against the model.
#include "tests/bmp/expectations.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

class BmpScaled : public HostedTest, public ::testing::WithParamInterface<BmpVariant> {};

TEST_P(BmpScaled, every_format_rotation_and_placement_is_decoded_as_computed) {
    struct Shape {
        int32_t width, height, box_width, box_height;
    };
    const Shape shapes[] = {
        {4, 4, 2, 2},    {33, 17, 10, 10}, {17, 33, 10, 10},  {7, 5, 3, 3},   {31, 9, 30, 9},
        {9, 31, 9, 30},  {20, 3, 10, 10},  {3, 3, 1, 1},      {64, 1, 5, 5},  {1, 64, 5, 5},
        {13, 11, 12, 2}, {5, 4, 11, 3},    {5, 4, 3, 11},     {5, 4, 23, 19}, {1, 1, 7, 9},
        {6, 6, 6, 6},    {2, 3, 4, 9},     {100, 41, 37, 29}, {41, 3, 2, 17},
    };
    for (const Shape &shape : shapes)
        for (const bool top_down : {false, true}) {
            BmpSubject subject(noise_bmp(GetParam(), shape.width, shape.height, top_down));
            for (const uint32_t format : bmp_formats)
                for (int turns = 0; turns < 4; ++turns)
                    for (const uint32_t placement : {0u, 0x100u, 0x200u, 0x700u})
                        ASSERT_TRUE(decodes_as_computed_at_both_edges(
                            subject, {format, turns, placement, shape.box_width, shape.box_height}));
        }
}

TEST_P(BmpScaled, every_pair_of_sizes_is_stretched_as_computed) {
    Noise noise(GetParam().bits + 100u);
    const int32_t most = quick() ? 8 : 19;
    for (int32_t width = 1; width <= most; ++width)
        for (int32_t scaled_width = 1; scaled_width <= most; ++scaled_width)
            for (const bool top_down : {false, true}) {
                // Every pair of widths is met with some pair of heights, every pair of heights with some of widths.
                const int32_t height = (width * 7 + scaled_width) % most + 1;
                const int32_t scaled_height = (scaled_width * 5 + width * 3) % most + 1;
                BmpSubject one(noise_bmp(GetParam(), width, height, top_down, noise.next()));
                BmpSubject other(noise_bmp(GetParam(), height, width, top_down, noise.next()));
                const uint32_t format = bmp_formats[noise.below(6)];
                const int turns = static_cast<int>(noise.below(4));
                ASSERT_TRUE(decodes_as_computed(one, {format, turns, 0x700, scaled_width, scaled_height}));
                ASSERT_TRUE(decodes_as_computed(one, {1, 0, 0x700, scaled_width, scaled_height}, Edge::start));
                ASSERT_TRUE(decodes_as_computed(other, {format, turns, 0x700, scaled_height, scaled_width}));
                ASSERT_TRUE(decodes_as_computed(other, {5, 0, 0x700, scaled_height, scaled_width}, Edge::start));
            }
}

TEST_P(BmpScaled, pictures_of_every_size_up_to_33_fit_every_kind_of_box) {
    Noise noise(GetParam().bits + 200u);
    const int32_t step = quick() ? 5 : 1;
    for (int32_t width = 1; width <= 33; width += step)
        for (int32_t height = 1; height <= 33; height += step)
            for (const bool top_down : {false, true}) {
                BmpSubject subject(noise_bmp(GetParam(), width, height, top_down, noise.next()));
                for (int i = 0; i < 4; ++i) {
                    const BmpRequest request{bmp_formats[noise.below(6)], static_cast<int>(noise.below(4)),
                                             std::array{0u, 0x100u, 0x200u, 0x700u}[noise.below(4)],
                                             static_cast<int32_t>(noise.below(40) + 1),
                                             static_cast<int32_t>(noise.below(40) + 1)};
                    ASSERT_TRUE(decodes_as_computed(subject, request, i % 2 == 0 ? Edge::end : Edge::start));
                }
            }
}

TEST_P(BmpScaled, both_row_orders_of_a_picture_scale_to_the_same_bytes) {
    const Picture picture = noise_picture(23, 19, GetParam().bits, 4);
    for (const auto &[box_width, box_height] : {std::pair{10, 10}, {22, 18}, {5, 40}, {40, 5}, {31, 29}, {23, 19}})
        for (const uint32_t format : bmp_formats) {
            Bytes outputs[2];
            for (const bool top_down : {false, true}) {
                BmpFile file = noise_bmp(GetParam(), 23, 19, top_down);
                file.rows = pack_rows(picture, GetParam().bits, top_down);
                TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
                const BmpRequest request{format, 0, 0x700, box_width, box_height};
                outputs[top_down] = decode_bmp(source, request, static_cast<size_t>(box_width * box_height * 4)).output;
            }
            EXPECT_EQ(outputs[0], outputs[1]) << "format " << format << ", " << box_width << " x " << box_height;
        }
}

TEST_P(BmpScaled, large_reductions_and_long_sides_are_decoded_as_computed) {
    struct Shape {
        int32_t width, height, box_width, box_height;
    };
    for (const Shape &shape :
         {Shape{1000, 700, 3, 2}, Shape{4001, 3, 7, 2}, Shape{3, 4001, 2, 7}, Shape{501, 499, 250, 250},
          Shape{257, 255, 256, 256}, Shape{1, 1, 300, 200}, Shape{640, 480, 1, 1}})
        for (const bool top_down : {false, true}) {
            BmpSubject subject(noise_bmp(GetParam(), shape.width, shape.height, top_down));
            for (const uint32_t placement : {0u, 0x700u})
                ASSERT_TRUE(decodes_as_computed(subject, {1, 0, placement, shape.box_width, shape.box_height}));
        }
}

constexpr std::pair<int32_t, int32_t> stream_boxes[] = {{10, 10}, {28, 30}, {3, 50}, {50, 3}, {1, 1}, {60, 60}};

::testing::AssertionResult stream_scales_as_computed(const BmpFile &file, uint32_t kind, int32_t buffer_size) {
    BmpSubject subject(file, kind, buffer_size);
    for (const auto &[box_width, box_height] : stream_boxes)
        for (const uint32_t placement : {0u, 0x700u})
            for (const int turns : {0, 1}) {
                const auto outcome = decodes_as_computed(subject, {7, turns, placement, box_width, box_height});
                if (!outcome) return outcome;
            }
    return ::testing::AssertionSuccess();
}

TEST_P(BmpScaled, streams_scale_to_the_bytes_that_memory_gives) {
    for (const int32_t buffer_size : {0, 200, 333, 5000}) {
        const BmpFile bottom_up = noise_bmp(GetParam(), 29, 31, false);
        const BmpFile top_down = noise_bmp(GetParam(), 29, 31, true);
        for (const uint32_t kind : stream_kinds)
            ASSERT_TRUE(stream_scales_as_computed(bottom_up, kind, buffer_size));
        for (const uint32_t kind : {PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT})
            ASSERT_TRUE(stream_scales_as_computed(top_down, kind, buffer_size));
    }
}

// Its rows begin where the header ended, also when the first sample lies rows further down.
TEST_P(BmpScaled, a_top_down_picture_from_a_sequential_source_is_sampled_at_the_same_rows) {
    for (const int32_t buffer_size : {0, 200, 333, 5000})
        ASSERT_TRUE(
            stream_scales_as_computed(noise_bmp(GetParam(), 29, 31, true), PELM_SOURCE_SEQUENTIAL, buffer_size));
}

INSTANTIATE_TEST_SUITE_P(Variants, BmpScaled, ::testing::ValuesIn(bmp_variants),
                         [](const auto &variant) { return std::string(variant.param.name); });

class BmpScaling : public HostedTest {};

TEST_F(BmpScaling, products_beyond_32_bits_are_positions_too) {
    const int32_t sides = quick() ? 1 : 2;
    for (int32_t side = 0; side < sides; ++side) {
        BmpSubject tall(noise_bmp(variant_named("one_bit"), 2, 50000, side == 1));
        EXPECT_TRUE(decodes_as_computed(tall, {1, 0, 0x700, 3, 90000}));
        BmpSubject wide(noise_bmp(variant_named("one_bit"), 50000, 2, side == 1));
        EXPECT_TRUE(decodes_as_computed(wide, {1, 0, 0x700, 90000, 3}));
    }
}

TEST_F(BmpScaling, a_flat_picture_stays_flat) {
    const BmpRequest request{1, 0, 0, 5, 5};
    for (uint32_t level = 0; level < 256; ++level) {
        BmpSubject subject(flat_bmp(variant_named("twenty_four_bits"), 16, 16, level * 0x010101));
        TestSource source(PELM_SOURCE_MEMORY, file_bytes(subject.file()));
        EXPECT_EQ(decode_bmp(source, request, 75).output, Bytes(75, static_cast<uint8_t>(level)));
    }
}

TEST_F(BmpScaling, a_side_reduced_to_nothing_writes_nothing_and_succeeds) {
    for (const uint32_t kind : all_kinds)
        for (const bool top_down : {false, true}) {
            BmpSubject wide(noise_bmp(variant_named("twenty_four_bits"), 40, 1, top_down), kind);
            EXPECT_TRUE(decodes_as_computed(wide, {1, 0, 0, 39, 39}));
            EXPECT_EQ(wide.expect({1, 0, 0, 39, 39}).size.height, 0);
            BmpSubject tall(noise_bmp(variant_named("twenty_four_bits"), 1, 40, top_down), kind);
            EXPECT_TRUE(decodes_as_computed(tall, {1, 0, 0, 39, 39}));
            EXPECT_EQ(tall.expect({1, 0, 0, 39, 39}).size.width, 0);
        }
}

} // namespace
} // namespace pelm::test

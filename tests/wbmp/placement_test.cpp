// Size and place: margins, aspect, flags, and boxes at the edge of sense.
#include "tests/support/quick.h"
#include "tests/wbmp/decoding.h"

namespace pelm::test {
namespace {

using WbmpPlacement = HostedTest;

constexpr int32_t most = INT32_MAX;

TEST_F(WbmpPlacement, keeps_the_aspect_and_rounds_margins_up) {
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(wbmp_of(Picture(10, std::vector<uint32_t>(100, 1)))));
    const WbmpDecode decode = decode_wbmp(source, {1, 0, 50, 50});
    EXPECT_EQ(decode.info.outputWidth, 50);
    EXPECT_EQ(decode.info.outputHeight, 5);
    Bytes expected(50 * 50 * 3, background);
    std::fill_n(expected.begin() + 23 * 50 * 3, 5 * 50 * 3, uint8_t{252});
    EXPECT_EQ(decode.output, expected);
}

TEST_F(WbmpPlacement, puts_the_larger_half_of_an_odd_margin_left_and_above) {
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(wbmp_of({{1}})));
    Bytes expected(4 * 4 * 2, background);
    const size_t centre = 2 * (2 * 4 + 2);
    expected[centre] = expected[centre + 1] = 0xFF;
    EXPECT_EQ(decode_wbmp(source, {0, 0, 4, 4}).output, expected);
}

TEST_F(WbmpPlacement, only_the_whole_word_0x700_stretches) {
    const Picture picture = noise_picture(12, 9, 1, 2);
    const Bytes bytes = file_bytes(wbmp_of(picture));
    const Bytes fitted = expect_wbmp(picture, {1, 0, 20, 7}, background).output;
    const Bytes stretched = expect_wbmp(picture, {1, 0x700, 20, 7}, background).output;
    ASSERT_NE(fitted, stretched);
    for (int bit = 0; bit < 32; ++bit)
        for (const uint32_t flags : {0x700u ^ 1u << bit, 1u << bit})
            for (const uint32_t kind : wbmp_kinds) {
                host.reset();
                TestSource source(kind, bytes);
                const WbmpDecode decode = decode_wbmp(source, {1, flags, 20, 7});
                ASSERT_EQ(decode.output, fitted) << "flags " << flags;
                ASSERT_EQ(decode.misbehaviour, "");
            }
    TestSource source(PELM_SOURCE_MEMORY, bytes);
    EXPECT_EQ(decode_wbmp(source, {1, 0x700, 20, 7}).output, stretched);
}

TEST_F(WbmpPlacement, a_side_that_shrinks_to_nothing_is_a_success_without_pixels) {
    struct Case {
        int32_t width, height, box_width, box_height;
    };
    for (const Case &c : {Case{100, 1, 50, 50}, Case{1, 100, 50, 50}, Case{1000, 3, 300, 1}, Case{3, 1000, 1, 300}})
        for (const uint32_t kind : wbmp_kinds)
            for (const uint32_t format : {1u, 7u, 5u}) {
                host.reset();
                TestSource source(kind, file_bytes(noise_wbmp(c.width, c.height)));
                const WbmpDecode decode = decode_wbmp(source, {format, 0, c.box_width, c.box_height});
                EXPECT_EQ(decode.result, 1);
                EXPECT_TRUE(decode.is_untouched()) << c.width << " x " << c.height;
                EXPECT_EQ(decode.misbehaviour, "");
            }
}

TEST_F(WbmpPlacement, empty_and_negative_boxes_are_not_written) {
    const int32_t sides[] = {INT32_MIN, INT32_MIN + 1, -65536, -7, -1, 0, 1, 19, 65536, most};
    for (const int32_t box_width : sides)
        for (const int32_t box_height : sides) {
            if (box_width > 0 && box_height > 0) continue;
            for (const uint32_t kind : wbmp_kinds)
                for (const uint32_t flags : {0u, 0x100u, 0x700u})
                    for (const uint32_t format : {0u, 7u, 5u}) {
                        host.reset();
                        TestSource source(kind, file_bytes(noise_wbmp(19, 13)));
                        const WbmpDecode decode = decode_wbmp(source, {format, flags, box_width, box_height});
                        ASSERT_EQ(decode.result, 1) << box_width << " x " << box_height;
                        ASSERT_TRUE(decode.is_untouched());
                        ASSERT_EQ(decode.misbehaviour, "");
                    }
        }
}

TEST_F(WbmpPlacement, giant_boxes_give_their_sizes_at_once) {
    for (const uint32_t kind : wbmp_kinds)
        for (const uint32_t flags : {0u, 0x700u})
            for (const int32_t box_width : {1, 19, 65536, 1 << 28, most})
                for (const int32_t box_height : {1, 13, 65536, 1 << 30, most}) {
                    host.reset();
                    TestSource source(kind, file_bytes(noise_wbmp(19, 13)));
                    const WbmpRequest request = {0, flags, box_width, box_height};
                    const WbmpDecode decode = decode_wbmp_to_null(source, request);
                    ASSERT_EQ(decode.misbehaviour, "");
                    const int64_t bytes = int64_t{box_width} * box_height * 2;
                    const bool exists = bytes <= PTRDIFF_MAX;
                    const bool has_sums = flags == 0 || int64_t{box_width} * 4 <= host.faults.largest_block;
                    const bool has_pixels = flags == 0x700 || box_width > 1; // 1 wide it is 13 / 19 high
                    const bool decoded = (exists && has_sums) || !has_pixels;
                    ASSERT_EQ(decode.result, decoded ? 1 : 0) << described(request);
                }
}

TEST_F(WbmpPlacement, a_box_one_pixel_high_and_2_31_wide_is_written_where_the_image_is) {
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(wbmp_of({{1, 0, 1}})));
    const int64_t left = (int64_t{most} - 3 + 1) / 2;
    Bytes pixels(6, background);
    ImageDecodeInfo info{};
    info.input = &source.source;
    // Only the six bytes of the image are touched, so only they have to be there.
    const uintptr_t start = reinterpret_cast<uintptr_t>(pixels.data()) - static_cast<uintptr_t>(2 * left);
    const int32_t result = ZOTARPELMI_DecodeWBMP(&info, reinterpret_cast<void *>(start), most, 1);
    const bool exists = sizeof(void *) > 4; // no smaller address space holds such a buffer
    EXPECT_EQ(result, exists ? 1 : 0);
    EXPECT_EQ(pixels, exists ? (Bytes{0xFF, 0xFF, 0, 0, 0xFF, 0xFF}) : Bytes(6, background));
}

// Where single and double precision disagree on which ratio is larger.
TEST_F(WbmpPlacement, ratios_are_compared_in_single_precision) {
    struct Case {
        int32_t width, height, box_width, box_height, scaled_width, scaled_height;
    };
    const Case cases[] = {
        {16, 1477879, 7, 646572, 7, 646572},  // 6 wide in more precision
        {2181253, 21, 519346, 5, 519346, 5},  // 519345
        {3913, 4079, 3748, 3907, 3748, 3907}, // 3747
        {4313, 2700, 4190, 2623, 4190, 2623}, // 4189
    };
    for (const Case &c : cases) {
        host.reset();
        TestSource source(PELM_SOURCE_MEMORY, file_bytes(blank_wbmp(c.width, c.height)));
        const WbmpDecode decode = decode_wbmp_to_null(source, {0, 0, c.box_width, c.box_height});
        EXPECT_EQ(decode.result, 1);
        EXPECT_EQ(decode.info.outputWidth, c.scaled_width) << c.width << " x " << c.height;
        EXPECT_EQ(decode.info.outputHeight, c.scaled_height) << c.width << " x " << c.height;
    }
}

TEST_F(WbmpPlacement, a_row_that_rounding_adds_below_the_box_is_dropped) {
#ifndef __i386__ // whose processor rounds in its own way
    if (quick()) return;
#endif
    constexpr int32_t height = 33554440;
    constexpr int32_t box_height = 16777219;
    Bytes bytes = file_bytes(blank_wbmp(2, height));
    std::fill(bytes.end() - height, bytes.end(), uint8_t{0xC0});
    TestSource source(PELM_SOURCE_MEMORY, bytes);
    const WbmpDecode decode = decode_wbmp(source, {0, 0, 1, box_height});
    EXPECT_EQ(decode.result, 1);
    EXPECT_EQ(decode.info.outputWidth, 1);
    EXPECT_EQ(decode.info.outputHeight, box_height + 1);
    EXPECT_EQ(decode.misbehaviour, "");
    EXPECT_EQ(decode.output, Bytes(static_cast<size_t>(box_height) * 2, 0xFF)) << "252 in 5, 6 and 5 bits";
}

} // namespace
} // namespace pelm::test

// Every pixel of every size, from both sources, into every format, pixel for pixel, reduced and stretched.
#include "tests/support/quick.h"
#include "tests/wbmp/decoding.h"

namespace pelm::test {
namespace {

using WbmpPixels = HostedTest;

constexpr int32_t largest = 33;

// Boxes of the image's size, above and below it, all but the first with every way to fit.
std::vector<WbmpRequest> requests_for(int32_t width, int32_t height, uint32_t format) {
    std::vector<WbmpRequest> requests = {{format, 0, width, height},
                                         {format, 0, width + 3, height + 2},
                                         {format, 0, (width + 1) / 2, (height + 1) / 2},
                                         {format, 0, width, height / 3 + 1},
                                         {format, 0, width / 3 + 1, height + 7},
                                         {format, 0, 5, 4},
                                         {format, 0x700, width, height}};
    for (const int32_t side : {1, 7, 40})
        requests.push_back({format, 0x700, side, 41 - side});
    return requests;
}

TEST_F(WbmpPixels, are_right_for_every_size_source_and_format) {
    bool at_start = false;
    for (int32_t width = 1; width <= largest; width += quick() ? 4 : 1)
        for (int32_t height = 1; height <= largest; height += quick() ? 4 : 1) {
            const Picture picture = noise_picture(width, height, 1, static_cast<uint32_t>(width * 100 + height));
            for (const uint32_t kind : wbmp_kinds)
                for (const uint32_t format : wbmp_formats)
                    for (const WbmpRequest &request : requests_for(width, height, format)) {
                        at_start = !at_start;
                        ASSERT_TRUE(decodes_as_modelled(picture, kind, request, at_start ? Edge::start : Edge::end));
                    }
        }
}

TEST_F(WbmpPixels, are_right_at_both_ends_of_the_buffer) {
    for (int32_t width = 1; width <= largest; ++width) {
        const Picture picture = noise_picture(width, 3, 1, 5);
        for (const uint32_t format : wbmp_formats)
            for (const WbmpRequest &request : {WbmpRequest{format, 0, width, 3}, WbmpRequest{format, 0x700, width, 2}})
                for (const Edge edge : {Edge::start, Edge::end})
                    ASSERT_TRUE(decodes_as_modelled(picture, PELM_SOURCE_MEMORY, request, edge));
    }
}

TEST_F(WbmpPixels, are_right_in_every_small_box) {
    const Picture picture = noise_picture(19, 13, 1, 8);
    for (int32_t box_width = 1; box_width <= 40; ++box_width)
        for (int32_t box_height = 1; box_height <= 40; box_height += quick() ? 5 : 1)
            for (const uint32_t flags : {0u, 0x700u})
                ASSERT_TRUE(decodes_as_modelled(picture, PELM_SOURCE_STREAM, {1, flags, box_width, box_height}));
}

TEST_F(WbmpPixels, are_not_written_in_any_other_format) {
    const Picture picture = noise_picture(9, 5, 1, 3);
    for (const uint32_t format : {2u, 3u, 4u, 5u, 6u, 9u, 10u, 11u, 12u, 256u, 0x80000000u, 0xFFFFFFFFu})
        for (const uint32_t kind : wbmp_kinds)
            for (const WbmpRequest &request :
                 {WbmpRequest{format, 0, 9, 5}, WbmpRequest{format, 0, 4, 4}, WbmpRequest{format, 0x700, 20, 20}}) {
                ASSERT_TRUE(decodes_as_modelled(picture, kind, request));
                ASSERT_TRUE(is_refused(file_bytes(wbmp_of(picture)), kind, request));
            }
}

// The literal cases, written out.
struct Literal {
    const char *what;
    Picture picture;
    WbmpRequest request;
    Bytes output;
};

const Picture white_pixel = {{1}};
const Picture black_pixel = {{0}};

Picture checkerboard(size_t side) {
    Picture picture(side, std::vector<uint32_t>(side));
    for (size_t y = 0; y < side; ++y)
        for (size_t x = 0; x < side; ++x)
            picture[y][x] = (x + y) % 2;
    return picture;
}

TEST_F(WbmpPixels, of_one_colour_are_what_they_are_defined_to_be) {
    const Literal cases[] = {
        {"white", white_pixel, {0, 0, 1, 1}, {0xFF, 0xFF}},
        {"white", white_pixel, {1, 0, 1, 1}, {0xFF, 0xFF, 0xFF}},
        {"white", white_pixel, {7, 0, 1, 1}, {0xFF, 0xFF, 0xFF, 0xFF}},
        {"white", white_pixel, {8, 0, 1, 1}, {0xFF, 0xFF, 0xFF, 0xFF}},
        {"black is transparent", black_pixel, {7, 0, 1, 1}, {0, 0, 0, 0}},
        {"black is transparent", black_pixel, {8, 0, 1, 1}, {0, 0, 0, 0}},
        {"black", black_pixel, {0, 0, 1, 1}, {0, 0}},
        {"stretched white", white_pixel, {0, 0x700, 1, 1}, {0xFF, 0xFF}},
        {"stretched white", white_pixel, {1, 0x700, 1, 1}, {252, 252, 252}},
        {"stretched white", white_pixel, {7, 0x700, 1, 1}, {252, 252, 252, 255}},
        {"stretched black is opaque", black_pixel, {8, 0x700, 1, 1}, {0, 0, 0, 255}},
        {"stretched checkerboard", checkerboard(2), {0, 0x700, 1, 1}, {0xEF, 0x7B}},
    };
    for (const Literal &one : cases)
        for (const uint32_t kind : wbmp_kinds) {
            host.reset();
            TestSource source(kind, file_bytes(wbmp_of(one.picture)));
            const WbmpDecode decode = decode_wbmp(source, one.request);
            EXPECT_EQ(decode.result, 1);
            EXPECT_EQ(decode.output, one.output) << one.what << ", " << described(one.request);
            EXPECT_EQ(decode.misbehaviour, "");
        }
}

TEST_F(WbmpPixels, of_white_are_252_and_of_a_checkerboard_126_when_halved) {
    const Picture white(16, std::vector<uint32_t>(16, 1));
    for (const uint32_t kind : wbmp_kinds) {
        TestSource flat(kind, file_bytes(wbmp_of(white)));
        EXPECT_EQ(decode_wbmp(flat, {1, 0, 8, 8}).output, Bytes(8 * 8 * 3, 252));
        TestSource board(kind, file_bytes(wbmp_of(checkerboard(16))));
        EXPECT_EQ(decode_wbmp(board, {1, 0, 8, 8}).output, Bytes(8 * 8 * 3, 126));
    }
}

TEST_F(WbmpPixels, of_a_halved_image_sum_blocks_of_two_by_two) {
    const Picture picture = noise_picture(16, 16, 1, 11);
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(wbmp_of(picture)));
    const Bytes output = decode_wbmp(source, {1, 0, 8, 8}).output;
    for (size_t j = 0; j < 8; ++j)
        for (size_t i = 0; i < 8; ++i) {
            const uint32_t whites = picture[2 * j][2 * i] + picture[2 * j][2 * i + 1] + picture[2 * j + 1][2 * i] +
                                    picture[2 * j + 1][2 * i + 1];
            EXPECT_EQ(output[(j * 8 + i) * 3], 63 * whites) << i << ", " << j;
        }
}

TEST_F(WbmpPixels, of_wide_rows_are_right) {
    const Picture picture = noise_picture(3001, 5, 1, 21);
    for (const uint32_t kind : wbmp_kinds)
        for (const uint32_t format : wbmp_formats)
            for (const WbmpRequest &request : {WbmpRequest{format, 0, 3001, 5}, WbmpRequest{format, 0, 3002, 8},
                                               WbmpRequest{format, 0, 2999, 9}, WbmpRequest{format, 0x700, 5000, 2}})
                ASSERT_TRUE(decodes_as_modelled(picture, kind, request));
}

} // namespace
} // namespace pelm::test

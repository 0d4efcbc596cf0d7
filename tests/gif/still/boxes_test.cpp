// Boxes and screens of any size: the size that is worked out for them, and that nothing breaks.
#include "tests/gif/support/gif_check.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

constexpr int32_t most = INT32_MAX, least = INT32_MIN;
constexpr GifCall stills[] = {GifCall::one_shot, GifCall::iterative, GifCall::line};
constexpr uint32_t placements[] = {0, 0x100, 0x200, 0x300, 0x600, 0x700};

class GifBoxes : public GifTest {
protected:
    static GifSize size_of(int32_t width, int32_t height, int32_t box_width, int32_t box_height, uint32_t placement = 0,
                           uint32_t turns = 0) {
        const GifOutcome outcome =
            checked_decode(still_file({static_cast<uint16_t>(width), static_cast<uint16_t>(height)}).bytes,
                           {1, turns, placement, box_width, box_height});
        return {outcome.words.output_width, outcome.words.output_height, false};
    }
    static void expect_size(GifSize got, int64_t width, int64_t height) {
        EXPECT_EQ(got.width, width);
        EXPECT_EQ(got.height, height);
    }
};

TEST_F(GifBoxes, a_picture_fits_its_box_and_keeps_its_shape) {
    expect_size(size_of(100, 50, 40, 40), 40, 20);
    expect_size(size_of(100, 50, 200, 200), 100, 50);
    expect_size(size_of(100, 50, 100, 50), 100, 50);
    expect_size(size_of(100, 50, 40, 10), 20, 10);
    expect_size(size_of(100, 50, 300, 10), 20, 10);
    expect_size(size_of(100, 50, 10, 300), 10, 5);
    expect_size(size_of(100, 50, 99, 50), 99, 49);
    expect_size(size_of(100, 50, 100, 49), 98, 49);
    expect_size(size_of(100, 50, 101, 49), 98, 49);
}

TEST_F(GifBoxes, a_box_that_one_rounded_side_meets_is_used_as_it_is) {
    expect_size(size_of(100, 51, 40, 20), 40, 20); // 51 x 40 / 100 is 20
    expect_size(size_of(100, 51, 3, 1), 3, 1);
    expect_size(size_of(7, 3, 2, 1), 2, 1); // 7 x 1 / 3 is 2, though 3 x 2 / 7 is 0
}

TEST_F(GifBoxes, turned_pictures_fit_the_turned_box) {
    for (const uint32_t turns : {1u, 3u})
        expect_size(size_of(100, 50, 40, 60, 0, turns), 60, 30);
    expect_size(size_of(100, 50, 40, 60, 0, 2), 40, 20);
}

TEST_F(GifBoxes, every_other_placement_than_stretching_keeps_the_shape) {
    for (const uint32_t placement : placements)
        expect_size(size_of(20, 10, 7, 8, placement), 7, placement == 0x700 ? 8 : 3);
}

TEST_F(GifBoxes, small_boxes_of_all_shapes_are_filled_as_computed) {
    const Bytes file = still_file({9, 7, 8}).bytes;
    for (int32_t width = 0; width <= 12; ++width)
        for (int32_t height = 0; height <= 12; ++height)
            for (uint32_t turns = 0; turns < 4; ++turns)
                for (const uint32_t placement : placements) {
                    if (quick() && (width + height + static_cast<int32_t>(turns)) % 5 != 0) continue;
                    const uint32_t format = gif_formats[(width * 5 + height) % 8];
                    EXPECT_EQ(gif_difference(file, {format, turns, placement, width, height}), "");
                }
}

// Buffers that no memory holds, or with rows beyond what 32-bit steps reach, may be refused.
bool may_be_refused(const GifRequest &request) {
    const GifBufferShape shape = gif_buffer_shape(9, 7, request);
    if (shape.row_pixels <= 0 || shape.rows <= 0) return false;
    return shape.row_pixels > most / shape.pixel_bytes ||
           shape.row_pixels * shape.rows > PTRDIFF_MAX / shape.pixel_bytes;
}

// A failure that leaves nothing behind.
bool is_refused(const Bytes &file, const GifRequest &request, GifCall call) {
    TestHost::get().reset();
    TestSource source(PELM_SOURCE_MEMORY, file);
    ImageDecodeInfo info{};
    info.input = &source.source;
    info.outputFormat = request.format;
    info.flags = request.flags();
    const int32_t result = call == GifCall::one_shot
                               ? ZOTARPELMI_DecodeGIF(&info, nullptr, request.box_width, request.box_height)
                               : ZOTARPELMI_DecodeGIFIter(&info, nullptr, request.box_width, request.box_height);
    return result == 0 && info.decoderState == nullptr && TestHost::get().live_blocks().empty();
}

TEST_F(GifBoxes, absurd_boxes_decode_the_image_and_write_nothing_outside) {
    const Bytes file = still_file({9, 7, 8}).bytes;
    for (const int32_t width : {least, least + 1, -65536, -1, 0, 1, 4, 65536, most - 1, most})
        for (const int32_t height : {least, -7, -1, 0, 1, 5, 65536, most})
            for (uint32_t turns = 0; turns < 4; ++turns)
                for (const uint32_t placement : placements)
                    for (const GifCall call : {GifCall::one_shot, GifCall::iterative}) {
                        const GifRequest request{gif_formats[turns * 2 + (width & 1)], turns, placement, width, height};
                        GifSetting setting;
                        setting.no_output = gif_buffer_shape(9, 7, request).bytes() > 1u << 20 ||
                                            (width > 0 && height > 0 && int64_t{width} * height > 1 << 20);
                        if (may_be_refused(request) && is_refused(file, request, call)) continue;
                        EXPECT_EQ(gif_difference(file, request, call, setting), "");
                    }
}

TEST_F(GifBoxes, a_buffer_whose_rows_are_too_long_to_step_over_is_refused) {
    for (const uint32_t format : gif_formats)
        for (uint32_t turns = 0; turns < 4; ++turns) {
            host.reset();
            const int32_t row_pixels = most / static_cast<int32_t>(gif_pixel_bytes(format)) + 1;
            TestSource source(PELM_SOURCE_MEMORY, still_file({7, 5}).bytes);
            ImageDecodeInfo info{};
            info.input = &source.source;
            info.outputFormat = format;
            info.flags = turns * PELM_ROTATE_90;
            uint8_t byte = gif_background; // of a buffer that nothing may be written to
            EXPECT_EQ(ZOTARPELMI_DecodeGIF(&info, &byte, row_pixels, 5), 0) << format << ", turned " << turns;
            EXPECT_EQ(byte, gif_background);
            EXPECT_TRUE(host.live_blocks().empty());
        }
}

TEST_F(GifBoxes, absurd_boxes_do_not_stop_line_calls) {
    const Bytes file = still_file({9, 7, 8}).bytes;
    for (const int32_t width : {least, -1, 0, 1, 5, 70000})
        for (const int32_t height : {least, -1, 0, 1, 5, most})
            for (uint32_t turns = 0; turns < 4; ++turns)
                for (const uint32_t placement : {0u, 0x100u}) {
                    const GifRequest request{11, turns, placement, width, height};
                    EXPECT_EQ(gif_difference(file, request, GifCall::line, {}, 3), "");
                }
}

TEST_F(GifBoxes, a_missing_output_decodes_and_writes_nothing) {
    GifSetting setting;
    setting.no_output = true;
    for (const GifCall call : stills)
        for (const GifRequest &request : {own_size(9, 7, 1), GifRequest{0, 1, 0, 4, 4}, GifRequest{8, 0, 0x700, 30, 4}})
            EXPECT_EQ(gif_difference(still_file({9, 7, 8}).bytes, request, call, setting, 4), "");
}

TEST_F(GifBoxes, the_largest_screens_with_images_of_any_size_decode) {
    for (const uint16_t width : std::initializer_list<uint16_t>{1, 65535})
        for (const uint16_t height : std::initializer_list<uint16_t>{1, 65535})
            for (const ImagePlace &place : {ImagePlace{0, 0, 65535, 3}, ImagePlace{65535, 65535, 65535, 2},
                                            ImagePlace{3, 2, 5, 65535}, ImagePlace{0, 65534, 9, 9, true}}) {
                GifFile file;
                file.screen(width, height, distinct_table(4));
                const size_t rows = std::min<size_t>(place.height, 40);
                file.descriptor(place).data(2, lzw_data(Bytes(place.width * rows, 2), 2)).trailer();
                for (const GifRequest &request :
                     {GifRequest{1, 0, 0, 50, 40}, GifRequest{7, 1, 0x700, 33, 21}, GifRequest{0, 3, 0, 7, 90}})
                    for (const GifCall call : stills)
                        EXPECT_EQ(gif_difference(file.bytes, request, call, {}, 40), "");
            }
}

TEST_F(GifBoxes, outputs_of_any_alignment_are_written_alike) {
    const Bytes file = still_file({9, 7, 8}).bytes;
    for (size_t behind = 0; behind < 9; ++behind)
        for (const uint32_t format : gif_formats)
            for (uint32_t turns = 0; turns < 4; ++turns)
                for (const GifRequest &request :
                     {GifRequest{format, turns, 0, 11, 13}, GifRequest{format, turns, 0, 5, 5},
                      GifRequest{format, turns, 0x100, 99, 99}, GifRequest{format, turns, 0x700, 14, 9}}) {
                    GifSetting setting;
                    setting.bytes_behind = behind;
                    setting.edge = turns % 2 == 0 ? Edge::end : Edge::start;
                    EXPECT_EQ(gif_difference(file, request, GifCall::one_shot, setting), "");
                }
}

} // namespace
} // namespace pelm::test

// The record: what is allocated for it, and the size and place that are settled when it is made.
#include "tests/gif/inner/decoding_record.h"
#include "tests/gif/support/gif_blocks.h"

namespace pelm::test {
namespace {

class GifRecord : public GifTest {};

TEST_F(GifRecord, deleting_takes_null_and_records_of_which_anything_is_missing) {
    PELMI_DelGIFDecoderInfo(nullptr);
    for (int failing = 0; failing <= 9; ++failing) {
        host.reset();
        auto *const state = static_cast<GifDecoderState *>(ZOTARPELM_OsMalloc(sizeof(GifDecoderState)));
        *state = GifDecoderState{};
        host.faults.failing_allocation = failing;
        EXPECT_EQ(PELMI_CreateGIFDecoderInfo(state) != 0, failing < 2) << failing; // the record itself was the first
        PELMI_DelGIFDecoderInfo(state);
        EXPECT_TRUE(host.live_blocks().empty()) << failing;
        EXPECT_TRUE(host.violations.empty());
    }
}

TEST_F(GifRecord, none_is_made_for_requests_without_an_input) {
    EXPECT_EQ(PELMI_InitializeGIF(nullptr, 1, 1, 0, nullptr), nullptr);
    ImageDecodeInfo info{};
    EXPECT_EQ(PELMI_InitializeGIF(&info, 1, 1, 0, nullptr), nullptr);
    EXPECT_TRUE(host.allocations.empty());
}

TEST_F(GifRecord, creating_allocates_in_order) {
    GifDecoderState *const state = static_cast<GifDecoderState *>(ZOTARPELM_OsMalloc(sizeof(GifDecoderState)));
    *state = GifDecoderState{};
    EXPECT_NE(PELMI_CreateGIFDecoderInfo(state), 0);
    EXPECT_EQ(host.allocations, gif_record_blocks());
    EXPECT_EQ(state->input->bytesLeft, 0);
    EXPECT_EQ(state->input->source, nullptr);
    PELMI_DelGIFDecoderInfo(state);
}

// Row and column of the first pixel, and the steps, in pixels of a buffer of 40 x 30.
struct Place {
    uint32_t turns;
    int32_t width, height; // scaled
    intptr_t row, column;
    int32_t row_step, pixel_step;
};

TEST_F(GifRecord, a_fitted_picture_is_centred_for_every_rotation) {
    const Bytes file = still_file({21, 10}).bytes;
    constexpr Place all[] = {{0, 21, 10, 10, 9, 40, 1},
                             {1, 21, 10, 4, 15 + 9, -1, 40},
                             {2, 21, 10, 10 + 9, 9 + 20, -40, -1},
                             {3, 21, 10, 4 + 20, 15, 1, -40}};
    Bytes output(40 * 30 * 4);
    for (const Place &place : all)
        for (const uint32_t format : gif_formats) {
            DecodingRecord record(file, {format, place.turns, 0, 40, 30}, false, output.data());
            ASSERT_NE(record.state, nullptr);
            const GifDecoderState &state = *record.state;
            const int32_t bytes = static_cast<int32_t>(gif_pixel_bytes(format)), unit = bytes == 2 ? 2 : 1;
            EXPECT_EQ(state.scaledWidth, place.width);
            EXPECT_EQ(state.scaledHeight, place.height);
            EXPECT_EQ(state.oneToOne, 1u);
            EXPECT_EQ(state.rotation, static_cast<int32_t>(place.turns) * 90);
            EXPECT_EQ(state.outputStart, (place.row * 40 + place.column) * bytes) << place.turns;
            EXPECT_EQ(state.rowStep, place.row_step * bytes / unit);
            EXPECT_EQ(state.pixelStep, place.pixel_step * bytes / unit);
            EXPECT_EQ(state.requestedWidth, 40);
            EXPECT_EQ(record.info.outputWidth, place.width);
        }
}

TEST_F(GifRecord, an_exact_buffer_is_as_wide_as_the_scaled_picture) {
    DecodingRecord record(still_file({21, 10}).bytes, {1, 0, 0x100, 40, 5});
    ASSERT_NE(record.state, nullptr);
    EXPECT_EQ(record.state->scaledWidth, 10);
    EXPECT_EQ(record.state->scaledHeight, 5);
    EXPECT_EQ(record.state->oneToOne, 0u);
    EXPECT_EQ(record.state->rowStep, 30);
    EXPECT_EQ(record.state->outputStart, 0);
}

TEST_F(GifRecord, stretching_is_one_to_one_only_at_the_very_size) {
    const Bytes file = still_file({21, 10}).bytes;
    EXPECT_EQ(DecodingRecord(file, {1, 0, 0x700, 21, 10}).state->oneToOne, 1u);
    EXPECT_EQ(DecodingRecord(file, {1, 1, 0x700, 10, 21}).state->oneToOne, 1u);
    EXPECT_EQ(DecodingRecord(file, {1, 1, 0x700, 21, 10}).state->oneToOne, 0u);
    EXPECT_EQ(DecodingRecord(file, {1, 0, 0x700, 22, 10}).state->oneToOne, 0u);
}

TEST_F(GifRecord, an_animation_has_a_canvas_on_which_nothing_was_painted) {
    DecodingRecord still(still_file({21, 10}).bytes, own_size(21, 10));
    EXPECT_EQ(still.state->canvas, nullptr);
    DecodingRecord animated(still_file({21, 10}).bytes, own_size(21, 10), true);
    for (int i = 0; i < 210; ++i)
        EXPECT_EQ(animated.state->canvas[i], 0xFFFFFFFFu);
    EXPECT_EQ(animated.state->animated, 1u);
    EXPECT_EQ(animated.state->frameLineBuffer, nullptr);
}

TEST_F(GifRecord, only_the_low_bits_of_the_flags_are_looked_at) {
    TestSource source(PELM_SOURCE_STREAM, still_file({21, 10}).bytes);
    ImageDecodeInfo info{};
    info.input = &source.source;
    info.flags = 0xFFFFF0F0 | PELM_ROTATE_180 | 3;
    GifDecoderState *const state = PELMI_InitializeGIF(&info, 40, 30, 0, nullptr);
    ASSERT_NE(state, nullptr);
    EXPECT_EQ(state->rotation, 180);
    EXPECT_EQ(state->scaledWidth, 21);
    PELMI_DelGIFDecoderInfo(state);
}

} // namespace
} // namespace pelm::test

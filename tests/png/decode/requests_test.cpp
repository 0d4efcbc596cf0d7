// What the caller may change between calls, give up, or get wrong.
#include <algorithm>
#include <cstring>

#include "tests/png/decode/calls_model.h"
#include "tests/png/decode/decoding.h"

namespace pelm::test {
namespace {

class PngRequests : public PngDecoding {
protected:
    static Picture picture_of(Layout layout, uint32_t width, uint32_t height) {
        return with_transparency(noise_picture(layout.colour_type, layout.depth, width, height));
    }
};

TEST_F(PngRequests, a_one_shot_call_with_a_height_writes_that_many_rows_and_fails) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{grey, 8}, Layout{indexed, 8}})
        for (const int32_t side : {16, 9})
            for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM})
                for (const int32_t height : {1, 2, 5, 8, 9, 10, 15, 16, 17, 100, -1, -16}) {
                    reset();
                    const Picture picture = picture_of(layout, 16, 16);
                    const Request request{7, 0, side, side};
                    const size_t size = buffer_size(picture, request);
                    CallsModel model(picture, request);
                    Bytes expected = background(size);
                    const int32_t wanted = model.line(height, expected) == 1 ? 1 : 0;
                    Output output(size);
                    Decode decode(file_of(picture), kind, request);
                    decode.info.imageHeight = height;
                    EXPECT_EQ(decode.one_shot(output.data()), wanted) << "height " << height << ", side " << side;
                    EXPECT_EQ(difference(expected, output.bytes(), picture, request), "") << "height " << height;
                    EXPECT_FALSE(decode.started());
                    EXPECT_TRUE(host.live_blocks().empty());
                    EXPECT_EQ(decode.info.imageHeight, height) << "the word is the caller's";
                }
}

TEST_F(PngRequests, a_height_in_the_request_matters_to_no_other_call) {
    const Picture picture = picture_of({rgb, 8}, 10, 10);
    for (const Call call : {Call::iterative, Call::line}) {
        Output output(400);
        Decode decode(file_of(picture), PELM_SOURCE_MEMORY, {7, 0, 10, 10});
        decode.info.imageHeight = 3;
        EXPECT_EQ(decode.call(call, output.data(), 0), 1) << name_of(call);
    }
}

TEST_F(PngRequests, a_later_call_with_a_smaller_box_is_clipped_to_it_and_placed_as_before) {
    for (const Layout layout : {Layout{rgb_alpha, 8}, Layout{grey, 8}})
        for (const int32_t side : {20, 10})
            for (const uint32_t placement : {0x000u, 0x100u})
                for (const uint32_t turn : {0u, 4u, 8u, 12u}) {
                    const Picture picture = picture_of(layout, 16, 18);
                    const Request request{1, placement | turn, side, side};
                    CallsModel model(picture, request);
                    Decode decode(file_of(picture), PELM_SOURCE_MEMORY, request);
                    const std::pair<int32_t, int32_t> boxes[] = {{side, side}, {side, 4}, {3, 3},  {side * 2, side * 2},
                                                                 {0, 5},       {-4, -4},  {1, 300}};
                    int32_t result = 4;
                    for (size_t call = 0; result == 4 && call < 50; ++call) {
                        const auto &[width, height] = boxes[call % std::size(boxes)];
                        decode.request.box_width = width;
                        decode.request.box_height = height;
                        const size_t size = placement == 0x100
                                                ? buffer_size(picture, request)
                                                : static_cast<size_t>(std::max(0, width) * std::max(0, height)) * 3;
                        Output output(size);
                        Bytes expected = background(size);
                        const int32_t wanted = model.line(2, expected);
                        result = decode.line(output.data(), 2);
                        ASSERT_EQ(result, wanted);
                        // Whether an exact buffer is looked at when the box is negative is left open.
                        if (placement == 0x100 && width < 0) continue;
                        ASSERT_EQ(difference(expected, output.bytes(), picture, request), "")
                            << "call " << call << ", box " << width << "x" << height;
                        ASSERT_TRUE(output.intact());
                    }
                    EXPECT_EQ(result, 1);
                    const Geometry geometry = geometry_of(picture, request);
                    EXPECT_EQ(decode.info.outputWidth, static_cast<int32_t>(geometry.width));
                    EXPECT_EQ(decode.info.outputHeight, static_cast<int32_t>(geometry.height));
                }
}

TEST_F(PngRequests, a_call_without_a_buffer_skips_its_rows) {
    const Picture picture = picture_of({rgb, 8}, 10, 10);
    const Request request{7, 0, 10, 10};
    Decode decode(file_of(picture), PELM_SOURCE_MEMORY, request);
    Output output(400);
    EXPECT_EQ(decode.line(nullptr, 3), 4);
    EXPECT_EQ(decode.line(output.data(), 3), 4);
    EXPECT_EQ(decode.line(nullptr, 4), 1);
    Bytes expected = background(400);
    draw_one_to_one(picture, geometry_of(picture, request), request, 3, 6, expected);
    EXPECT_EQ(output.bytes(), expected);
}

// Each block ends between the two sample lines of an output row, which a call without a buffer may see one of.
TEST_F(PngRequests, a_call_without_a_buffer_does_not_spoil_the_rows_of_other_calls) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{rgb_alpha, 8}, Layout{grey, 8}})
        for (unsigned visible = 0; visible < 256; visible += 3) {
            const Picture picture = picture_of(layout, 30, 30);
            const Request request{7, 0, 10, 10};
            CallsModel model(picture, request);
            Decode decode(file_of_blocks(picture, Blocks::stored, (picture.row_bytes() + 1) * 4), PELM_SOURCE_MEMORY,
                          request);
            for (uint32_t call = 0; call < 8; ++call) {
                Output output(400);
                Bytes expected = background(400), unseen = background(400);
                const bool seen = (visible >> call & 1) != 0;
                model.iterate(4 * (call + 1), seen ? expected : unseen);
                ASSERT_EQ(decode.iterative(seen ? output.data() : nullptr), call == 7 ? 1 : 4);
                ASSERT_EQ(difference(expected, output.bytes(), picture, request), "")
                    << "call " << call << ", calls with a buffer: bits of " << visible;
            }
        }
}

TEST_F(PngRequests, decodes_can_be_given_up_at_any_point) {
    const Picture picture = picture_of({indexed, 8}, 15, 15);
    const Bytes file = file_of_blocks(picture, Blocks::mixed, 20);
    for (const uint32_t kind : all_source_kinds)
        for (const Call call : {Call::iterative, Call::line})
            for (int calls = 0; calls < 6; ++calls)
                for (const bool abort : {false, true}) {
                    reset();
                    Output output(15 * 15 * 4);
                    Decode decode(file, kind, {7, 0, 15, 15});
                    for (int i = 0; i < calls; ++i)
                        ASSERT_EQ(decode.call(call, output.data(), 2), 4);
                    for (int again = 0; again < 2; ++again) {
                        EXPECT_EQ(
                            abort ? ZOTARPELMI_AbortPNGIter(&decode.info) : ZOTARPELMI_DestroyPNGInfo(&decode.info), 1);
                        EXPECT_EQ(decode.info.decoderState, nullptr);
                        EXPECT_TRUE(host.live_blocks().empty());
                    }
                    EXPECT_TRUE(host.violations.empty());
                    EXPECT_EQ(decode.one_shot(output.data()), 1) << "the request can be used again";
                }
}

TEST_F(PngRequests, without_a_request_every_call_fails) {
    EXPECT_EQ(ZOTARPELMI_DecodePNG(nullptr, nullptr, 1, 1), 0);
    EXPECT_EQ(ZOTARPELMI_DecodePNGIter(nullptr, nullptr, 1, 1), 0);
    EXPECT_EQ(ZOTARPELMI_DecodePNGLine(nullptr, nullptr, 1, 1, 1), 0);
    EXPECT_EQ(ZOTARPELMI_AbortPNGIter(nullptr), 0);
    EXPECT_EQ(ZOTARPELMI_DestroyPNGInfo(nullptr), 0);
}

TEST_F(PngRequests, without_a_usable_source_every_call_fails_and_leaves_nothing) {
    const Bytes file = file_of(noise_picture(rgb, 8, 4, 4));
    for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
        const auto fails = [&](auto change) {
            Decode decode(file, PELM_SOURCE_MEMORY, {7, 0, 4, 4});
            change(decode);
            Output output(64);
            EXPECT_EQ(decode.call(call, output.data(), 1), 0) << name_of(call);
            EXPECT_FALSE(decode.started());
            EXPECT_EQ(output.bytes(), background(64));
            EXPECT_TRUE(host.live_blocks().empty());
        };
        fails([](Decode &decode) { decode.info.input = nullptr; });
        fails([](Decode &decode) { decode.source.source.data = nullptr; });
        for (const int32_t size : {0, -1, INT32_MIN})
            fails([size](Decode &decode) { decode.source.source.size = size; });
        for (const uint32_t kind : {3u, 5u, 6u, 8u, 0x101u, 0xFFFFFFFFu})
            fails([kind](Decode &decode) { decode.source.source.kind = kind; });
        for (const uint32_t kind : {0u, 2u, 4u})
            for (const int32_t size : {0, -1, 7})
                fails([=](Decode &decode) {
                    decode.source.source.kind = kind;
                    decode.source.source.data = nullptr;
                    decode.source.source.size = size;
                });
    }
}

TEST_F(PngRequests, a_source_that_goes_away_between_calls_ends_the_decode) {
    const Picture picture = picture_of({rgb, 8}, 10, 10);
    for (const uint32_t kind : all_source_kinds)
        for (const uint32_t other : {1u, 0u, 3u, 0xFFu}) {
            const bool memory = kind == PELM_SOURCE_MEMORY;
            if (other < 3 && memory == (other == PELM_SOURCE_MEMORY)) continue;
            reset();
            Output output(400);
            Decode decode(file_of(picture), kind, {7, 0, 10, 10});
            ASSERT_EQ(decode.line(output.data(), 3), 4);
            decode.source.source.kind = other;
            EXPECT_EQ(decode.line(output.data(), 3), 0) << "kind " << kind << ", then " << other;
            EXPECT_FALSE(decode.started());
            EXPECT_TRUE(host.live_blocks().empty());
        }
    reset();
    Output output(400);
    Decode decode(file_of(picture), PELM_SOURCE_STREAM, {7, 0, 10, 10});
    ASSERT_EQ(decode.line(output.data(), 3), 4);
    decode.info.input = nullptr;
    EXPECT_EQ(decode.line(output.data(), 3), 0);
    EXPECT_TRUE(host.live_blocks().empty());
}

TEST_F(PngRequests, a_later_call_may_bring_the_source_in_another_record) {
    const Picture picture = picture_of({rgb, 8}, 10, 10);
    for (const uint32_t kind : all_source_kinds) {
        Png png = png_of(picture);
        png.idat_size = 20;
        Output output(400);
        Decode decode(build(png), kind, {7, 0, 10, 10});
        ASSERT_EQ(decode.line(output.data(), 3), 4);
        InputSource moved = decode.source.source;
        memset(&decode.source.source, 0xEE, sizeof(InputSource));
        decode.info.input = &moved;
        EXPECT_EQ(decode.line(output.data(), 0), 1) << "kind " << kind;
        Bytes expected = background(400);
        draw(picture, decode.request, expected);
        EXPECT_EQ(difference(expected, output.bytes(), picture, decode.request), "");
    }
}

TEST_F(PngRequests, decodes_that_take_turns_do_not_disturb_each_other) {
    const Picture first = picture_of({rgb, 8}, 20, 24), second = picture_of({indexed, 4}, 25, 28);
    const Request first_request{7, 0, 20, 24}, second_request{0, 0, 30, 30};
    for (const Blocks blocks : {Blocks::fixed, Blocks::dynamic, Blocks::mixed}) {
        Output first_output(buffer_size(first, first_request)), second_output(buffer_size(second, second_request));
        Decode one(file_of_blocks(first, blocks, 150), PELM_SOURCE_STREAM, first_request);
        Decode other(file_of_blocks(second, Blocks::mixed, 70), PELM_SOURCE_MEMORY, second_request);
        int32_t results[2] = {4, 4};
        for (int turn = 0; turn < 100; ++turn) {
            if (results[0] == 4) results[0] = one.iterative(first_output.data());
            if (results[1] == 4) results[1] = other.line(second_output.data(), 1);
        }
        EXPECT_EQ(results[0], 1);
        EXPECT_EQ(results[1], 1);
        Bytes first_expected = background(first_output.size()), second_expected = background(second_output.size());
        draw(first, first_request, first_expected);
        draw(second, second_request, second_expected);
        EXPECT_EQ(difference(first_expected, first_output.bytes(), first, first_request), "");
        EXPECT_EQ(difference(second_expected, second_output.bytes(), second, second_request), "");
    }
}

TEST_F(PngRequests, results_and_words_of_the_request_are_those_of_the_call) {
    const Picture picture = picture_of({rgb, 8}, 30, 20);
    for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
        Output output(15 * 15 * 4);
        Decode decode(file_of(picture), PELM_SOURCE_MEMORY, {7, 0, 15, 15});
        ImageDecodeInfo before = decode.info;
        before.imageWidth = decode.info.imageWidth = -77;
        before.hasTransparency = decode.info.hasTransparency = 9;
        before.frameDelay = decode.info.frameDelay = 8;
        EXPECT_EQ(decode.call(call, output.data(), 0), 1);
        before.outputWidth = 15;
        before.outputHeight = 10;
        before.decodeStarted = 1;
        before.iterative = call == Call::iterative ? 1 : 0;
        EXPECT_EQ(memcmp(&before, &decode.info, sizeof before), 0) << name_of(call);
    }
}

} // namespace
} // namespace pelm::test

// The driver behind the public calls, and the loops below it, called directly.
#include "png/entry.h"
#include "png/image_data.h"
#include "tests/png/decode/decoding.h"

namespace pelm::test {
namespace {

class PngDriver : public PngDecoding {};

// Until there is nothing left to decode, or the driver gives up.
uint32_t drive(Decode &decode, uint8_t *output) {
    const Request &request = decode.request;
    uint32_t code = PNG_ROWS_REMAIN;
    for (int call = 0; code == PNG_ROWS_REMAIN && call < 100; ++call)
        code = PELMI_FastImgDecodePng(&decode.info, output, request.box_width, request.box_height, 0);
    return code;
}

TEST_F(PngDriver, decodes_at_once_or_block_by_block_as_the_request_says) {
    const Picture picture = noise_picture(rgb, 8, 13, 11);
    const Bytes file = file_of_blocks(picture, Blocks::stored, 90);
    const Request request{7, 0, 13, 11};
    const size_t size = buffer_size(picture, request);
    Bytes expected = background(size);
    draw(picture, request, expected);
    for (const uint32_t kind : all_source_kinds)
        for (const uint32_t iterative : {0u, 1u}) {
            reset();
            Output output(size);
            output.fill(background(size));
            Decode decode(file, kind, request);
            decode.info.decodeStarted = 1;
            decode.info.iterative = iterative;
            const uint32_t first = PELMI_FastImgDecodePng(&decode.info, output.data(), 13, 11, 0);
            EXPECT_EQ(first, iterative != 0 ? PNG_ROWS_REMAIN : PNG_DONE);
            if (first == PNG_ROWS_REMAIN) {
                EXPECT_EQ(drive(decode, output.data()), PNG_DONE);
            }
            EXPECT_EQ(difference(expected, output.bytes(), picture, request), "") << "kind " << kind;
            EXPECT_TRUE(host.live_blocks().empty());
        }
}

TEST_F(PngDriver, enlarges_by_whole_numbers_what_a_caller_asks_for_and_the_box_holds) {
    const Picture picture = noise_picture(rgb, 8, 6, 5);
    const Outcome stretched = run(file_of(picture), PELM_SOURCE_MEMORY, {7, 0x700, 12, 10}, 480);
    Output output(480);
    output.fill(background(480));
    Decode decode(file_of(picture), PELM_SOURCE_MEMORY, {7, 0, 12, 10});
    decode.info.decodeStarted = 2; // the public calls make it 1
    EXPECT_EQ(drive(decode, output.data()), PNG_DONE);
    EXPECT_EQ(decode.info.outputWidth, 12);
    EXPECT_EQ(decode.info.outputHeight, 10);
    EXPECT_EQ(output.bytes(), stretched.output);
}

TEST_F(PngDriver, without_a_request_or_a_state_there_is_nothing_to_decode) {
    EXPECT_EQ(PELMI_FastImgDecodePng(nullptr, nullptr, 1, 1, 0), PNG_NO_MEMORY);
    EXPECT_EQ(PELMI_DestroyDecodePng(nullptr), 1u);
    ImageDecodeInfo info{};
    PngInputBuffer input{};
    uint32_t total = 0;
    const uint32_t side = 1;
    EXPECT_EQ(_PELMI_PngInflateZStreamData(&info, &total, 0, 0, &side, &side), PNG_BAD_DATA);
    EXPECT_EQ(_PELMI_PngInflateZStreamData_streamming(&info, &input, &total, 0, 0, &side, &side), PNG_BAD_DATA);
    EXPECT_EQ(_PELMI_PngInflateZStreamDataInterlaced(&info, &total, 0, 0, &side, &side), PNG_BAD_DATA);
    EXPECT_EQ(_PELMI_PngInflateZStreamDataInterlaced_streamming(&info, &input, &total, 0, 0, &side, &side),
              PNG_BAD_DATA);
    EXPECT_EQ(total, 0u);
}

} // namespace
} // namespace pelm::test

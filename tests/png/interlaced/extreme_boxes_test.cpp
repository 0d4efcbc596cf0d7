// Boxes of impossible sizes: nothing can be written, and nothing goes wrong.
#include "tests/png/interlaced/passes.h"

namespace pelm::test {
namespace {

using PngInterlacedBoxes = PngDecoding;

TEST_F(PngInterlacedBoxes, impossible_boxes_write_nothing) {
    const Picture picture = interlaced_noise({rgb, 8}, true, 9, 9);
    const Bytes file = interlaced_file_of(picture);
    const int32_t sides[] = {INT32_MIN, INT32_MIN + 1, -0x40000000, -65536, -2, -1};
    for (const int32_t width : sides)
        for (const int32_t height : sides)
            for (const uint32_t turn : {0u, 4u, 8u, 12u})
                for (const uint32_t placement : {0x000u, 0x100u, 0x700u})
                    for (const uint32_t flags : {0u, 0x1000u})
                        for (const uint32_t format : {0u, 7u}) {
                            reset();
                            uint8_t byte = 0x5A;
                            Decode decode(file, PELM_SOURCE_MEMORY, {format, turn | placement | flags, width, height});
                            if (placement == 0x100) continue; // the buffer is then as large as the image
                            ASSERT_EQ(decode.one_shot(&byte), 1) << decode.request.described();
                            ASSERT_EQ(byte, 0x5A);
                            ASSERT_EQ(polling.polls, static_cast<int>(pass_rows_of(picture).size()));
                        }
}

} // namespace
} // namespace pelm::test

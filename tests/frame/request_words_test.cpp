// The words of the caller-owned records as other code sees them.
#include <gtest/gtest.h>

#include "frame/request_layout.h"
#include "tests/support/test_host.h"

namespace pelm::test {
namespace {

TEST(RequestWords, the_animation_words_are_returned_as_they_stand) {
    ImageDecodeInfo info{};
    uint8_t tables[2];
    info.frameDelay = 0x12345678;
    info.colorTableState = 1;
    info.globalColorTable = &tables[0];
    info.localColorTable = &tables[1];
    EXPECT_EQ(ZOTARPELMI_GetAGIFDelayTime(&info), 0x12345678u);
    EXPECT_EQ(ZOTARPELMI_GetAGIFColorTableState(&info), 1u);
    EXPECT_EQ(ZOTARPELMI_GetAGIFGlobalColorTable(&info), &tables[0]);
    EXPECT_EQ(ZOTARPELMI_GetAGIFLocalColorTable(&info), &tables[1]);
}

TEST(RequestWords, the_animation_words_of_no_request_are_0) {
    EXPECT_EQ(ZOTARPELMI_GetAGIFDelayTime(nullptr), 0u);
    EXPECT_EQ(ZOTARPELMI_GetAGIFColorTableState(nullptr), 0u);
    EXPECT_EQ(ZOTARPELMI_GetAGIFGlobalColorTable(nullptr), nullptr);
    EXPECT_EQ(ZOTARPELMI_GetAGIFLocalColorTable(nullptr), nullptr);
    EXPECT_TRUE(TestHost::get().violations.empty());
}

// Other code of a 32-bit system addresses the records by word number.
#if UINTPTR_MAX == UINT32_MAX // only 32-bit systems have such
TEST(RequestWords, fields_of_a_32_bit_system_lie_on_their_words) {
    EXPECT_EQ(sizeof(InputSource), 4u * 7);
    EXPECT_EQ(offsetof(InputSource, bufferSize), 4u * 6);
    EXPECT_EQ(sizeof(ImageDecodeInfo), 4u * 22);
    EXPECT_EQ(offsetof(ImageDecodeInfo, decoderState), 4u * 15);
    EXPECT_EQ(offsetof(ImageDecodeInfo, localColorTable), 4u * 21);
}
#endif

} // namespace
} // namespace pelm::test

// An application that defines some of the host services itself: its own win over those of libPelmHost, whether the
// libraries are shared, so that the calls come from inside them, or static, where its own must not clash either.
#include <algorithm>
#include <array>
#include <cstdint>
#include <cstdlib>

#include <gtest/gtest.h>

#include "PelmHost.h"

namespace {
int allocations = 0;
int frees = 0;
bool out_of_memory = false;
} // namespace

extern "C" void *ZOTARPELM_OsMalloc(uint32_t size) {
    ++allocations;
    return out_of_memory ? nullptr : std::malloc(size);
}

extern "C" void ZOTARPELM_OsFree(void *block) {
    frees += block != nullptr;
    std::free(block);
}

namespace {

// 2 x 2 pixels of 24 bits: red and green below blue and white. Every field of the header fits one byte.
std::array<uint8_t, 70> tiny_bmp() {
    std::array<uint8_t, 70> file = {'B', 'M'};
    file[10] = 54; // offset of the pixels
    file[14] = 40; // size of the information header
    file[18] = 2;  // width
    file[22] = 2;  // height
    file[26] = 1;  // planes
    file[28] = 24; // bits per pixel
    const std::array<uint8_t, 16> rows = {0, 0, 255, 0, 255, 0, 0, 0, 255, 0, 0, 255, 255, 255, 0, 0};
    std::copy(rows.begin(), rows.end(), file.begin() + 54);
    return file;
}

int32_t decode_tiny_bmp(std::array<uint8_t, 12> &rgb888) {
    std::array<uint8_t, 70> file = tiny_bmp();
    InputSource source = {};
    source.kind = PELM_SOURCE_MEMORY;
    source.data = file.data();
    source.size = static_cast<int32_t>(file.size());
    ImageDecodeInfo info = {};
    info.input = &source;
    info.outputFormat = PELM_FORMAT_RGB888;
    return ZOTARPELMI_DecodeBMP(&info, rgb888.data(), 2, 2);
}

class Interposition : public testing::Test {
protected:
    Interposition() {
        allocations = 0;
        frees = 0;
        out_of_memory = false;
    }
};

TEST_F(Interposition, a_decode_takes_its_memory_from_the_application) {
    std::array<uint8_t, 12> rgb888 = {};
    EXPECT_EQ(decode_tiny_bmp(rgb888), PELM_RESULT_DONE);
    const std::array<uint8_t, 12> expected = {0, 0, 255, 255, 255, 255, 255, 0, 0, 0, 255, 0};
    EXPECT_EQ(rgb888, expected);
    EXPECT_GT(allocations, 0);
    EXPECT_EQ(frees, allocations);
}

TEST_F(Interposition, a_decode_fails_when_the_application_has_no_memory) {
    out_of_memory = true;
    std::array<uint8_t, 12> rgb888 = {};
    EXPECT_EQ(decode_tiny_bmp(rgb888), PELM_RESULT_FAILED);
    EXPECT_GT(allocations, 0);
    EXPECT_EQ(frees, 0);
}

} // namespace

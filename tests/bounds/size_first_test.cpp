// Asking for an image's size before there is a buffer for it (docs/formats.md, "Asking for the size first").
#include <climits>

#include "tests/bounds/samples.h"
#include "tests/bounds/work.h"

namespace pelm::test {
namespace {

using SizeFirst = BoundsTest;

int32_t ask(const Sample &sample, ImageDecodeInfo &info, int32_t width, int32_t height) {
    if (sample.ends_with(".wbmp")) return ZOTARPELMI_DecodeWBMP(&info, nullptr, width, height);
    if (sample.ends_with(".bmp")) return ZOTARPELMI_DecodeBMPLine(&info, nullptr, width, height, 0);
    if (sample.ends_with(".png")) return ZOTARPELMI_DecodePNGIter(&info, nullptr, width, height);
    return ZOTARPELMI_DecodeGIFIter(&info, nullptr, width, height);
}

void end(const Sample &sample, ImageDecodeInfo &info, int32_t width, int32_t height) {
    if (sample.ends_with(".bmp") && !sample.ends_with(".wbmp")) {
        EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, nullptr, width, height, INT_MAX), 1);
    } else if (sample.ends_with(".png")) {
        EXPECT_EQ(ZOTARPELMI_AbortPNGIter(&info), 1);
    } else if (sample.ends_with(".gif")) {
        EXPECT_EQ(ZOTARPELMI_AbortGIFIter(&info), 1);
    }
    EXPECT_EQ(info.decoderState, nullptr);
}

TEST_F(SizeFirst, every_sample_tells_its_own_size_and_that_in_a_box) {
    ASSERT_FALSE(samples().empty());
    for (const Sample &sample : samples())
        for (const bool own : {true, false})
            for (const uint32_t rotation : {0u, 4u}) {
                const int32_t largest = sample.ends_with(".wbmp") ? 20000 : INT_MAX;
                const int32_t width = own ? largest : 40, height = own ? largest : 24;
                TestSource source(PELM_SOURCE_STREAM, sample.bytes);
                ImageDecodeInfo info{};
                info.input = &source.source;
                info.outputFormat = PELM_FORMAT_RGBA8888;
                info.flags = rotation;
                EXPECT_NE(ask(sample, info, width, height), 0) << sample.name;
                end(sample, info, width, height);
                // 4 : 3. Line calls of BMP and WBMP do not turn.
                const bool turned = rotation != 0 && !sample.ends_with("bmp");
                const SampleSize size = own ? size_of(sample) : turned ? SampleSize{24, 18} : SampleSize{32, 24};
                EXPECT_EQ(info.outputWidth, static_cast<int32_t>(size.width)) << sample.name;
                EXPECT_EQ(info.outputHeight, static_cast<int32_t>(size.height)) << sample.name;
                EXPECT_TRUE(left_nothing()) << sample.name;
            }
}

} // namespace
} // namespace pelm::test

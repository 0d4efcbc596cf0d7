// The tool recognises WBMPs, and tells why one is refused, by rules of its own; they must be those of the decoder.
#include "tools/wbmp_description.h"

#include <algorithm>

#include <gtest/gtest.h>

#include "tests/support/bmp_check.h"
#include "tests/support/quick.h"
#include "tests/support/wbmp_builder.h"
#include "tools/failure.h"
#include "tools/image_formats.h"

namespace pelm::test {
namespace {

using pelm_tool::begins_like_wbmp;
using pelm_tool::described_bytes;
using pelm_tool::ImageDescription;

pelm_tool::Bytes head_of(const Bytes &bytes) {
    return pelm_tool::Bytes(bytes.data(), std::min(bytes.size(), described_bytes));
}

ImageDescription described(const Bytes &bytes) {
    return pelm_tool::describe_wbmp(head_of(bytes), {static_cast<int64_t>(bytes.size()), PELM_SOURCE_MEMORY});
}

// Stretched, so that no side of an image that has pixels comes out as 0.
bool is_decoded(const Bytes &bytes, uint32_t kind) {
    TestHost::get().reset();
    TestSource source(kind, bytes);
    ImageDecodeInfo info = {};
    info.input = &source.source;
    info.outputFormat = PELM_FORMAT_RGB888;
    info.flags = PELM_PLACE_STRETCH;
    return ZOTARPELMI_DecodeWBMP(&info, nullptr, 4, 4) == PELM_RESULT_DONE;
}

Bytes any_side(Noise &noise) {
    const uint32_t side = noise.below(2) == 0 ? noise.below(200) : noise.next() >> noise.below(32);
    return multi_byte(side, noise.below(6));
}

TEST(ToolWbmpDescription, refuses_what_the_decoder_refuses) {
    Noise noise(5);
    int refused = 0, decoded = 0, unknown = 0;
    for (int i = 0; i < (quick() ? 4000 : 40000); ++i) {
        WbmpFile file;
        file.width = any_side(noise);
        file.height = any_side(noise);
        file.fix_header = noise.below(10) == 0 ? 0x80 : 0;
        file.type = noise.below(10) == 0 ? 1 : 0;
        file.rows = {Bytes(noise.below(3000))};
        const Bytes bytes = file_bytes(file);
        const bool is_known = begins_like_wbmp(head_of(bytes));
        const std::string refusal = is_known ? described(bytes).refusal : "unknown";
        for (const uint32_t kind : {PELM_SOURCE_STREAM, PELM_SOURCE_MEMORY}) {
            const bool has_pixels =
                multi_byte(0, file.width.size()) != file.width && multi_byte(0, file.height.size()) != file.height;
            ASSERT_EQ(is_decoded(bytes, kind) && has_pixels, refusal.empty()) << "case " << i << ": " << refusal;
        }
        ++(!is_known ? unknown : refusal.empty() ? decoded : refused);
    }
    const int least = quick() ? 300 : 3000;
    EXPECT_GT(refused, least);
    EXPECT_GT(decoded, least);
    EXPECT_GT(unknown, least);
}

TEST(ToolWbmpDescription, knows_the_size_of_what_is_decoded) {
    const ImageDescription image = described(file_bytes(noise_wbmp(130, 5)));
    EXPECT_EQ(image.width, 130);
    EXPECT_EQ(image.height, 5);
    EXPECT_EQ(image.words, "130x5, 1 bit per pixel, WBMP of type 0");
    EXPECT_EQ(image.refusal, "");
    EXPECT_EQ(image.shortage, "");
    EXPECT_TRUE(image.notes.empty());
}

TEST(ToolWbmpDescription, does_not_take_other_files_for_wbmps) {
    const Bytes others[] = {
        {},
        {0},
        {0, 0},
        {0, 0, 0},
        {0, 0, 0, 0, 0, 0},                         // nothing but zeros
        {0, 0, 1, 0, 1, 0, 16, 16},                 // an icon
        {0, 0, 2, 0, 1, 0, 32, 32},                 // a cursor
        {0, 0, 2, 0, 0, 0, 0, 0},                   // a TGA
        {0, 0, 0, 0x18, 'f', 't', 'y', 'p'},        // a film
        {0, 1, 0, 0, 0, 12},                        // a font
        {0, 0, 5},                                  // no height
        {0, 0, 5, 0x85},                            // a height without an end
        {0, 0, 0x80, 0x80, 0x80, 0x80, 5, 5, 0xFF}, // more than four bytes
        {0, 0, 0xC0, 0x80, 0x80, 0x00, 1, 0xFF},    // 2^27
    };
    for (const Bytes &bytes : others)
        EXPECT_FALSE(begins_like_wbmp(bytes)) << bytes.size() << " bytes";
    EXPECT_TRUE(begins_like_wbmp(Bytes{0, 0, 1, 1, 0}));
    EXPECT_TRUE(begins_like_wbmp(Bytes{0, 0, 0x80, 1, 0x80, 0x80, 0x80, 1, 0}));
}

TEST(ToolWbmpDescription, is_asked_last) {
    const Bytes damaged_png = {0, 'P', 'N', 'G', 0x0D, 0x0A, 0x1A, 0x0A};
    EXPECT_STREQ(pelm_tool::recognise(damaged_png).name, "PNG");
    EXPECT_STREQ(pelm_tool::recognise(Bytes{'B', 'M', 0, 0}).name, "BMP");
    EXPECT_STREQ(pelm_tool::recognise(Bytes{0, 0, 9, 9}).name, "WBMP");
    EXPECT_THROW(pelm_tool::recognise(Bytes{0, 0, 0, 0}), pelm_tool::Failure);
}

} // namespace
} // namespace pelm::test

// The tool tells why a PNG is refused by rules of its own; they must be those of the decoder.
#include "tools/png_description.h"

#include <gtest/gtest.h>

#include "tests/support/bmp_check.h"
#include "tests/support/quick.h"
#include "tests/tool/chooser.h"
#include "tests/tool/png_file.h"

namespace pelm::test {
namespace {

using Parts = std::vector<PngPart>;

PngHeader odd_header(Chooser &choose) {
    static constexpr uint8_t depths[] = {0, 1, 2, 3, 4, 8, 16, 32};
    PngHeader header;
    header.colour_type = static_cast<uint8_t>(choose.one_in(6) ? choose.below(9) : choose.below(4) * 2);
    if (choose.one_in(3)) header.colour_type = 3;
    if (choose.one_in(3)) header.depth = choose.among(depths);
    if (choose.one_in(20)) header.width = 0;
    if (choose.one_in(20)) header.height = 0;
    if (choose.one_in(20)) header.compression = 1;
    if (choose.one_in(20)) header.filter = 1;
    if (choose.one_in(12)) header.interlace = static_cast<uint8_t>(1 + choose.below(2));
    return header;
}

// Mostly well-formed, with one or another chunk wrong, missing, doubled or in the wrong place.
Parts odd_parts(Chooser &choose) {
    static constexpr size_t palette_sizes[] = {0, 3, 12, 13, 768, 771};
    static constexpr size_t key_sizes[] = {0, 1, 2, 4, 6, 12};
    Parts parts = {header_part(odd_header(choose))};
    if (choose.one_in(20)) parts[0].data.push_back(0);
    if (choose.one_in(2)) parts.push_back({"PLTE", Bytes(choose.among(palette_sizes))});
    if (choose.one_in(3)) parts.push_back({"tRNS", Bytes(choose.among(key_sizes))});
    if (choose.one_in(3)) parts.push_back({"tEXt", Bytes(choose.below(30))});
    for (uint32_t count = choose.below(8) == 0 ? 0 : 1; count > 0; --count)
        parts.push_back(data_part(noise_rows(64, 4)));
    parts.push_back({"IEND", Bytes(choose.one_in(20) ? 1 : 0)});
    if (choose.one_in(5)) std::swap(parts[choose.below(3) % parts.size()], parts[choose.below(3) % parts.size()]);
    if (choose.one_in(12)) parts.insert(parts.begin() + 1, header_part(odd_header(choose)));
    return parts;
}

Bytes odd_file(Chooser &choose) {
    Bytes bytes = png_bytes(odd_parts(choose));
    if (choose.one_in(6)) bytes.resize(8 + choose.below(static_cast<uint32_t>(bytes.size()) - 8));
    if (choose.one_in(8))
        bytes[choose.below(static_cast<uint32_t>(bytes.size()))] ^= static_cast<uint8_t>(1 + choose.below(255));
    return bytes;
}

bool is_decoded(const Bytes &bytes, uint32_t kind) {
    TestHost::get().reset();
    TestSource source(kind, bytes);
    ImageDecodeInfo info = {};
    info.input = &source.source;
    info.outputFormat = PELM_FORMAT_RGB888;
    return ZOTARPELMI_DecodePNG(&info, nullptr, 4, 4) == PELM_RESULT_DONE;
}

std::string refusal_of(const Bytes &bytes, uint32_t kind) {
    TestHost::get().reset();
    TestSource source(kind, bytes);
    return pelm_tool::describe_png(source.source).refusal;
}

TEST(ToolPngDescription, refuses_what_the_decoder_refuses) {
    Chooser choose(1);
    int refused = 0, decoded = 0;
    for (int i = 0; i < (quick() ? 1000 : 10000); ++i) {
        const Bytes bytes = odd_file(choose);
        for (const uint32_t kind :
             {PELM_SOURCE_STREAM, PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM_ALT, PELM_SOURCE_SEQUENTIAL}) {
            const std::string refusal = refusal_of(bytes, kind);
            if (refusal.ends_with(" pixels are too many")) continue; // refused by the tool alone
            const bool is_fine = is_decoded(bytes, kind);
            ASSERT_EQ(is_fine, refusal.empty()) << "case " << i << ", kind " << kind << ": " << refusal;
            ++(is_fine ? decoded : refused);
        }
    }
    EXPECT_GT(refused, quick() ? 1000 : 10000);
    EXPECT_GT(decoded, quick() ? 500 : 5000);
}

TEST(ToolPngDescription, knows_the_size_of_what_is_decoded) {
    TestSource source(PELM_SOURCE_MEMORY,
                      png_bytes({header_part({7, 5, 8, 0}), data_part(noise_rows(7, 5)), end_part()}));
    const pelm_tool::ImageDescription image = pelm_tool::describe_png(source.source);
    EXPECT_EQ(image.width, 7);
    EXPECT_EQ(image.height, 5);
    EXPECT_TRUE(image.is_grey_8);
    EXPECT_EQ(image.words, "7x5, grey, 8 bits per sample, PNG, not interlaced, 1 IDAT chunk");
    EXPECT_TRUE(image.notes.empty());
}

TEST(ToolPngDescription, recognises_damaged_signatures) {
    const Bytes signature = {0x89, 'P', 'N', 'G', 0x0D, 0x0A, 0x1A, 0x0A};
    for (size_t i = 0; i < signature.size(); ++i) {
        Bytes damaged = signature;
        damaged[i] ^= 0xFF;
        EXPECT_TRUE(pelm_tool::begins_like_png(damaged)) << i;
    }
    const Bytes other = {'B', 'M', 0, 0, 0, 0, 0, 0};
    EXPECT_FALSE(pelm_tool::begins_like_png(other));
    EXPECT_FALSE(pelm_tool::begins_like_png({}));
}

} // namespace
} // namespace pelm::test

// The tool tells why a BMP is refused by rules of its own; they must be those of the decoder.
#include "tools/bmp_description.h"

#include <algorithm>

#include <gtest/gtest.h>

#include "tests/support/bmp_check.h"
#include "tests/support/quick.h"
#include "tests/tool/chooser.h"

namespace pelm::test {
namespace {

using pelm_tool::Calls;
using pelm_tool::describe_bmp;
using pelm_tool::described_bytes;
using pelm_tool::ImageDescription;

using pelm_tool::Mode;

constexpr Mode at_once = {};
constexpr Mode in_two_steps = {Calls::in_two_steps};

ImageDescription described(const Bytes &bytes, uint32_t kind, Mode mode = at_once) {
    const pelm_tool::Bytes head(bytes.data(), std::min(bytes.size(), described_bytes));
    return describe_bmp(head, {static_cast<int64_t>(bytes.size()), kind}, mode);
}

constexpr uint32_t row_buffer_bytes = 1u << 19;

enum class Verdict { refused, decoded, too_large_to_try };

int32_t decode_with(ImageDecodeInfo &info, Mode mode) {
    if (mode.calls == Calls::one_shot) return ZOTARPELMI_DecodeBMP(&info, nullptr, 4, 4);
    if (ZOTARPELMI_PreInitBMP(&info, 1) != PELM_RESULT_DONE) return PELM_RESULT_FAILED;
    InputSource &source = *info.input;
    if (source.kind != PELM_SOURCE_MEMORY) {
        source.bufferSize = static_cast<int32_t>(row_buffer_bytes);
        source.data = static_cast<uint8_t *>(ZOTARPELM_OsMalloc(row_buffer_bytes));
    }
    return ZOTARPELMI_DecodeBMPSKIA(&info, nullptr, 4, 4);
}

// The test host takes back what a refusal leaves allocated.
Verdict decoded(const Bytes &bytes, uint32_t kind, Mode mode) {
    TestHost &host = TestHost::get();
    host.reset();
    host.faults.largest_block = 1u << 20; // what is filled takes time
    TestSource source(kind, bytes);
    ImageDecodeInfo info = {};
    info.input = &source.source;
    info.outputFormat = PELM_FORMAT_RGB888;
    const int32_t result = decode_with(info, mode);
    const bool too_large = std::any_of(host.allocations.begin(), host.allocations.end(),
                                       [&](uint32_t size) { return size > host.faults.largest_block; });
    host.reset();
    if (too_large) return Verdict::too_large_to_try;
    return result == PELM_RESULT_DONE ? Verdict::decoded : Verdict::refused;
}

// What the decoder accepts although nothing comes of it: the tool refuses it.
bool yields_nothing(const std::string &refusal) {
    return refusal.ends_with(" per pixel are not supported") || refusal.starts_with("a height of 0");
}

// Mostly well-formed, with one or another field at the edge of what is accepted.
BmpFile odd_file(Chooser &choose) {
    static constexpr uint32_t header_sizes[] = {0, 11, 12, 13, 39, 40, 41, 55, 56, 60, 64, 65, 108, 124, 268, 296, 380};
    static constexpr int32_t widths[] = {-1, 0, 1, 5, 40000, 0x03FFFFFF, 0x04000000, 0x7FFFFFFF};
    static constexpr int32_t heights[] = {INT32_MIN, -3, 0, 1, 40000, 0x7FFFFFFF};
    static constexpr uint16_t depths[] = {0, 1, 2, 4, 8, 15, 16, 24, 32, 48, 0xFFFF};
    static constexpr uint32_t compressions[] = {0, 1, 2, 3, 4, 5, 6, 7, 0x10000, 0x10003, 0xFFFFFFFF};
    static constexpr uint32_t offsets[] = {
        0, 26, 53, 54, 55, 58, 66, 1078, 54 + 4 * 32767, 54 + 4 * 32768, 54 + 4 * 65535, 54 + 4 * 65536, 0xFFFFFFFF};
    BmpFile file = noise_bmp(choose.among(bmp_variants), 5, 3, choose.one_in(2), choose.below(1000));
    if (choose.one_in(3)) file.header_size = choose.among(header_sizes);
    if (choose.one_in(4)) file.width = choose.among(widths);
    if (choose.one_in(4)) file.height = choose.among(heights);
    if (choose.one_in(4)) file.bits = choose.among(depths);
    if (choose.one_in(4)) file.compression = choose.among(compressions);
    if (choose.one_in(4)) file.pixel_data_offset = choose.among(offsets);
    if (choose.one_in(6) && !file.masks.empty()) file.masks[choose.below(3)] ^= 1u << choose.below(32);
    return file;
}

TEST(ToolDescription, refuses_what_the_decoder_refuses) {
    Chooser choose(1);
    int refused = 0;
    for (int i = 0; i < (quick() ? 2000 : 20000); ++i) {
        Bytes bytes = file_bytes(odd_file(choose));
        if (choose.one_in(5)) bytes.resize(2 + choose.below(80)); // "BM" is looked for before
        for (const uint32_t kind :
             {PELM_SOURCE_STREAM, PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM_ALT, PELM_SOURCE_SEQUENTIAL}) {
            const ImageDescription image = described(bytes, kind);
            const Verdict verdict = decoded(bytes, kind, at_once);
            if (yields_nothing(image.refusal) || verdict == Verdict::too_large_to_try) continue;
            ASSERT_EQ(verdict == Verdict::refused, !image.refusal.empty())
                << "case " << i << ", kind " << kind << ", " << image.words << ": " << image.refusal;
            refused += verdict == Verdict::refused ? 1 : 0;
        }
    }
    EXPECT_GT(refused, quick() ? 2000 : 20000);
}

// Rows that do not fit the row buffer of this test are no matter of the file.
bool fits_row_buffer(const ImageDescription &image) {
    return image.row_bytes <= static_cast<int32_t>(row_buffer_bytes);
}

TEST(ToolDescription, refuses_what_the_decoder_refuses_in_two_steps) {
    Chooser choose(2);
    int refused = 0;
    int taken = 0;
    for (int i = 0; i < (quick() ? 2000 : 20000); ++i) {
        Bytes bytes = file_bytes(odd_file(choose));
        if (choose.one_in(5)) bytes.resize(2 + choose.below(static_cast<uint32_t>(bytes.size()) - 2));
        for (const uint32_t kind : {PELM_SOURCE_STREAM, PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM_ALT}) {
            const ImageDescription image = described(bytes, kind, in_two_steps);
            const Verdict verdict = decoded(bytes, kind, in_two_steps);
            if (yields_nothing(image.refusal) || verdict == Verdict::too_large_to_try) continue;
            if (!fits_row_buffer(image)) continue;
            ASSERT_EQ(verdict == Verdict::refused, !image.refusal.empty())
                << "case " << i << ", kind " << kind << ", " << image.words << ": " << image.refusal;
            ++(verdict == Verdict::refused ? refused : taken);
        }
    }
    EXPECT_GT(refused, quick() ? 1000 : 10000);
    EXPECT_GT(taken, quick() ? 1000 : 10000);
}

TEST(ToolDescription, points_at_two_steps_only_where_they_help) {
    BmpFile file = noise_bmp(variant_named("eight_bits"), 7, 5, true);
    const auto refusal = [&] { return described(file_bytes(file), PELM_SOURCE_STREAM).refusal; };
    for (const uint32_t size : {52u, 108u, 124u}) {
        const std::string words = "BMP header of " + std::to_string(size) + " bytes is not supported";
        file.header_size = size;
        file.compression = 0;
        EXPECT_EQ(refusal(), words + "; use --mode skia");
        file.compression = 4;
        EXPECT_EQ(refusal(), words);
    }
    file.header_size = 16;
    file.compression = 0;
    EXPECT_EQ(refusal(), "BMP header of 16 bytes is not supported");
    file.header_size = 40;
    file.compression = 1;
    EXPECT_EQ(refusal(), "RLE8 compression is not supported; use --mode skia");
    file.compression = 5;
    EXPECT_EQ(refusal(), "PNG compression is not supported");
}

TEST(ToolDescription, tells_what_is_odd_in_two_steps) {
    const auto notes_on = [](const BmpFile &file) {
        const std::vector<std::string> notes = described(file_bytes(file), PELM_SOURCE_STREAM, in_two_steps).notes;
        return testing::PrintToString(notes);
    };
    BmpFile file = noise_bmp(variant_named("eight_bits"), 7, 5, false);
    EXPECT_EQ(notes_on(file), "{}");
    file.header_size = 124;
    EXPECT_EQ(notes_on(file), "{ \"the palette behind a 124-byte header is read from the wrong place\" }");
    file.header_size = 40;
    file.compression = 2;
    EXPECT_EQ(notes_on(file), "{ \"RLE4 compression at 8 bits per pixel is taken for uncompressed rows\" }");
    file.compression = 0;
    file.pixel_data_offset = 54;
    EXPECT_EQ(notes_on(file),
              "{ \"there is no room for a palette in front of the pixels, so all of them are black\" }");
    file = noise_bmp(variant_named("twenty_four_bits"), 7, 5, false);
    file.header_size = 16;
    EXPECT_EQ(notes_on(file), "{ \"the header of 16 bytes is read as one of 40 bytes, so size and depth are wrong\" }");
}

TEST(ToolDescription, knows_the_size_of_what_is_decoded) {
    const Bytes bytes = file_bytes(noise_bmp(variant_named("eight_bits"), 7, 5, true));
    const ImageDescription image = described(bytes, PELM_SOURCE_MEMORY);
    EXPECT_EQ(image.width, 7);
    EXPECT_EQ(image.height, 5);
    EXPECT_EQ(image.words, "7x5, 8 bits per pixel, BMP with a 40-byte header, top-down, uncompressed");
    EXPECT_EQ(image.shortage, "");
    EXPECT_TRUE(image.notes.empty());
}

TEST(ToolDescription, counts_the_rows_that_are_there) {
    Bytes bytes = file_bytes(noise_bmp(variant_named("twenty_four_bits"), 4, 5, false));
    bytes.resize(bytes.size() - 1);
    EXPECT_EQ(described(bytes, PELM_SOURCE_STREAM).shortage, "the file ends after 4 of 5 rows");
    bytes.resize(54 + 12);
    EXPECT_EQ(described(bytes, PELM_SOURCE_STREAM).shortage, "the file ends after 1 of 5 rows");
}

} // namespace
} // namespace pelm::test

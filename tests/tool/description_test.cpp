// The tool tells why a BMP is refused by rules of its own; they must be those of the decoder.
#include "tools/bmp_description.h"

#include <algorithm>

#include <gtest/gtest.h>

#include "tests/support/bmp_check.h"

namespace pelm::test {
namespace {

using pelm_tool::describe_bmp;
using pelm_tool::described_bytes;
using pelm_tool::ImageDescription;

ImageDescription described(const Bytes &bytes, uint32_t kind) {
    const pelm_tool::Bytes head(bytes.data(), std::min(bytes.size(), described_bytes));
    return describe_bmp(head, {static_cast<int64_t>(bytes.size()), kind});
}

enum class Verdict { refused, decoded, too_large_to_try };

// The test host takes back what a refusal leaves allocated.
Verdict decoded(const Bytes &bytes, uint32_t kind) {
    TestHost &host = TestHost::get();
    host.reset();
    host.faults.largest_block = 1u << 20; // what is filled takes time
    TestSource source(kind, bytes);
    ImageDecodeInfo info = {};
    info.input = &source.source;
    info.outputFormat = PELM_FORMAT_RGB888;
    const int32_t result = ZOTARPELMI_DecodeBMP(&info, nullptr, 4, 4);
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

class Chooser {
public:
    explicit Chooser(uint32_t seed) : noise_(seed) {}
    template <class T, size_t count>
    T among(const T (&values)[count]) {
        return values[noise_.below(count)];
    }
    bool one_in(uint32_t count) { return noise_.below(count) == 0; }
    uint32_t below(uint32_t limit) { return noise_.below(limit); }

private:
    Noise noise_;
};

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
            const Verdict verdict = decoded(bytes, kind);
            if (yields_nothing(image.refusal) || verdict == Verdict::too_large_to_try) continue;
            ASSERT_EQ(verdict == Verdict::refused, !image.refusal.empty())
                << "case " << i << ", kind " << kind << ", " << image.words << ": " << image.refusal;
            refused += verdict == Verdict::refused ? 1 : 0;
        }
    }
    EXPECT_GT(refused, quick() ? 2000 : 20000);
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

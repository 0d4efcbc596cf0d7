// The tool counts the rows of run-length codes and looks for moves by itself; it must find those that there are.
#include "tools/bmp_codes.h"

#include <gtest/gtest.h>

#include "tests/support/run_length_codes.h"

namespace pelm::test {
namespace {

using pelm_tool::ImageDescription;

constexpr int32_t width = 21, height = 12;

ImageDescription described(int bits, const Bytes &codes) {
    ImageDescription description;
    description.width = width;
    description.height = height;
    description.run_length_bits = static_cast<uint32_t>(bits);
    describe_codes(description, file_bytes(run_length_bmp(bits, width, height, codes, {})));
    return description;
}

std::string shortage_of(size_t rows) {
    if (rows == height) return "";
    return "the run-length codes end after " + std::to_string(rows) + " of 12 rows";
}

TEST(ToolBmpCodes, are_counted_as_they_are_expanded_wherever_they_break_off) {
    Noise noise(1);
    for (uint32_t seed = 0; seed < 64; ++seed) {
        const int bits = seed % 2 == 0 ? 8 : 4;
        const CodeHabits habits = {(seed & 2) != 0, (seed & 4) != 0, (seed & 8) != 0, (seed & 16) != 0,
                                   (seed & 32) != 0};
        Bytes codes =
            run_length_codes(noise_picture(width, height, static_cast<uint16_t>(bits), seed), bits, noise, habits);
        EXPECT_EQ(described(bits, codes).notes.size(), habits.deltas ? 1u : 0u) << seed;
        EXPECT_EQ(described(bits, codes).shortage, "") << seed;
        while (!codes.empty()) {
            codes.pop_back();
            ASSERT_EQ(described(bits, codes).shortage, shortage_of(expanded_rows(codes, bits, width, height).size()))
                << "seed " << seed << ", " << codes.size() << " bytes";
        }
    }
}

TEST(ToolBmpCodes, that_begin_behind_the_end_of_the_file_are_none) {
    ImageDescription description;
    description.height = height;
    description.run_length_bits = 8;
    BmpFile file = run_length_bmp(8, width, height, {5, 5, 0, 0}, {});
    file.pixel_data_offset = 0xFFFFFFFF;
    describe_codes(description, file_bytes(file));
    EXPECT_EQ(description.shortage, shortage_of(0));
}

} // namespace
} // namespace pelm::test

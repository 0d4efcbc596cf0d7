// Run-length codes of BMP: every pair of bytes, and sequences of the codes that differ in kind, in pictures that they
// fill, leave unfinished, or overrun. Every kind of source gives the rows that an own reader of codes gives.
#include <gtest/gtest.h>

#include "tests/support/run_length_codes.h"
#include "tests/sweeps/decodes.h"
#include "tests/sweeps/random.h"
#include "tests/sweeps/tally.h"

namespace pelm::sweeps {
namespace {

constexpr uint8_t background = 0x5C;
constexpr uint32_t kinds[] = {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT, PELM_SOURCE_SEQUENTIAL};

// What RGB888 shows: rows are stored from the bottom up.
Bytes picture(const test::Picture &rows, const Bytes &palette, int32_t width, int32_t height) {
    Bytes output(static_cast<size_t>(3 * width * height), background);
    for (size_t y = 0; y < rows.size(); ++y) {
        uint8_t *at = &output[3 * static_cast<size_t>(width) * (static_cast<size_t>(height) - 1 - y)];
        for (const uint32_t index : rows[y])
            for (uint32_t channel = 3; channel-- > 0;)
                *at++ = palette[4 * index + channel];
    }
    return output;
}

class RunLengthSweep : public testing::TestWithParam<uint32_t> {
protected:
    RunLengthSweep() { PelmTest_Reset(); }
    ~RunLengthSweep() override { PelmTest_Reset(); }

    int bits() const { return GetParam() % 2 == 0 ? 8 : 4; }

    bool holds(const Bytes &codes, int32_t width, int32_t height) {
        const test::BmpFile file = test::run_length_bmp(bits(), width, height, codes, palette_);
        Input input{"codes", fuzz::Format::bmp, width, height, file_bytes(file)};
        input.bytes.resize(file.rows_at() + codes.size()); // without padding
        const Bytes expected = picture(test::expanded_rows(codes, bits(), width, height), palette_, width, height);
        for (const uint32_t kind : {kinds[0], kinds[files % 4]}) {
            const Setting setting{.format = PELM_FORMAT_RGB888,
                                  .width = width,
                                  .height = height,
                                  .kind = kind,
                                  .buffer_size = static_cast<int32_t>(files % 97 + 12)};
            Bytes output(expected.size(), background);
            const Outcome outcome = run({&input, &fuzz::decoding_calls(fuzz::Format::bmp)[4]}, setting, output);
            const bool is_clean = PelmTest_Violation() == nullptr && PelmTest_Counters()->liveBlocks == 0;
            PelmTest_Reset();
            EXPECT_TRUE(is_clean) << setting.name();
            EXPECT_EQ(outcome.results().back(), PELM_RESULT_DONE) << setting.name();
            EXPECT_EQ(output, expected) << setting.name();
            EXPECT_FALSE(HasFailure()) << bits() << " bits, codes " << testing::PrintToString(codes);
            if (HasFailure()) return false;
        }
        ++files;
        return true;
    }

    Random random{GetParam() + 1100};
    uint64_t files = 0;

private:
    const Bytes palette_ = test::noise_palette(1u << bits(), 3);
};

TEST_P(RunLengthSweep, every_pair_of_bytes) {
    Bytes behind(300);
    for (uint8_t &byte : behind)
        byte = random.one_in(6) ? uint8_t{0} : random.byte();
    behind.insert(behind.end(), {0, 0, 3, 9, 0, 1, 2, 7, 0, 0});
    const uint32_t step = by_extent(503u, 11u, 1u);
    for (uint32_t pair = GetParam() / 2; pair < 65536; pair += 2 * step) {
        Bytes codes = {2, 7, static_cast<uint8_t>(pair >> 8), static_cast<uint8_t>(pair), 3, 5, 0, 0};
        codes.insert(codes.end(), behind.begin(), behind.end());
        if (!holds(codes, static_cast<int32_t>(pair % 9) + 1, 3)) return;
    }
    tell("pairs of bytes", files, 32768);
}

// One code of each kind, and some of the same one that differ at the row's width.
TEST_P(RunLengthSweep, every_sequence_of_four_codes) {
    static const std::vector<Bytes> alphabet = {{0, 0},
                                                {0, 1},
                                                {0, 2, 1, 1},
                                                {0, 2, 255, 0},
                                                {0, 3, 1, 2, 3, 0},
                                                {0, 4, 0x12, 0x34, 0x56, 0x78},
                                                {0, 7, 1, 2, 3, 4, 5, 6, 7, 8},
                                                {1, 0x9A},
                                                {4, 0x57},
                                                {5, 0xF0},
                                                {6, 0x0F},
                                                {255, 0x31}};
    const auto count = static_cast<uint32_t>(alphabet.size());
    const uint32_t step = by_extent(251u, 5u, 1u);
    for (uint32_t n = GetParam() / 2; n < count * count * count * count; n += 2 * step) {
        Bytes codes;
        for (uint32_t rest = n, i = 0; i < 4; ++i, rest /= count) {
            const Bytes &code = alphabet[rest % count];
            codes.insert(codes.end(), code.begin(), code.end());
        }
        if (n % 3 == 0) codes.insert(codes.end(), {0, 0});
        if (n % 7 == 0) codes.resize(random.below(static_cast<uint32_t>(codes.size())));
        if (!holds(codes, 5, static_cast<int32_t>(n % 4) + 1)) return;
    }
    tell("sequences of run-length codes", files, 10368);
}

INSTANTIATE_TEST_SUITE_P(Shards, RunLengthSweep, testing::Range(0u, 4u));

} // namespace
} // namespace pelm::sweeps

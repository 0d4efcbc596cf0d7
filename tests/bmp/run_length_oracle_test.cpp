// Run-length codes read by SDL as an oracle: of files whose codes both read the same way.
#include <SDL.h>

#include "tests/bmp/expectations.h"
#include "tests/support/run_length_codes.h"
#include "tests/support/sdl_reader.h"
#include "tests/support/two_step.h"

namespace pelm::test {
namespace {

class BmpRunLengthOracle : public HostedTest {};

// Deltas move there, rows end at their width, and the end of the bitmap ends it: these codes are left out.
TEST_F(BmpRunLengthOracle, sdl_reads_the_same_pixels) {
    Noise noise(31);
    for (int i = 0; i < 400; ++i) {
        const int bits = i % 2 == 0 ? 8 : 4;
        const int32_t width = static_cast<int32_t>(1 + noise.below(i % 7 == 0 ? 700 : 40));
        const int32_t height = static_cast<int32_t>(1 + noise.below(30));
        Picture rows = noise_picture(width, height, static_cast<uint16_t>(bits), static_cast<uint32_t>(i));
        for (auto &row : rows) // runs of all lengths
            for (size_t x = 2; x < row.size(); ++x)
                if (noise.below(4) != 0) row[x] = row[x - (bits == 4 ? 2 : 1)];
        CodeHabits habits;
        habits.leaves_out = noise.below(2) == 0;
        const Bytes codes = run_length_codes(rows, bits, noise, habits);
        BmpFile file = run_length_bmp(bits, width, height, codes, noise_palette(1u << bits, noise.next()));
        file.colors_used = 1u << bits;
        const std::optional<SdlPicture> picture = read_with_sdl(file_bytes(file));
        ASSERT_TRUE(picture) << SDL_GetError();
        const Bytes &expected = picture->rgb;
        ASSERT_EQ(expected.size(), static_cast<size_t>(width * height * 3));

        for (const uint32_t kind : all_kinds) {
            host.reset();
            TestSource source(kind, file_bytes(file), 800);
            const BmpRequest request{1, 0, 0, width, height};
            ASSERT_EQ(decode_by(two_steps(request), source, request, expected.size()).output, expected)
                << described(file, 0) << ", kind " << kind << ", codes " << ::testing::PrintToString(codes);
        }
    }
}

} // namespace
} // namespace pelm::test

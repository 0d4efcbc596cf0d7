// The fast loop and the careful one: the same pixels, the same end and the same place in the file, whatever the codes.
#include "tests/gif/inner/decoding_loops.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

GifFile file_of(uint16_t width, uint16_t height, int size, const Bytes &data, uint8_t largest) {
    GifFile file;
    file.screen(width, height, distinct_table(256)).descriptor({0, 0, width, height});
    return file.data(size, data, largest).trailer();
}

void expect_same_end(const GifFile &file, const GifRequest &request, const std::string &what) {
    ASSERT_EQ(loop_difference(file.bytes, request), "") << what;
}

using GifLoops = GifTest;

TEST_F(GifLoops, agree_on_streams_that_break_somewhere) {
    const uint32_t seeds = quick() ? 40 : 600;
    for (uint32_t seed = 0; seed < seeds; ++seed) {
        Noise noise(seed + 77);
        const auto below = [&noise](uint32_t limit) { return (noise.next() >> 6) % limit; };
        const int size = static_cast<int>(2 + below(7));
        const auto width = static_cast<uint16_t>(1 + below(200));
        const auto height = static_cast<uint16_t>(1 + below(100));
        Codes codes =
            lzw_codes(pixel_runs(size_t{width} * height, 1u << size, 1 + below(60), noise), size,
                      {.clear_every = below(2) == 0 ? 0 : 20 + below(900), .clears_full_table = below(3) > 0});
        const size_t at = below(static_cast<uint32_t>(codes.size()));
        if (below(4) > 0) codes[at] = below(1u << code_widths(codes, size)[at]);
        const GifFile file =
            file_of(width, height, size, packed_codes(codes, size), static_cast<uint8_t>(1 + below(255)));
        expect_same_end(file, own_size(width, height, 1), "seed " + std::to_string(seed));
        if (HasFatalFailure()) return;
    }
}

} // namespace
} // namespace pelm::test

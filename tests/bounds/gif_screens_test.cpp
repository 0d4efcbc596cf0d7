// Screens larger than any memory, and those whose canvas would seem small when its size is computed in 32 bits.
#include <algorithm>
#include <numeric>

#include "tests/bounds/ways.h"
#include "tests/bounds/work.h"
#include "tests/gif/support/gif_blocks.h"
#include "tests/gif/support/gif_builder.h"

namespace pelm::test {
namespace {

using GifScreens = BoundsTest;

constexpr uint64_t most_for_a_still = 464u << 10;

struct Screen {
    uint16_t width, height;
    uint64_t canvas() const { return 4 * uint64_t{width} * height; }
    std::string described() const { return std::to_string(width) + " x " + std::to_string(height); }
};

// The sizes that wrap to the least: 4 x width x height just above a multiple of 2^32.
std::vector<Screen> wrapping_screens(uint64_t most_bytes) {
    std::vector<Screen> screens;
    for (uint32_t width = 1; width <= 65535; ++width)
        for (uint64_t multiple = 1; multiple <= 4; ++multiple) {
            const uint64_t height = ((multiple << 30) + width - 1) / width;
            const Screen screen{static_cast<uint16_t>(width), static_cast<uint16_t>(height)};
            if (height <= 65535 && screen.canvas() % (uint64_t{1} << 32) <= most_bytes) screens.push_back(screen);
        }
    return screens;
}

Bytes file_of(const Screen &screen, const ImagePlace &place) {
    GifFile file;
    file.screen(screen.width, screen.height, distinct_table(4));
    const size_t rows = std::min<size_t>(place.height, 3);
    return file.descriptor(place).data(2, lzw_data(Bytes(place.width * rows, 2), 2)).trailer().bytes;
}

// 0, without having asked for a canvas, and nothing drawn.
void expect_refused(const Screen &screen, const ImagePlace &place, Way way, const Asking &asking) {
    reset_work();
    const Decoded decoded = decode(file_of(screen, place), way, asking);
    EXPECT_EQ(decoded.result, 0) << name_of(way) << ", " << screen.described();
    EXPECT_LE(work().peak_bytes, most_for_a_still + 2048) << screen.described();
    const std::vector<uint32_t> &asked = TestHost::get().allocations;
    EXPECT_LE(*std::max_element(asked.begin(), asked.end()), 4u * screen.width + 65536) << screen.described();
    EXPECT_EQ(decoded.output, Bytes(decoded.output.size())) << screen.described();
    EXPECT_TRUE(left_nothing()) << screen.described();
}

TEST_F(GifScreens, canvases_beyond_32_bits_are_refused_and_never_asked_for) {
    for (const Screen &screen :
         {Screen{65535, 65535}, Screen{32768, 32768}, Screen{32769, 32768}, Screen{32768, 32769}, Screen{62525, 17173},
          Screen{17173, 62525}, Screen{65535, 16385}, Screen{16385, 65535}, Screen{46341, 46341}, Screen{65535, 49153}})
        for (const Way way : frame_ways)
            for (const uint32_t kind : every_kind)
                for (const ImagePlace &place : {ImagePlace{0, 0, 2, 2}, ImagePlace{3, 5, 65535, 65535, true}})
                    for (const Asking &asking : {Asking{kind, 7, 0, 16, 9}, Asking{kind, 0, 0x700 | 4, 7, 9},
                                                 Asking{kind, 1, 0, 65535, 65535, 0, false}})
                        expect_refused(screen, place, way, asking);
}

TEST_F(GifScreens, canvases_that_wrap_to_next_to_nothing_are_refused_all_the_same) {
    const std::vector<Screen> screens = wrapping_screens(256);
    ASSERT_GT(screens.size(), 50u);
    for (const Screen &screen : screens)
        for (const Way way : frame_ways)
            expect_refused(screen, {0, 0, 2, 2}, way, {PELM_SOURCE_MEMORY, 7, 0x700, 4, 4});
}

TEST_F(GifScreens, the_largest_canvases_of_32_bits_are_asked_for_at_their_true_size) {
    for (const Screen &screen : {Screen{32767, 32768}, Screen{65535, 16384}, Screen{16384, 65535}})
        for (const Way way : frame_ways) {
            reset_work();
            EXPECT_EQ(decode(file_of(screen, {0, 0, 2, 2}), way, {PELM_SOURCE_MEMORY, 7, 0x700, 4, 4}).result, 0);
            EXPECT_EQ(host.allocations.back(), screen.canvas());
            EXPECT_TRUE(left_nothing());
        }
}

TEST_F(GifScreens, a_still_of_any_size_takes_at_most_464_kilobytes) {
    constexpr uint16_t sides[] = {1, 2, 4097, 32768, 65535};
    uint64_t most = 0;
    for (const uint16_t screen_width : sides)
        for (const uint16_t screen_height : sides)
            for (const uint16_t image_width : sides)
                for (const uint16_t image_height : {uint16_t{1}, uint16_t{65535}})
                    for (const Way way : still_ways)
                        for (const bool interlaced : {false, true}) {
                            if (interlaced && way == Way::gif_lines) continue;
                            reset_work();
                            const Screen screen{screen_width, screen_height};
                            const Bytes file = file_of(screen, {0, 0, image_width, image_height, interlaced});
                            decode(file, way, {PELM_SOURCE_STREAM, 7, 0x700, 16, 9});
                            EXPECT_TRUE(left_nothing()) << screen.described();
                            most = std::max(most, work().peak_bytes);
                        }
    EXPECT_LE(most, most_for_a_still);
    const std::vector<uint32_t> largest = gif_still_blocks(65535);
    EXPECT_EQ(most, std::accumulate(largest.begin(), largest.end(), uint64_t{0})) << "the largest was among them";
}

TEST_F(GifScreens, stills_of_many_images_or_noise_take_no_more) {
    for (uint32_t seed = 0; seed < 300; ++seed) {
        Noise noise(seed + 77);
        const auto side = [&noise] { return static_cast<uint16_t>(1 + noise.next() % 65535); };
        GifFile file;
        file.screen(side(), side(), distinct_table(size_t{2} << seed % 8));
        for (int i = 0; i < 3; ++i)
            file.control({0, 1, 1}).image({side(), side(), side(), 1}, noise_pixels(40, 4, seed), 2,
                                          distinct_table(256));
        Bytes bytes = file.trailer().bytes;
        if (seed % 2 != 0)
            for (size_t i = 13; i < bytes.size(); i += 1 + noise.below(200))
                bytes[i] = static_cast<uint8_t>(noise.next() >> 8);
        for (const Way way : still_ways) {
            reset_work();
            decode(bytes, way, {PELM_SOURCE_MEMORY, 1, 0, 30, 30});
            EXPECT_LE(work().peak_bytes, most_for_a_still) << "seed " << seed;
        }
    }
}

} // namespace
} // namespace pelm::test

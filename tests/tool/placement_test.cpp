// Box, placement and background as the user sees them.
#include "tests/tool/image_files.h"
#include "tests/tool/run_tool.h"

namespace pelm::test {
namespace {

class ToolPlacement : public ToolTest {
protected:
    Image decoded(std::vector<std::string> arguments) const {
        arguments.insert(arguments.end(), {"-o", path("x.png")});
        const ToolRun got = run(arguments);
        EXPECT_EQ(got.status, 0) << got.err;
        return read_png(path("x.png"));
    }

    std::string flat(int32_t width, int32_t height) const {
        return write("flat.bmp", flat_bmp(variant_named("twenty_four_bits"), width, height, 0x204060));
    }
};

constexpr uint32_t colour = 0x204060FF;

std::string size_of(const Image &image) {
    return std::to_string(image.width) + "x" + std::to_string(image.height);
}

TEST_F(ToolPlacement, the_default_box_is_the_image_and_turns_with_it) {
    const std::string file = flat(8, 4);
    EXPECT_EQ(size_of(decoded({file})), "8x4");
    EXPECT_EQ(size_of(decoded({file, "--rotate", "90"})), "4x8");
    EXPECT_EQ(size_of(decoded({file, "--rotate", "180"})), "8x4");
    EXPECT_EQ(size_of(decoded({file, "--rotate", "270"})), "4x8");
}

// A flat image of which the top left corner of a box of 8 x 8 shows the background and the middle shows the image.
TEST_F(ToolPlacement, fit_centres_the_image_on_the_background) {
    const std::string file = flat(8, 4);
    const struct {
        std::vector<std::string> options;
        uint32_t background;
    } cases[] = {
        {{}, 0},
        {{"--format", "rgb"}, 0x000000FF},
        {{"--background", "C08040"}, 0xC08040FF},
        {{"--background", "#c08040", "--format", "argb"}, 0xC08040FF},
        {{"--background", "FF0000", "--format", "rgb565"}, 0xFF0000FF},
        {{"--background", "00FF00", "--format", "rgb565a"}, 0x00FF00FF},
        {{"--background", "0000FF", "--format", "bgra"}, 0x0000FFFF},
    };
    for (const auto &one : cases) {
        std::vector<std::string> arguments = {file, "--box", "8x8"};
        arguments.insert(arguments.end(), one.options.begin(), one.options.end());
        const Image got = decoded(arguments);
        ASSERT_EQ(size_of(got), "8x8");
        EXPECT_EQ(got.at(0, 0), one.background) << testing::PrintToString(one.options);
        EXPECT_EQ(got.at(7, 1), one.background) << testing::PrintToString(one.options);
        EXPECT_NE(got.at(0, 2), one.background) << testing::PrintToString(one.options);
        EXPECT_NE(got.at(7, 5), one.background) << testing::PrintToString(one.options);
        EXPECT_EQ(got.at(0, 6), one.background) << testing::PrintToString(one.options);
    }
}

TEST_F(ToolPlacement, stretch_fills_the_box) {
    const Image got = decoded({flat(8, 4), "--box", "5x20", "--place", "stretch"});
    ASSERT_EQ(size_of(got), "5x20");
    for (const uint32_t pixel : got.pixels)
        ASSERT_EQ(pixel, colour);
}

TEST_F(ToolPlacement, exact_gives_just_the_reduced_image) {
    const std::string file = flat(32, 16);
    for (const std::string rotation : {"0", "180"}) {
        const Image got = decoded({file, "--box", "8x20", "--place", "exact", "--rotate", rotation});
        ASSERT_EQ(size_of(got), "8x4");
        for (const uint32_t pixel : got.pixels)
            ASSERT_EQ(pixel, colour);
    }
}

// The box of 20 x 8 is one of 8 x 20 for the image, and the output is 8 x 4 although the turned image is 4 x 8.
TEST_F(ToolPlacement, exact_keeps_the_unturned_size_for_quarter_turns) {
    for (const std::string rotation : {"90", "270"}) {
        const Image got = decoded({flat(32, 16), "--box", "20x8", "--place", "exact", "--rotate", rotation});
        ASSERT_EQ(size_of(got), "8x4");
        EXPECT_EQ(got.at(1, 1), 0u) << "left of the turned image";
        EXPECT_EQ(got.at(3, 1), colour);
    }
}

TEST_F(ToolPlacement, exact_without_reduction_is_the_image_itself) {
    EXPECT_EQ(size_of(decoded({flat(8, 4), "--box", "100x100", "--place", "exact"})), "8x4");
}

TEST_F(ToolPlacement, a_box_beyond_two_gibibytes_is_refused) {
    const std::string file = flat(8, 4);
    expect_failure({file, "--box", "2000000000x2000000000", "-o", path("x.png")}, file,
                   "an output of 2000000000x2000000000 pixels is larger than 2 GiB");
    expect_failure({file, "--box", "32768x16385", "-o", path("x.png")}, file,
                   "an output of 32768x16385 pixels is larger than 2 GiB");
}

TEST_F(ToolPlacement, a_box_in_which_nothing_is_left_of_the_image_is_refused) {
    const std::string file = flat(100, 1);
    expect_failure({file, "--box", "10x10", "-o", path("x.png")}, file,
                   "nothing is left of the image in a box of 10x10 pixels");
    expect_failure({file, "--box", "10x10", "--place", "exact", "-o", path("x.png")}, file,
                   "nothing is left of the image in a box of 10x10 pixels");
}

} // namespace
} // namespace pelm::test

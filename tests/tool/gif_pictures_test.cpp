// Still GIFs through the tool: every mode, source and format gives the picture that giflib reads. Some test images lie
// outside of the repository: where they are missing, the tests say so and use the samples alone.
#include <cstdlib>
#include <iostream>

#include "tests/support/small_gif.h"
#include "tests/tool/gif_oracle.h"
#include "tests/tool/run_tool.h"

namespace pelm::test {
namespace {

namespace fs = std::filesystem;
using Words = std::vector<std::string>;

const Words formats = {"rgb565", "rgb", "argb", "rgba", "bgra", "bgr565", "bgr", "bgrx"};

std::vector<fs::path> test_gifs() {
    const char *const chosen = std::getenv("PELM_TEST_IMAGES");
    const fs::path folder = chosen != nullptr ? chosen : PELM_SHARED_IMAGES;
    std::vector<fs::path> paths = files_with_suffix(folder, ".gif");
    if (paths.empty()) std::cout << "samples only: no GIFs in " << folder << "; set PELM_TEST_IMAGES\n";
    const std::vector<fs::path> samples = files_with_suffix(PELM_SAMPLES, ".gif");
    paths.insert(paths.end(), samples.begin(), samples.end());
    return paths;
}

bool is_interlaced(const fs::path &path) {
    return path.stem().string().find("interlaced") != std::string::npos;
}

// What a picture becomes in 5, 6 and 5 bits and back, the high bits repeated below.
Image through_565(Image image) {
    for (uint32_t &pixel : image.pixels) {
        const uint32_t r = pixel >> 27, g = pixel >> 18 & 63, b = pixel >> 11 & 31;
        pixel = (r << 3 | r >> 2) << 24 | (g << 2 | g >> 4) << 16 | (b << 3 | b >> 2) << 8 | 255;
    }
    return image;
}

// Pixel (x, y) of the result shows the one at the middle of its place.
Image reduced(const Image &image, size_t width, size_t height) {
    Image result{width, height, {}, image.has_alpha};
    for (size_t y = 0; y < height; ++y) {
        for (size_t x = 0; x < width; ++x)
            result.pixels.push_back(
                image.at((x * image.width + image.width / 2) / width, (y * image.height + image.height / 2) / height));
    }
    return result;
}

class ToolGif : public ToolTest {
protected:
    Image decoded(const fs::path &file, const Words &options, const std::string &input = "/dev/null") const {
        Words arguments = {file.string(), "--quiet", "-o", path("decoded.png")};
        arguments.insert(arguments.end(), options.begin(), options.end());
        const ToolRun got = run(arguments, input);
        EXPECT_EQ(got.status, 0) << got.err;
        EXPECT_EQ(got.err, "");
        return read_png(path("decoded.png"));
    }
};

TEST_F(ToolGif, every_mode_and_source_gives_the_same_picture) {
    for (const fs::path &file : test_gifs()) {
        const Image expected = read_gif(file).first;
        ASSERT_GT(expected.width, 0u) << file;
        for (const std::string source : {"memory", "file", "pipe"}) {
            if (expected.width > 1000 && source != "file") continue; // takes long to write
            for (const char *const mode : {"oneshot", "iter", "line=1", "line=7", "line=100000"}) {
                if (is_interlaced(file) && std::string(mode).starts_with("line")) continue;
                EXPECT_EQ(difference(expected, decoded(file, {"--source", source, "--mode", mode})), "")
                    << file << ", " << source << ", " << mode;
            }
        }
    }
}

TEST_F(ToolGif, comes_through_pipes) {
    const std::string file = sample("sunset.gif").string();
    const Image expected = read_gif(file).first;
    EXPECT_EQ(difference(expected, decoded("-", {}, file)), "");
    const ToolRun got = shell("cat '" + file + "' | $TOOL - -o - >'" + path("x.png") + "'");
    EXPECT_EQ(got.status, 0) << got.err;
    EXPECT_EQ(difference(expected, read_png(path("x.png"))), "");
}

TEST_F(ToolGif, looks_the_same_in_every_output_format) {
    for (const fs::path &file : test_gifs()) {
        const Image full = read_gif(file).first;
        for (const std::string &format : formats) {
            const bool is_565 = format.find("565") != std::string::npos;
            const Image got = decoded(file, {"--format", format});
            EXPECT_EQ(difference(is_565 ? through_565(full) : full, got), "") << file << ", " << format;
            EXPECT_EQ(got.has_alpha, format == "argb" || format == "rgba" || format == "bgra") << format;
        }
    }
}

TEST_F(ToolGif, shows_the_nearest_pixels_when_it_is_reduced) {
    for (const char *const name : {"sunset.gif", "sunset-interlaced.gif"}) {
        const Image full = read_gif(sample(name)).first;
        for (const std::string &format : formats) {
            if (format.find("565") != std::string::npos) continue;
            const Image expected = reduced(full, 100, 75);
            const Words options = {"--box", "100x200", "--place", "exact", "--format", format};
            EXPECT_EQ(difference(expected, decoded(sample(name), options)), "") << name << ", " << format;
        }
    }
    const Image expected = reduced(read_gif(sample("sunset.gif")).first, 50, 90);
    for (const char *const mode : {"oneshot", "iter", "line=4"})
        EXPECT_EQ(difference(expected,
                             decoded(sample("sunset.gif"), {"--box", "50x90", "--place", "stretch", "--mode", mode})),
                  "")
            << mode;
}

TEST_F(ToolGif, is_turned_clockwise) {
    const Image full = read_gif(sample("sunset-interlaced.gif")).first;
    const Image small = reduced(full, 100, 75);
    for (int turns = 0; turns < 4; ++turns) {
        const std::string degrees = std::to_string(90 * turns);
        const Words whole = {"--rotate", degrees, "--format", "bgrx"};
        EXPECT_EQ(difference(turned(full, turns), decoded(sample("sunset-interlaced.gif"), whole)), "") << degrees;
        const Words box = {"--rotate", degrees, "--box", turns % 2 == 0 ? "100x75" : "75x100"};
        EXPECT_EQ(difference(turned(small, turns), decoded(sample("sunset-interlaced.gif"), box)), "") << degrees;
    }
}

TEST_F(ToolGif, lies_in_the_middle_of_a_larger_box_in_every_mode) {
    const Image full = read_gif(sample("sunset.gif")).first;
    Image expected{323, 250, std::vector<uint32_t>(323 * 250, 0x102030FF), true};
    for (size_t y = 0; y < full.height; ++y)
        std::copy_n(&full.pixels[y * full.width], full.width, &expected.pixels[(y + 5) * expected.width + 1]);
    for (const char *const mode : {"oneshot", "iter", "line=11"}) {
        const Words options = {"--box", "323x250", "--background", "102030", "--mode", mode};
        EXPECT_EQ(difference(expected, decoded(sample("sunset.gif"), options)), "") << mode;
    }
}

TEST_F(ToolGif, by_lines_keeps_its_place_below_the_top_of_the_screen) {
    SmallGif gif;
    gif.width = 4, gif.height = 9;
    gif.frames[0].top = 3;
    const std::string file = write("x.gif", gif_bytes(gif));
    const Words background = {"--background", "102030"};
    const Image expected = decoded(file, {"--background", "102030"});
    EXPECT_EQ(expected.at(1, 2), 0x102030FFu);
    EXPECT_EQ(expected.at(1, 3), 0xF0A030FFu);
    EXPECT_EQ(expected.at(1, 6), 0x102030FFu);
    for (const char *const mode : {"iter", "line=1", "line=2", "line=50"})
        EXPECT_EQ(difference(expected, decoded(file, {"--background", "102030", "--mode", mode})), "") << mode;
}

} // namespace
} // namespace pelm::test

// PNG through the tool: every mode, source and format gives the picture that libpng reads. The test images lie outside
// of the repository: where they are missing, the tests say so and pass.
#include "tests/tool/run_tool.h"

#include <cstdlib>
#include <iostream>

#include "tests/tool/image_files.h"
#include "tests/tool/png_file.h"

namespace pelm::test {
namespace {

namespace fs = std::filesystem;
using Words = std::vector<std::string>;

const Words modes = {"oneshot", "iter", "line=1", "line=7", "line=1000"};
const Words sources = {"memory", "file", "pipe"};
const Words formats = {"rgb565", "rgb", "argb", "rgb565a", "rgba", "bgra"};

Words operator+(Words words, const Words &more) {
    words.insert(words.end(), more.begin(), more.end());
    return words;
}

fs::path image_folder() {
    const char *const chosen = std::getenv("PELM_TEST_IMAGES");
    return chosen != nullptr ? chosen : PELM_SHARED_IMAGES;
}

bool is_interlaced(const fs::path &path) {
    return read_file(path)[28] != 0;
}

// Greys of 2 and 4 bits are widened differently on purpose.
bool is_narrow_grey(const fs::path &path) {
    const Bytes bytes = read_file(path);
    return bytes[25] == 0 && (bytes[24] == 2 || bytes[24] == 4);
}

// The sound images, photos and icons.
Words test_images() {
    Words names;
    for (const fs::path &folder : {image_folder(), image_folder() / "pngsuite"}) {
        for (const fs::path &path : files_with_suffix(folder, ".png"))
            if (path.filename().string()[0] != 'x') names.push_back(path.string());
    }
    if (names.empty()) std::cout << "not tested: no images in " << image_folder() << "; set PELM_TEST_IMAGES\n";
    return names;
}

bool is_by_lines(const std::string &mode) {
    return mode.rfind("line", 0) == 0;
}

// Those that a mode can decode: interlaced images have no lines.
Words images_for(const std::string &mode, const Words &images) {
    Words chosen;
    for (const std::string &image : images)
        if (!is_by_lines(mode) || !is_interlaced(image)) chosen.push_back(image);
    return chosen;
}

class ToolPng : public ToolTest {
protected:
    // The buffer of the decode; empty when it failed.
    Bytes raw(const Words &arguments) const {
        const ToolRun got = run(arguments + Words{"--quiet", "--output-type", "raw", "-o", path("raw")});
        EXPECT_EQ(got.status, 0) << testing::PrintToString(arguments) << got.err;
        return got.status == 0 ? read_file(path("raw")) : Bytes();
    }

    Image decoded(const Words &arguments) const {
        const ToolRun got = run(arguments + Words{"-o", path("decoded.png")});
        EXPECT_EQ(got.status, 0) << got.err;
        EXPECT_EQ(got.err, "");
        return read_png(path("decoded.png"));
    }

    // All inputs in one run, into a folder of that name.
    fs::path decoded_into(const std::string &folder, const Words &inputs, const Words &arguments) const {
        const ToolRun got = run(inputs + arguments + Words{"--quiet", "-o", path(folder + "-%f.png")});
        EXPECT_EQ(got.status, 0) << testing::PrintToString(arguments) << got.err;
        return path(folder + "-");
    }
};

TEST_F(ToolPng, samples_become_the_pixels_that_libpng_reads) {
    for (const auto &file : files_with_suffix(PELM_SAMPLES, ".png"))
        EXPECT_EQ(difference(read_png_samples(file), decoded({file.string()})), "") << file;
}

TEST_F(ToolPng, samples_are_the_same_in_every_mode_from_every_source_in_every_place) {
    const std::vector<Words> places = {{},
                                       {"--box", "400x300"},
                                       {"--box", "90x110"},
                                       {"--box", "90x110", "--rotate", "90"},
                                       {"--box", "90x40", "--rotate", "180", "--background", "405060"},
                                       {"--box", "70x50", "--rotate", "270", "--place", "exact"},
                                       {"--box", "77x500", "--place", "stretch"},
                                       {"--box", "700x77", "--place", "stretch", "--rotate", "90"}};
    size_t turn = 0;
    for (const auto &file : files_with_suffix(PELM_SAMPLES, ".png")) {
        for (const Words &place : places) {
            const Words arguments = Words{file.string(), "--format", formats[turn % formats.size()]} + place;
            const Bytes expected = raw(arguments);
            for (const std::string &mode : modes) {
                const std::string &source = sources[turn++ % sources.size()];
                EXPECT_TRUE(raw(arguments + Words{"--mode", mode, "--source", source}) == expected)
                    << testing::PrintToString(arguments) << ", " << mode << ", " << source;
            }
        }
    }
}

TEST_F(ToolPng, test_images_become_the_pixels_that_libpng_reads_in_every_mode_from_every_source) {
    const Words images = test_images();
    if (images.empty()) return;
    const std::pair<const char *, const char *> ways[] = {
        {"oneshot", "memory"}, {"oneshot", "file"}, {"oneshot", "pipe"},  {"iter", "memory"},
        {"iter", "file"},      {"line=1", "pipe"},  {"line=7", "memory"}, {"line=1000", "file"}};
    for (const auto &[mode, source] : ways) {
        const Words chosen = images_for(mode, images);
        const std::string folder = decoded_into("all", chosen, {"--mode", mode, "--source", source}).string();
        for (const std::string &image : chosen) {
            if (is_narrow_grey(image)) continue;
            const Image got = read_png(folder + fs::path(image).filename().string());
            EXPECT_EQ(difference(read_png_samples(image), got), "") << image << ", " << mode << ", " << source;
        }
    }
}

TEST_F(ToolPng, test_images_are_reduced_alike_in_every_mode) {
    const Words images = test_images();
    if (images.empty()) return;
    for (const Words &place : std::vector<Words>{{"--box", "21x30", "--rotate", "270"},
                                                 {"--box", "90x75", "--place", "stretch", "--format", "rgb"}}) {
        const std::string expected = decoded_into("once", images, place).string();
        for (const std::string &mode : modes) {
            const Words chosen = images_for(mode, images);
            const std::string got = decoded_into("calls", chosen, place + Words{"--mode", mode}).string();
            for (const std::string &image : chosen) {
                const std::string name = fs::path(image).filename().string();
                EXPECT_TRUE(read_file(expected + name) == read_file(got + name)) << name << ", " << mode;
            }
        }
    }
}

// 3x3 grey pixels in the passes 1, 4, 5, 6 and 7, whose pixels are 1, 2, 3, ... in the order of the file.
PngPart interlaced_data() {
    return data_part({0, 1, 0, 2, 0, 3, 4, 0, 5, 0, 6, 0, 7, 8, 9});
}

TEST_F(ToolPng, interlaced_images_are_decoded_but_not_by_lines) {
    const std::string file =
        write("i.png", png_bytes({header_part({3, 3, 8, 0, 0, 0, 1}), interlaced_data(), end_part()}));
    const Image got = decoded({file});
    const std::vector<uint32_t> greys = {1, 5, 2, 7, 8, 9, 3, 6, 4};
    for (size_t i = 0; i < greys.size(); ++i)
        EXPECT_EQ(got.pixels[i], greys[i] * 0x01010100u + 255) << i;
    EXPECT_EQ(decoded({file, "--mode", "iter"}).pixels, got.pixels);
    EXPECT_EQ(run({file, "--mode", "line=2", "-o", path("x.png")}).err,
              "pelm-decode: " + file + ": an interlaced image cannot be decoded by lines\n");
    EXPECT_NE(run({"--info", file}).out.find("interlaced, 1 IDAT chunk; decoded"), std::string::npos);
    EXPECT_EQ(run({file, "--frame-buffer", "--box", "2x2", "-o", path("y.png")}).status, 0);
}

TEST_F(ToolPng, rows_that_an_interlaced_image_lacks_are_noticed) {
    const std::string file =
        write("i.png", png_bytes({header_part({3, 3, 8, 0, 0, 0, 1}), data_part({0, 1, 0, 2}), end_part()}));
    const ToolRun got = run({file, "-o", path("x.png")});
    EXPECT_EQ(got.status, 2);
    EXPECT_EQ(got.err, "pelm-decode: " + file + ": warning: the image data breaks off after 2 of 6 rows\n");
}

TEST_F(ToolPng, pipes_are_read_without_saying_so) {
    const std::string file = sample("sunset-alpha.png").string();
    const ToolRun got = shell("cat '" + file + "' | $TOOL - -o '" + path("x.png") + "'");
    EXPECT_EQ(got.status, 0) << got.err;
    EXPECT_EQ(difference(read_png_samples(file), read_png(path("x.png"))), "");
    const ToolRun named = shell("$TOOL <(cat '" + file + "') --source pipe -o '" + path("y.png") + "'");
    EXPECT_EQ(named.status, 0) << named.err;
    EXPECT_EQ(difference(read_png_samples(file), read_png(path("y.png"))), "");
}

TEST_F(ToolPng, inputs_stay_as_they_are) {
    const Bytes before = read_file(sample("sunset-alpha.png"));
    const std::string copy = write("copy.png", before);
    ASSERT_EQ(run({copy, "-o", path("x.png")}).status, 0);
    EXPECT_TRUE(read_file(copy) == before);
}

uint32_t mixed(uint32_t over, uint32_t under, uint32_t alpha) {
    return (over * alpha + under * (255 - alpha) + 127) / 255;
}

// How far a pixel's channels are from those of `over` on `under`, at most.
int distance_from_mixture(uint32_t got, uint32_t over, uint32_t under) {
    int most = 0;
    for (const int shift : {24, 16, 8}) {
        const uint32_t wanted = mixed(over >> shift & 255, under >> shift & 255, over & 255);
        most = std::max(most, std::abs(static_cast<int>(wanted) - static_cast<int>(got >> shift & 255)));
    }
    return most;
}

TEST_F(ToolPng, the_background_shows_through_where_there_is_no_alpha_in_the_output) {
    constexpr uint32_t background = 0x20C040FF;
    for (const char *const name : {"sunset-alpha.png", "sunset-palette.png"}) {
        const Image over = read_png_samples(sample(name));
        for (const auto &[format, tolerance] : {std::pair("rgb", 2), std::pair("rgb565", 12)}) {
            const Image got = decoded({sample(name).string(), "--format", format, "--background", "20C040"});
            ASSERT_EQ(got.pixels.size(), over.pixels.size());
            int worst = 0;
            for (size_t i = 0; i < over.pixels.size(); ++i)
                worst = std::max(worst, distance_from_mixture(got.pixels[i], over.pixels[i], background));
            EXPECT_LE(worst, tolerance) << name << ", " << format;
        }
        const Image kept = decoded({sample(name).string(), "--background", "20C040"});
        EXPECT_EQ(difference(over, kept), "") << name;
    }
}

TEST_F(ToolPng, the_background_shows_where_a_transparent_colour_is) {
    const std::vector<uint8_t> row = {0, 9, 9, 9, 1, 2, 3};
    const std::string file =
        write("key.png", png_bytes({header_part({2, 1}), {"tRNS", {0, 9, 0, 9, 0, 9}}, data_part(row), end_part()}));
    const Image got = decoded({file, "--format", "rgb", "--background", "20C040"});
    EXPECT_EQ(got.pixels, (std::vector<uint32_t>{0x20C040FF, 0x010203FF}));
}

TEST_F(ToolPng, turns_that_the_decoder_does_not_make_come_with_a_warning) {
    const std::string rgb = sample("sunset.png").string(), grey = sample("sunset-grey.png").string();
    EXPECT_EQ(run({rgb, "--rotate", "180", "-o", path("x.png")}).err,
              "pelm-decode: " + rgb + ": warning: the decoder does not turn a PNG at its own size\n");
    EXPECT_EQ(run({rgb, "--rotate", "180", "--box", "99x99", "-o", path("x.png")}).err, "");
    EXPECT_EQ(run({grey, "--box", "99x99", "-o", path("x.png")}).err,
              "pelm-decode: " + grey +
                  ": warning: the decoder fills only a part of the place of a reduced PNG with 8 bits of grey\n");
}

// The first block of a large picture ends long before the first reduced row: the decoder would start over for ever.
TEST_F(ToolPng, block_by_block_gives_up_where_the_first_block_brings_no_row) {
    std::vector<uint8_t> rows = noise_rows(3000, 300);
    const std::string file = write("x.png", png_bytes({header_part({1000, 300}), data_part(rows), end_part()}));
    for (const Words &place : {Words{}, Words{"--box", "10x2", "--place", "stretch"}}) {
        const ToolRun got = shell("timeout 20 $TOOL '" + file + "' --mode iter --output-type raw -o '" + path("iter") +
                                  "' " + (place.empty() ? "" : "--box 10x2 --place stretch"));
        EXPECT_EQ(got.status, 0) << got.err;
        EXPECT_TRUE(read_file(path("iter")) == raw(Words{file} + place));
    }
}

} // namespace
} // namespace pelm::test

// The committed samples: what they are, and that every way through the tool gives their pixels.
#include "tests/tool/run_tool.h"
#include "tests/tool/stored_pixels.h"

namespace pelm::test {
namespace {

class ToolSamples : public ToolTest {
protected:
    // Decodes and reads the PNG.
    Image decoded(std::vector<std::string> arguments, const std::string &standard_input = "/dev/null") const {
        arguments.insert(arguments.end(), {"-o", path("decoded.png")});
        const ToolRun got = run(arguments, standard_input);
        EXPECT_EQ(got.status, 0) << got.err;
        EXPECT_EQ(got.err, "");
        return read_png(path("decoded.png"));
    }
};

const char *const formats[] = {"rgb565", "rgb", "argb", "rgb565a", "rgba", "bgra"};

// What a picture becomes in 5, 6 and 5 bits and back, the high bits repeated below.
Image through_565(const Image &image) {
    Image result = image;
    for (uint32_t &pixel : result.pixels) {
        const uint32_t r = pixel >> 27, g = pixel >> 18 & 63, b = pixel >> 11 & 31;
        pixel = (r << 3 | r >> 2) << 24 | (g << 2 | g >> 4) << 16 | (b << 3 | b >> 2) << 8 | 255;
    }
    return result;
}

TEST_F(ToolSamples, are_what_the_generator_draws) {
    ASSERT_EQ(shell(std::string(PELM_DRAW_SAMPLES) + " '" + path("") + "'").status, 0);
    std::vector<std::filesystem::path> samples = bmp_samples();
    for (const char *const suffix : {".png", ".gif", ".wbmp"}) {
        const auto others = files_with_suffix(PELM_SAMPLES, suffix);
        samples.insert(samples.end(), others.begin(), others.end());
    }
    ASSERT_EQ(files().size(), samples.size());
    for (const auto &file : samples)
        EXPECT_TRUE(read_file(path(file.filename().string())) == read_file(file)) << file;
}

TEST_F(ToolSamples, become_pngs_of_their_stored_pixels) {
    for (const auto &file : bmp_samples())
        EXPECT_EQ(difference(stored_image(read_file(file)), decoded({file.string()})), "") << file;
}

TEST_F(ToolSamples, become_the_same_pixels_as_ppm_pam_and_raw) {
    for (const auto &file : bmp_samples()) {
        const Image expected = stored_image(read_file(file));
        for (const char *const suffix : {"ppm", "pam", "raw"}) {
            ASSERT_EQ(run({file.string(), "-o", path(std::string("x.") + suffix)}).status, 0) << file << suffix;
        }
        EXPECT_EQ(difference(expected, read_ppm(read_file(path("x.ppm")))), "") << file;
        EXPECT_EQ(difference(expected, read_pam(read_file(path("x.pam")))), "") << file;
        Bytes raw;
        for (const uint32_t pixel : expected.pixels) {
            for (int shift = 24; shift >= 0; shift -= 8)
                raw.push_back(static_cast<uint8_t>(pixel >> shift));
        }
        EXPECT_TRUE(read_file(path("x.raw")) == raw) << file;
    }
}

TEST_F(ToolSamples, look_the_same_in_every_output_format) {
    const Image full = stored_image(read_file(sample("sunset.bmp")));
    for (const std::string format : formats) {
        const Image got = decoded({sample("sunset.bmp").string(), "--format", format});
        const bool is_565 = format.starts_with("rgb565");
        EXPECT_EQ(difference(is_565 ? through_565(full) : full, got), "") << format;
        EXPECT_EQ(got.has_alpha, format.find('a') != std::string::npos) << format;
    }
}

TEST_F(ToolSamples, give_the_same_pixels_from_every_source) {
    for (const auto &file : bmp_samples()) {
        const Image expected = stored_image(read_file(file));
        for (const char *const source : {"memory", "file", "pipe"}) {
            if (file.stem() == "sunset-topdown" && source == std::string("pipe")) continue;
            EXPECT_EQ(difference(expected, decoded({file.string(), "--source", source})), "") << file << source;
        }
        EXPECT_EQ(difference(expected, decoded({"-"}, file.string())), "") << file;
        EXPECT_EQ(difference(expected, decoded({"-", "--source", "memory"}, file.string())), "") << file;
    }
}

TEST_F(ToolSamples, pass_through_real_pipes) {
    const ToolRun got = shell("cat '" + sample("sunset-8.bmp").string() + "' | $TOOL - -o - >'" + path("x.png") + "'");
    EXPECT_EQ(got.status, 0) << got.err;
    EXPECT_EQ(difference(stored_image(read_file(sample("sunset-8.bmp"))), read_png(path("x.png"))), "");
    const ToolRun named = shell("$TOOL <(cat '" + sample("sunset-4.bmp").string() + "') -o '" + path("y.png") + "'");
    EXPECT_EQ(named.status, 0) << named.err;
    EXPECT_EQ(difference(stored_image(read_file(sample("sunset-4.bmp"))), read_png(path("y.png"))), "");
}

TEST_F(ToolSamples, are_turned_clockwise) {
    for (const char *const name : {"sunset.bmp", "sunset-topdown.bmp", "sunset-1.bmp"}) {
        const Image upright = stored_image(read_file(sample(name)));
        for (int turns = 0; turns < 4; ++turns) {
            const Image got = decoded({sample(name).string(), "--rotate", std::to_string(90 * turns)});
            EXPECT_EQ(difference(turned(upright, turns), got), "") << name << ", " << turns << " quarter turns";
        }
    }
}

TEST_F(ToolSamples, that_are_top_down_come_with_a_warning_from_a_pipe_that_was_asked_for) {
    const std::string input = sample("sunset-topdown.bmp").string();
    const ToolRun got = run({"-", "--source", "pipe", "-o", path("x.png")}, input);
    EXPECT_EQ(got.status, 0);
    EXPECT_EQ(got.err, "pelm-decode: standard input: warning: from a pipe the rows of a top-down file are written "
                       "upwards; use --source memory\n");
    EXPECT_EQ(run({"-", "--source", "pipe", "--quiet", "-o", path("x.png")}, input).err, "");
}

} // namespace
} // namespace pelm::test

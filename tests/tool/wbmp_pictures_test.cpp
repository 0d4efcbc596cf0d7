// WBMPs through the tool: pixels, sizes, sources, and what is refused.
#include "tests/support/wbmp_builder.h"
#include "tests/tool/run_tool.h"
#include "tests/tool/stored_pixels.h"

#include <algorithm>

namespace pelm::test {
namespace {

const std::string clear_black = "the decoder writes black as transparent; use --format rgb";

class ToolWbmp : public ToolTest {
protected:
    const std::string input = sample("sunset.wbmp").string();

    // In a format without alpha, where there is nothing to warn of.
    Image decoded(std::vector<std::string> arguments, const std::string &standard_input = "/dev/null") const {
        arguments.insert(arguments.end(), {"--format", "rgb", "-o", path("decoded.png")});
        const ToolRun got = run(arguments, standard_input);
        EXPECT_EQ(got.status, 0) << got.err;
        EXPECT_EQ(got.err, "");
        return read_png(path("decoded.png"));
    }

    Bytes raw(std::vector<std::string> arguments) const {
        arguments.insert(arguments.end(), {"--quiet", "-o", path("decoded.raw")});
        const ToolRun got = run(arguments);
        EXPECT_EQ(got.status, 0) << got.err;
        return read_file(path("decoded.raw"));
    }
};

Image flat(size_t width, size_t height, uint32_t pixel) {
    return {width, height, std::vector<uint32_t>(width * height, pixel), false};
}

WbmpFile white(size_t width, size_t height) {
    return wbmp_of(Picture(height, std::vector<uint32_t>(width, 1)));
}

TEST_F(ToolWbmp, come_out_as_they_are_stored_from_every_source) {
    const Image expected = stored_wbmp_image(read_file(input));
    EXPECT_EQ(expected.width, 320u);
    EXPECT_EQ(difference(expected, decoded({input})), "");
    for (const char *const source : {"memory", "file", "pipe"})
        EXPECT_EQ(difference(expected, decoded({input, "--source", source})), "") << source;
    EXPECT_EQ(difference(expected, decoded({"-"}, input)), "");
    for (const char *const source : {"memory", "pipe"})
        EXPECT_EQ(difference(expected, decoded({"-", "--source", source}, input)), "") << source;
    for (const char *const source : {"", "--source memory", "--source pipe"}) {
        const ToolRun got =
            shell("cat '" + input + "' | $TOOL - " + source + " --format rgb -o '" + path("x.png") + "'");
        EXPECT_EQ(got.err, "") << source;
        EXPECT_EQ(difference(expected, read_png(path("x.png"))), "") << source;
    }
}

TEST_F(ToolWbmp, have_four_formats) {
    const std::string file = write("x.wbmp", file_bytes(wbmp_of({{1, 0}})));
    const struct {
        const char *format;
        Bytes pixels;
    } cases[] = {{"rgb565", {0xFF, 0xFF, 0, 0}},
                 {"rgb", {0xFF, 0xFF, 0xFF, 0, 0, 0}},
                 {"rgba", {0xFF, 0xFF, 0xFF, 0xFF, 0, 0, 0, 0}},
                 {"bgra", {0xFF, 0xFF, 0xFF, 0xFF, 0, 0, 0, 0}}};
    for (const auto &one : cases)
        EXPECT_EQ(raw({file, "--format", one.format}), one.pixels) << one.format;
    for (const std::string format : {"argb", "rgb565a", "bgr565", "bgr", "bgrx"}) {
        expect_failure({file, "--format", format, "-o", path("x.png")}, file,
                       "the WBMP decoder does not write the format " + format);
    }
}

TEST_F(ToolWbmp, whose_black_is_transparent_come_with_a_warning) {
    for (const char *const format : {"rgba", "bgra"}) {
        const ToolRun got = run({input, "--format", format, "-o", path("x.png")});
        EXPECT_EQ(got.status, 0);
        EXPECT_EQ(got.err, "pelm-decode: " + input + ": warning: " + clear_black + "\n");
        EXPECT_EQ(run({input, "--format", format, "--box", "50x50", "-o", path("x.png")}).err, "");
        EXPECT_EQ(run({input, "--format", format, "--place", "stretch", "-o", path("x.png")}).err, "");
    }
    EXPECT_EQ(run({input, "--format", "rgb565", "-o", path("x.png")}).err, "");
}

TEST_F(ToolWbmp, are_fitted_with_the_larger_margin_left_and_above) {
    const std::string file = write("x.wbmp", file_bytes(white(4, 2)));
    Image expected = flat(7, 5, 0x204060FF);
    for (size_t y = 2; y < 4; ++y)
        std::fill_n(expected.pixels.begin() + static_cast<ptrdiff_t>(y * 7 + 2), 4, 0xFFFFFFFFu);
    EXPECT_EQ(difference(expected, decoded({file, "--box", "7x5", "--background", "204060"})), "");
    Image reduced = flat(3, 2, 0x204060FF);
    std::fill_n(reduced.pixels.begin() + 3, 3, 0xFCFCFCFFu);
    EXPECT_EQ(difference(reduced, decoded({file, "--box", "3x2", "--background", "204060"})), "");
}

TEST_F(ToolWbmp, are_stretched) {
    const std::string file = write("x.wbmp", file_bytes(white(4, 2)));
    for (const char *const more : {"--quiet", "--frame-buffer"}) {
        EXPECT_EQ(difference(flat(6, 7, 0xFCFCFCFF), decoded({file, "--box", "6x7", "--place", "stretch", more})), "")
            << more;
    }
}

TEST_F(ToolWbmp, are_placed_exactly) {
    const std::string file = write("x.wbmp", file_bytes(white(100, 33)));
    EXPECT_EQ(difference(flat(50, 16, 0xFCFCFCFF), decoded({file, "--box", "50x50", "--place", "exact"})), "");
    EXPECT_EQ(difference(flat(100, 33, 0xFFFFFFFF), decoded({file, "--box", "300x50", "--place", "exact"})), "");
    EXPECT_EQ(difference(flat(100, 33, 0xFFFFFFFF), decoded({file, "--place", "exact"})), "");
    // The same pixels as when fitted, below 21 rows of margin.
    const Image exact = decoded({input, "--box", "77x99", "--place", "exact"});
    const Image fitted = decoded({input, "--box", "77x99"});
    ASSERT_EQ(exact.width, 77u);
    ASSERT_EQ(exact.height, 57u);
    EXPECT_TRUE(std::equal(exact.pixels.begin(), exact.pixels.end(), fitted.pixels.begin() + 21 * 77));
}

TEST_F(ToolWbmp, are_never_turned) {
    for (const char *const turn : {"90", "180", "270"}) {
        expect_failure({input, "--rotate", turn, "-o", path("x.png")}, input, "the WBMP decoder does not turn images");
    }
    EXPECT_EQ(run({input, "--rotate", "0", "--format", "rgb", "-o", path("x.png")}).err, "");
}

TEST_F(ToolWbmp, are_decoded_in_one_call) {
    for (const char *const mode : {"iter", "line=3"}) {
        expect_failure({input, "--mode", mode, "-o", path("x.png")}, input, "the WBMP decoder has only --mode oneshot");
    }
}

TEST_F(ToolWbmp, are_described) {
    const ToolRun got = run({"--info", input});
    EXPECT_EQ(got.status, 0);
    EXPECT_EQ(got.out, input + ": 320x240, 1 bit per pixel, WBMP of type 0; decoded\n");
}

TEST_F(ToolWbmp, that_are_cut_are_refused_in_one_line) {
    Bytes bytes = read_file(input);
    bytes.resize(bytes.size() - 41); // a row of 40 bytes, and one more
    const std::string file = write("cut.wbmp", bytes);
    const std::string reason = "the file ends after 238 of 240 rows, and only whole WBMPs are decoded";
    for (const char *const source : {"memory", "file", "pipe"})
        expect_failure({file, "--source", source, "-o", path("x.png")}, file, reason);
    const ToolRun info = run({"--info", file});
    EXPECT_EQ(info.status, 1);
    EXPECT_EQ(info.out, file + ": 320x240, 1 bit per pixel, WBMP of type 0; refused: " + reason + "\n");
}

TEST_F(ToolWbmp, of_which_nothing_is_left_are_a_failure) {
    const std::string file = write("x.wbmp", file_bytes(white(100, 1)));
    for (const char *const place : {"fit", "exact"}) {
        expect_failure({file, "--box", "50x50", "--place", place, "-o", path("x.png")}, file,
                       "nothing is left of the image in a box of 50x50 pixels");
    }
}

TEST_F(ToolWbmp, need_little_memory) {
    // 20 bytes of header, 40 of a row, and two rows of sums.
    const std::string needed = std::to_string(20 + 40 + 2 * 4 * 320);
    EXPECT_EQ(run({input, "--format", "rgb", "--max-memory", needed, "-o", path("x.png")}).err, "");
    expect_failure({input, "--max-memory", std::to_string(20 + 40 + 2 * 4 * 320 - 1), "-o", path("y.png")}, input,
                   "the decoder needs more memory than --max-memory allows");
}

} // namespace
} // namespace pelm::test

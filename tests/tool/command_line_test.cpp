// Help, version, --info, and mistakes on the command line.
#include "tests/tool/run_tool.h"

#include <algorithm>

namespace pelm::test {
namespace {

class ToolCommandLine : public ToolTest {};

TEST_F(ToolCommandLine, help_goes_to_standard_output) {
    for (const char *const option : {"--help", "-h"}) {
        const ToolRun got = run({option});
        EXPECT_EQ(got.status, 0);
        EXPECT_EQ(got.err, "");
        for (const char *const word :
             {"Usage: pelm-decode", "--box",         "--place",      "--rotate", "--format",
              "--source",           "--mode",        "--background", "--info",   "--max-memory",
              "--deadline",         "--stats",       "--quiet",      "--frame",  "--all-frames",
              "--animate",          "--output-type", "--version",    "%n",       "%f",
              "Exit status"}) {
            EXPECT_NE(got.out.find(word), std::string::npos) << word;
        }
    }
}

TEST_F(ToolCommandLine, help_fits_a_terminal_of_120_columns) {
    const std::string help = run({"--help"}).out;
    for (size_t start = 0; start < help.size();) {
        const size_t end = std::min(help.find('\n', start), help.size());
        EXPECT_LE(end - start, 120u) << help.substr(start, end - start);
        start = end + 1;
    }
}

TEST_F(ToolCommandLine, version_goes_to_standard_output) {
    const ToolRun got = run({"--version"});
    EXPECT_EQ(got.status, 0);
    EXPECT_EQ(got.err, "");
    EXPECT_EQ(got.out.rfind("pelm-decode ", 0), 0u) << got.out;
}

TEST_F(ToolCommandLine, mistakes_are_told_in_one_line) {
    const std::string in = sample("sunset.bmp").string();
    const std::string out = path("x.png");
    const std::vector<std::string> cases[] = {
        {},
        {in},
        {"-o", out},
        {in, "-o", out, "--nonsense"},
        {in, "-o", out, "--box", "10"},
        {in, "-o", out, "--box", "0x10"},
        {in, "-o", out, "--box", "10x-1"},
        {in, "-o", out, "--box", "10x99999999999"},
        {in, "-o", out, "--place", "middle"},
        {in, "-o", out, "--rotate", "45"},
        {in, "-o", out, "--format", "cmyk"},
        {in, "-o", out, "--source", "tape"},
        {in, "-o", out, "--mode", "twice"},
        {in, "-o", out, "--mode", "line"},
        {in, "-o", out, "--mode", "line=0"},
        {in, "-o", out, "--mode", "line=x"},
        {in, "-o", out, "--mode", "skia=0"},
        {in, "-o", out, "--mode", "skia="},
        {in, "-o", out, "--mode", "skia=2147483648"},
        {in, "-o", out, "--background", "red"},
        {in, "-o", out, "--background", "12345"},
        {in, "-o", out, "--max-memory", "lots"},
        {in, "-o", out, "--max-memory", "99999999999999999M"},
        {in, "-o", out, "--deadline", "0"},
        {in, "-o", out, "--frame", "0"},
        {in, "-o", out, "--frame", "x"},
        {in, "-o", out, "--all-frames"},
        {in, "-o", "-", "--all-frames"},
        {in, "--all-frames"},
        {in, in, "-o", path("%n.png"), "--all-frames"},
        {in, in, "--animate", path("x.html")},
        {in, "-o", out, "--animate", path("x.html")},
        {in, "--info", "--animate", path("x.html")},
        {in, "--info", "--frame", "1"},
        {in, "-o", path("%n.png"), "--all-frames", "--frame", "1"},
        {in, "-o", out, "--info"},
        {in, "-o", path("x.jpg")},
        {in, "-o", path("x")},
        {in, in, "-o", out},
        {in, in, "-o", path("%f.png")},
        {in, in, "-o", "-"},
    };
    for (const auto &arguments : cases) {
        const ToolRun got = run(arguments);
        EXPECT_EQ(got.status, 1) << testing::PrintToString(arguments);
        EXPECT_EQ(got.err.rfind("pelm-decode: ", 0), 0u) << got.err;
        EXPECT_EQ(std::count(got.err.begin(), got.err.end(), '\n'), 1) << got.err;
        EXPECT_EQ(got.out, "");
    }
    EXPECT_TRUE(files().empty());
}

TEST_F(ToolCommandLine, info_describes_without_decoding) {
    const ToolRun got = run({"--info", sample("sunset.bmp").string(), sample("sunset-565.bmp").string()});
    EXPECT_EQ(got.status, 0);
    EXPECT_EQ(got.err, "");
    EXPECT_EQ(got.out,
              sample("sunset.bmp").string() +
                  ": 320x240, 24 bits per pixel, BMP with a 40-byte header, bottom-up, uncompressed; decoded\n" +
                  sample("sunset-565.bmp").string() +
                  ": 320x240, 16 bits per pixel, BMP with a 40-byte header, bottom-up, bit fields F800 07E0 "
                  "001F; decoded\n");
}

TEST_F(ToolCommandLine, info_tells_how_a_pipe_is_read) {
    BmpFile file = noise_bmp(variant_named("twenty_four_bits"), 4, 4, true);
    file.gap = Bytes(10);
    const std::string name = write("x.bmp", file);
    EXPECT_EQ(run({"--info", name}).out,
              name + ": 4x4, 24 bits per pixel, BMP with a 40-byte header, top-down, uncompressed; decoded\n");
    EXPECT_EQ(run({"--info", "-"}, name).out,
              "standard input: 4x4, 24 bits per pixel, BMP with a 40-byte header, top-down, uncompressed; decoded\n");
    EXPECT_EQ(
        run({"--info", "-", "--source", "pipe"}, name).out,
        "standard input: 4x4, 24 bits per pixel, BMP with a 40-byte header, top-down, uncompressed; decoded; note: "
        "from a pipe the rows are read at byte 54 instead of 64; use --source memory; note: from a pipe the rows "
        "of a top-down file are written upwards; use --source memory\n");
}

TEST_F(ToolCommandLine, stats_tell_time_and_memory) {
    const ToolRun got = run({sample("sunset.bmp").string(), "--stats", "-o", path("x.png")});
    EXPECT_EQ(got.status, 0);
    for (const char *const word : {" ms, ", " allocations, ", " bytes of memory at most, ", " reads\n"})
        EXPECT_NE(got.err.find(word), std::string::npos) << got.err;
}

} // namespace
} // namespace pelm::test

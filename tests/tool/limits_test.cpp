// Truncated files, and the limits that a user sets.
#include "tests/tool/run_tool.h"
#include "tests/tool/stored_pixels.h"

namespace pelm::test {
namespace {

class ToolLimits : public ToolTest {
protected:
    const std::string input = sample("sunset.bmp").string();

    // The sample with its first 100 rows only, the lowest ones.
    std::string truncated() const {
        Bytes bytes = read_file(input);
        bytes.resize(54 + 100 * 960 + 7);
        return write("truncated.bmp", bytes);
    }
};

TEST_F(ToolLimits, a_truncated_file_gives_its_rows_a_warning_and_status_2) {
    const std::string file = truncated();
    Image expected = stored_image(read_file(input));
    std::fill_n(expected.pixels.begin(), 140 * 320, 0x102030FFu);
    for (const std::string source : {"memory", "file", "pipe"}) {
        const ToolRun got = run({file, "--source", source, "--background", "102030", "-o", path("x.png")});
        EXPECT_EQ(got.status, 2) << source;
        EXPECT_EQ(got.err, "pelm-decode: " + file + ": warning: the file ends after 100 of 240 rows\n");
        EXPECT_EQ(difference(expected, read_png(path("x.png"))), "") << source;
    }
    const ToolRun info = run({"--info", file});
    EXPECT_EQ(info.status, 2);
    EXPECT_NE(info.out.find("; decoded; truncated: the file ends after 100 of 240 rows\n"), std::string::npos);
    EXPECT_EQ(run({file, "--quiet", "-o", path("x.png")}).err, "");
}

TEST_F(ToolLimits, the_worst_status_of_several_inputs_counts) {
    const std::string file = truncated();
    EXPECT_EQ(run({input, file, input, "-o", path("%n.png")}).status, 2);
    EXPECT_EQ(run({input, path("none.bmp"), file, "-o", path("%n.png")}).status, 1);
}

TEST_F(ToolLimits, a_file_without_rows_is_truncated_too) {
    Bytes bytes = read_file(input);
    bytes.resize(54);
    const std::string file = write("x.bmp", bytes);
    EXPECT_EQ(run({file, "-o", path("x.png")}).err,
              "pelm-decode: " + file + ": warning: the file ends after 0 of 240 rows\n");
}

TEST_F(ToolLimits, memory_that_does_not_suffice_is_a_failure) {
    for (const std::string limit : {"100", "1k", "2000"}) {
        expect_failure({input, "--max-memory", limit, "-o", path("x.png")}, input,
                       "the decoder needs more memory than --max-memory allows");
    }
}

// A pipe's row buffer is asked for only once the rows are read, where the library no longer reports a failure.
TEST_F(ToolLimits, memory_that_does_not_suffice_for_the_rows_of_a_pipe_is_a_failure) {
    expect_failure({input, "--source", "pipe", "--max-memory", "10k", "-o", path("x.png")}, input,
                   "the decoder needs more memory than --max-memory allows");
}

TEST_F(ToolLimits, memory_that_suffices_is_enough) {
    EXPECT_EQ(run({input, "--max-memory", "100k", "-o", path("x.png")}).status, 0);
    EXPECT_EQ(run({input, "--max-memory", "1M", "-o", path("x.png")}).status, 0);
}

TEST_F(ToolLimits, a_deadline_that_suffices_changes_nothing) {
    EXPECT_EQ(run({input, "--deadline", "60000", "-o", path("x.png")}).status, 0);
}

TEST_F(ToolLimits, a_deadline_ends_the_wait_for_an_input_that_stands_still) {
    const std::string open_pipe = "mkfifo '" + path("pipe") + "'; exec 3<>'" + path("pipe") + "'; ";
    const ToolRun got = shell(open_pipe + "timeout 20 $TOOL - --deadline 100 -o '" + path("x.png") + "' <&3");
    EXPECT_EQ(got.status, 1);
    EXPECT_EQ(got.err, "pelm-decode: standard input: not done before the deadline\n");
    EXPECT_EQ(files(), std::set<std::string>{"pipe"});
}

} // namespace
} // namespace pelm::test

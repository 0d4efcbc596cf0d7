// What goes wrong outside of the image: one line, status 1, and nothing half-written.
#include "tests/tool/image_files.h"
#include "tests/tool/run_tool.h"

#include <algorithm>
#include <csignal>

namespace pelm::test {
namespace {

using Names = std::set<std::string>;

class ToolFailures : public ToolTest {
protected:
    const std::string input = sample("sunset.bmp").string();
};

TEST_F(ToolFailures, inputs_that_cannot_be_opened) {
    expect_failure({path("none.bmp"), "-o", path("x.png")}, path("none.bmp"), "cannot read: No such file or directory");
    for (const char *const source : {"memory", "pipe"}) {
        expect_failure({path(""), "--source", source, "-o", path("x.png")}, path(""), "cannot read: Is a directory");
    }
    expect_failure({"-", "--source", "file", "-o", path("x.png")}, "standard input",
                   "--source file needs a named file; use memory or pipe");
}

TEST_F(ToolFailures, outputs_that_cannot_be_created) {
    const std::string missing = path("missing/x.png");
    expect_failure({input, "-o", missing}, input, "cannot write " + missing + ": No such file or directory");
}

TEST_F(ToolFailures, a_full_disk) {
    for (const std::string type : {"png", "ppm", "pam", "raw"}) {
        expect_failure({input, "-o", "/dev/full", "--output-type", type}, input,
                       "cannot write /dev/full: No space left on device");
    }
    const ToolRun got = shell("$TOOL '" + input + "' -o - >/dev/full");
    EXPECT_EQ(got.status, 1);
    EXPECT_EQ(got.err, "pelm-decode: " + input + ": cannot write to standard output: No space left on device\n");
}

TEST_F(ToolFailures, a_full_disk_under_help_and_info) {
    for (const std::string &arguments : {std::string("--help"), std::string("--version"), "--info " + input}) {
        const ToolRun got = shell("$TOOL " + arguments + " >/dev/full");
        EXPECT_EQ(got.status, 1) << arguments;
        EXPECT_EQ(got.err, "pelm-decode: cannot write to standard output: No space left on device\n") << arguments;
    }
}

TEST_F(ToolFailures, a_reader_that_goes_away) {
    const ToolRun got = shell("$TOOL '" + input + "' -o - --output-type raw | true; exit ${PIPESTATUS[0]}");
    EXPECT_EQ(got.status, 1);
    EXPECT_EQ(got.err, "pelm-decode: " + input + ": cannot write to standard output: Broken pipe\n");
}

TEST_F(ToolFailures, keep_what_an_output_held_before) {
    write("x.png", Bytes{1, 2, 3});
    const std::string broken = write("broken.bmp", Bytes{'B', 'M'});
    EXPECT_EQ(run({broken, "-o", path("x.png")}).status, 1);
    EXPECT_EQ(read_file(path("x.png")), (Bytes{1, 2, 3}));
}

TEST_F(ToolFailures, of_one_input_do_not_keep_the_others_from_being_decoded) {
    const std::string broken = write("broken.bmp", Bytes{'B', 'M'});
    const ToolRun got = run({broken, input, broken, "-o", path("%n.png")});
    EXPECT_EQ(got.status, 1);
    EXPECT_EQ(std::count(got.err.begin(), got.err.end(), '\n'), 2) << got.err;
    EXPECT_EQ(files(), (Names{"broken.bmp", "2.png"}));
}

// The writer of the pipe stands still; the tool is ended while it waits.
TEST_F(ToolFailures, interruptions_leave_nothing_behind_and_end_the_process_by_their_signal) {
    for (const auto &[name, number] : {std::pair("INT", SIGINT), std::pair("TERM", SIGTERM)}) {
        const ToolRun got =
            shell("mkfifo '" + path("pipe") + "'; exec 3<>'" + path("pipe") + "'; set -m; $TOOL - -o '" +
                  path("x.png") + "' <&3 & sleep 0.3; kill -" + name + " $!; wait $!");
        EXPECT_EQ(got.status, 128 + number);
        EXPECT_NE(got.err.find("pelm-decode: standard input: interrupted\n"), std::string::npos) << got.err;
        EXPECT_EQ(files(), Names{"pipe"});
        std::filesystem::remove(path("pipe"));
    }
}

TEST_F(ToolFailures, interruptions_of_a_blocked_write_leave_nothing_behind) {
    const ToolRun got = shell("mkfifo '" + path("pipe") + "'; exec 3<>'" + path("pipe") + "'; set -m; $TOOL '" + input +
                              "' -o - --output-type raw >&3 & sleep 0.3; kill -TERM $!; wait $!");
    EXPECT_EQ(got.status, 128 + SIGTERM);
    EXPECT_EQ(files(), Names{"pipe"});
}

} // namespace
} // namespace pelm::test

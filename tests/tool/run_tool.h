// Runs the built pelm-decode as a user would, in a folder of its own that goes away with the test.
#pragma once

#include <filesystem>
#include <set>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "tests/support/bmp_builder.h"

namespace pelm::test {

struct ToolRun {
    int status; // of the exit, or minus the signal that ended it
    std::string out;
    std::string err;
};

Bytes read_file(const std::filesystem::path &path); // empty when there is none
void write_file(const std::filesystem::path &path, const Bytes &bytes);
std::filesystem::path sample(const std::string &name);
std::vector<std::filesystem::path> files_with_suffix(const std::filesystem::path &folder, const std::string &suffix);
std::vector<std::filesystem::path> bmp_samples();

class ToolTest : public testing::Test {
protected:
    ToolTest();
    ~ToolTest() override;

    std::string path(const std::string &name) const { return (folder_ / name).string(); }
    std::string write(const std::string &name, const Bytes &bytes) const; // the path
    std::string write(const std::string &name, const BmpFile &file) const { return write(name, file_bytes(file)); }
    std::set<std::string> files() const; // names of what lies in the folder

    ToolRun run(const std::vector<std::string> &arguments, const std::string &standard_input = "/dev/null") const;
    // Through bash; $TOOL is the program. The status is the shell's.
    ToolRun shell(const std::string &command) const;

    // Fails with one line that tells of `input` and ends in `reason`, and leaves no file behind.
    void expect_failure(const std::vector<std::string> &arguments, const std::string &input, const std::string &reason,
                        const std::string &standard_input = "/dev/null") const;

private:
    ToolRun spawn(const std::vector<std::string> &command, const std::string &standard_input) const;

    std::filesystem::path folder_;
    std::filesystem::path captures_; // beside the folder, so that `files` does not see them
};

} // namespace pelm::test

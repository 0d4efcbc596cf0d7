#include "tests/tool/run_tool.h"

#include <algorithm>
#include <cstdlib>
#include <fstream>

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

namespace pelm::test {
namespace {

namespace fs = std::filesystem;

std::string text_of(const fs::path &path) {
    const Bytes bytes = read_file(path);
    return {bytes.begin(), bytes.end()};
}

std::vector<char *> pointers_to(std::vector<std::string> &words) {
    std::vector<char *> pointers;
    for (std::string &word : words)
        pointers.push_back(word.data());
    pointers.push_back(nullptr);
    return pointers;
}

int exit_of(pid_t process) {
    int status = 0;
    waitpid(process, &status, 0);
    return WIFSIGNALED(status) ? -WTERMSIG(status) : WEXITSTATUS(status);
}

} // namespace

Bytes read_file(const fs::path &path) {
    std::ifstream stream(path, std::ios::binary);
    return Bytes(std::istreambuf_iterator<char>(stream), {});
}

void write_file(const fs::path &path, const Bytes &bytes) {
    std::ofstream stream(path, std::ios::binary);
    stream.write(reinterpret_cast<const char *>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
}

fs::path sample(const std::string &name) {
    return fs::path(PELM_SAMPLES) / name;
}

std::vector<fs::path> files_with_suffix(const fs::path &folder, const std::string &suffix) {
    std::vector<fs::path> paths;
    std::error_code missing;
    for (const auto &entry : fs::directory_iterator(folder, missing)) {
        if (entry.path().extension() == suffix) paths.push_back(entry.path());
    }
    std::sort(paths.begin(), paths.end());
    return paths;
}

std::vector<fs::path> bmp_samples() {
    return files_with_suffix(PELM_SAMPLES, ".bmp");
}

ToolTest::ToolTest() {
    std::string name = testing::TempDir() + "/pelm-tool-XXXXXX";
    captures_ = mkdtemp(name.data());
    folder_ = captures_ / "folder";
    fs::create_directory(folder_);
    setenv("TOOL", PELM_TOOL, 1);
}

ToolTest::~ToolTest() {
    fs::remove_all(captures_);
}

std::string ToolTest::write(const std::string &name, const Bytes &bytes) const {
    write_file(path(name), bytes);
    return path(name);
}

std::set<std::string> ToolTest::files() const {
    std::set<std::string> names;
    for (const auto &entry : fs::directory_iterator(folder_))
        names.insert(entry.path().filename().string());
    return names;
}

ToolRun ToolTest::spawn(const std::vector<std::string> &command, const std::string &standard_input) const {
    std::vector<std::string> words = command;
    const std::vector<char *> pointers = pointers_to(words);
    const fs::path out = captures_ / "out";
    const fs::path err = captures_ / "err";
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, STDIN_FILENO, standard_input.c_str(), O_RDONLY, 0);
    posix_spawn_file_actions_addopen(&actions, STDOUT_FILENO, out.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    posix_spawn_file_actions_addopen(&actions, STDERR_FILENO, err.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    pid_t process = 0;
    const int error = posix_spawn(&process, pointers[0], &actions, nullptr, pointers.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    if (error != 0) return {-1, "", "cannot start " + words[0]};
    const int status = exit_of(process);
    return {status, text_of(out), text_of(err)};
}

ToolRun ToolTest::run(const std::vector<std::string> &arguments, const std::string &standard_input) const {
    std::vector<std::string> command = {PELM_TOOL};
    command.insert(command.end(), arguments.begin(), arguments.end());
    return spawn(command, standard_input);
}

ToolRun ToolTest::shell(const std::string &command) const {
    return spawn({"/bin/bash", "-c", command}, "/dev/null");
}

void ToolTest::expect_failure(const std::vector<std::string> &arguments, const std::string &input,
                              const std::string &reason, const std::string &standard_input) const {
    const std::set<std::string> before = files();
    const ToolRun got = run(arguments, standard_input);
    EXPECT_EQ(got.status, 1);
    EXPECT_EQ(got.err, "pelm-decode: " + input + ": " + reason + "\n");
    EXPECT_EQ(got.out, "");
    EXPECT_EQ(files(), before) << "a failure left files behind";
}

} // namespace pelm::test

// What a benchmark decodes: files made or read when they are wanted first, and the folder of pictures by others.
#pragma once

#include <cstdint>
#include <filesystem>
#include <functional>
#include <vector>

namespace bench {

using Bytes = std::vector<uint8_t>;

// Files that one iteration decodes, made or read when the first benchmark wants them, and kept.
class Work {
public:
    explicit Work(std::function<std::vector<Bytes>()> make) : make_(std::move(make)) {}
    const std::vector<Bytes> &files() {
        if (files_.empty()) files_ = make_();
        return files_;
    }

private:
    std::function<std::vector<Bytes>()> make_;
    std::vector<Bytes> files_;
};

std::filesystem::path image_folder(); // PELM_TEST_IMAGES, or the one beside the repository

Bytes read_file(const std::filesystem::path &path);

// Sorted, so that runs are alike. None where there is no such folder.
std::vector<std::filesystem::path> files_with_suffix(const std::filesystem::path &folder, const char *suffix);

} // namespace bench

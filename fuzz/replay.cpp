// A plain main for a target: hands it the files that are named, or that lie in the folders that are named.
#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <vector>

#include "fuzz/target.h"

namespace {

using std::filesystem::path;

std::vector<path> files_of(const path &name) {
    if (!std::filesystem::is_directory(name)) return {name};
    std::vector<path> files;
    for (const auto &entry : std::filesystem::directory_iterator(name))
        if (entry.is_regular_file()) files.push_back(entry.path());
    std::sort(files.begin(), files.end());
    return files;
}

bool replay(const path &name) {
    std::ifstream file(name, std::ios::binary);
    const std::vector<char> bytes{std::istreambuf_iterator<char>(file), {}};
    if (!file) {
        fprintf(stderr, "%s: cannot be read\n", name.c_str());
        return false;
    }
    printf("%s\n", name.c_str());
    fflush(stdout); // the one that ends the program is the last one named
    LLVMFuzzerTestOneInput(reinterpret_cast<const uint8_t *>(bytes.data()), bytes.size());
    return true;
}

} // namespace

int main(int count, char **names) {
    size_t replayed = 0;
    bool all_read = true;
    for (int i = 1; i < count; ++i) {
        for (const path &file : files_of(names[i])) {
            all_read = replay(file) && all_read;
            ++replayed;
        }
    }
    printf("%zu inputs\n", replayed);
    return all_read && replayed > 0 ? 0 : 1;
}

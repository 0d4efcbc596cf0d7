// A plain main for a target: hands it the files that are named, or that lie in the folders that are named.
// Nothing of the C++ library that is not in its headers: MemorySanitizer sees only what is compiled with it.
#define _FILE_OFFSET_BITS 64 // or a 32-bit program cannot read the folders of a 64-bit system that emulates it
#include <dirent.h>

#include <algorithm>
#include <cstdio>
#include <string>
#include <vector>

#include "fuzz/target.h"

namespace {

// A name that is no folder's stands for itself.
std::vector<std::string> files_of(const std::string &name) {
    DIR *const folder = opendir(name.c_str());
    if (folder == nullptr) return {name};
    std::vector<std::string> files;
    for (const dirent *entry = readdir(folder); entry != nullptr; entry = readdir(folder))
        if (entry->d_name[0] != '.') files.push_back(name + "/" + entry->d_name);
    closedir(folder);
    std::sort(files.begin(), files.end());
    return files;
}

bool read_file(const std::string &name, std::vector<uint8_t> &bytes) {
    FILE *const file = fopen(name.c_str(), "rb");
    if (file == nullptr) return false;
    uint8_t part[4096];
    for (size_t count = fread(part, 1, sizeof part, file); count > 0; count = fread(part, 1, sizeof part, file))
        bytes.insert(bytes.end(), part, part + count);
    const bool is_read = ferror(file) == 0;
    fclose(file);
    return is_read;
}

bool replay(const std::string &name) {
    std::vector<uint8_t> bytes;
    if (!read_file(name, bytes)) {
        fprintf(stderr, "%s: cannot be read\n", name.c_str());
        return false;
    }
    printf("%s\n", name.c_str());
    fflush(stdout); // the one that ends the program is the last one named
    LLVMFuzzerTestOneInput(bytes.data(), bytes.size());
    return true;
}

} // namespace

int main(int count, char **names) {
    size_t replayed = 0;
    bool all_read = true;
    for (int i = 1; i < count; ++i) {
        for (const std::string &file : files_of(names[i])) {
            all_read = replay(file) && all_read;
            ++replayed;
        }
    }
    printf("%zu inputs\n", replayed);
    return all_read && replayed > 0 ? 0 : 1;
}

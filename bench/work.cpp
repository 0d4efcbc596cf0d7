#include "bench/work.h"

#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <iterator>

namespace bench {

namespace fs = std::filesystem;

fs::path image_folder() {
    const char *const chosen = std::getenv("PELM_TEST_IMAGES");
    return chosen != nullptr ? chosen : PELM_SHARED_IMAGES;
}

Bytes read_file(const fs::path &path) {
    std::ifstream stream(path, std::ios::binary);
    return Bytes(std::istreambuf_iterator<char>(stream), {});
}

std::vector<fs::path> files_with_suffix(const fs::path &folder, const char *suffix) {
    std::vector<fs::path> paths;
    std::error_code missing;
    for (const auto &entry : fs::directory_iterator(folder, missing))
        if (entry.path().extension() == suffix) paths.push_back(entry.path());
    std::sort(paths.begin(), paths.end());
    return paths;
}

} // namespace bench

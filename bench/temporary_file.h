// A file with the given bytes that is gone when the program ends.
#pragma once

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <unistd.h>

#include "bench/work.h"

namespace bench {

class TemporaryFile {
public:
    TemporaryFile() = default;
    ~TemporaryFile() {
        if (!path_.empty()) std::remove(path_.c_str());
    }
    TemporaryFile(const TemporaryFile &) = delete;
    TemporaryFile &operator=(const TemporaryFile &) = delete;

    // Written at the first call.
    const std::string &path_with(const Bytes &bytes) {
        if (!path_.empty()) return path_;
        std::string name = std::filesystem::temp_directory_path() / "pelm-bench-XXXXXX";
        const int descriptor = mkstemp(name.data());
        if (descriptor < 0) return path_;
        close(descriptor);
        path_ = name;
        std::ofstream(path_, std::ios::binary)
            .write(reinterpret_cast<const char *>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
        return path_;
    }

private:
    std::string path_;
};

} // namespace bench

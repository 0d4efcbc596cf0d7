#include "tools/output_file.h"

#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <memory>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "tools/failure.h"
#include "tools/interrupt.h"

namespace pelm_tool {
namespace {

// What a symbolic link leads to, so that the file behind it is replaced and not the link. `path` itself if it leads
// nowhere.
std::string follow_links(const std::string &path) {
    const std::unique_ptr<char, decltype(&std::free)> real(realpath(path.c_str(), nullptr), std::free);
    return real ? real.get() : path;
}

mode_t usual_mode() {
    const mode_t mask = umask(0);
    umask(mask);
    return 0666 & ~mask;
}

Failure cannot_write(const std::string &path, int error) {
    return system_failure("cannot write " + (path == "-" ? std::string("to standard output") : path), error);
}

} // namespace

OutputFile::OutputFile(const std::string &path) : path_(path) {
    struct stat status = {};
    const bool exists = path != "-" && stat(path.c_str(), &status) == 0;
    if (path == "-") {
        descriptor_ = fcntl(STDOUT_FILENO, F_DUPFD_CLOEXEC, 0);
    } else if (exists && !S_ISREG(status.st_mode)) {
        descriptor_ = open(path.c_str(), O_WRONLY | O_CLOEXEC);
    } else {
        path_ = follow_links(path);
        open_temporary(exists ? status.st_mode & 0777 : usual_mode());
    }
    if (descriptor_ < 0) throw cannot_write(path, errno);
}

void OutputFile::open_temporary(unsigned mode) {
    std::string name = path_ + ".XXXXXX";
    descriptor_ = mkostemp(name.data(), O_CLOEXEC);
    if (descriptor_ < 0) return;
    temporary_ = name;
    // Where the file system knows no permissions, the file is as it is.
    static_cast<void>(fchmod(descriptor_, mode));
}

OutputFile::~OutputFile() {
    if (descriptor_ >= 0) close(descriptor_);
    if (!temporary_.empty()) unlink(temporary_.c_str());
}

void OutputFile::write(const void *bytes, size_t size) {
    const auto *from = static_cast<const uint8_t *>(bytes);
    while (size > 0) {
        throw_if_interrupted();
        const ssize_t written = ::write(descriptor_, from, size);
        if (written < 0 && errno != EINTR) throw cannot_write(path_, errno);
        if (written <= 0) continue;
        from += written;
        size -= static_cast<size_t>(written);
    }
}

void OutputFile::finish() {
    if (descriptor_ < 0) return;
    const int descriptor = descriptor_;
    descriptor_ = -1;
    if (close(descriptor) != 0 && errno != EINTR) throw cannot_write(path_, errno);
}

void OutputFile::commit() {
    finish();
    if (temporary_.empty()) return;
    if (std::rename(temporary_.c_str(), path_.c_str()) != 0) throw cannot_write(path_, errno);
    temporary_.clear();
}

} // namespace pelm_tool

// Sources, controls, pipes and files that clean up after themselves, and a few ways to read.
#pragma once

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <string_view>
#include <thread>

#include <fcntl.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include "PelmHost.h"

namespace pelm::host_test {

constexpr int32_t unknown_size = 0x7FFFFFFF;

// Filled with rubbish, which openers have to cope with.
struct Source : InputSource {
    Source() {
        memset(static_cast<InputSource *>(this), 0xA5, sizeof(InputSource));
        kind = PELM_SOURCE_STREAM;
        hostContext = nullptr;
    }
    ~Source() { PelmHost_Close(this); }
    Source(const Source &) = delete;
    Source &operator=(const Source &) = delete;
};

inline bool is_zeroed(const InputSource &source) {
    return source.kind == 0 && source.data == nullptr && source.hostContext == nullptr && source.size == 0 &&
           source.consumed == 0 && source.hostPosition == 0 && source.bufferSize == 0;
}

// The bytes that one read delivers.
inline std::string read_some(InputSource &source, int32_t count) {
    std::string bytes(static_cast<size_t>(count), '?');
    const int32_t got = ZOTARPELM_Read_IO(&source, bytes.data(), count);
    bytes.resize(got > 0 ? static_cast<size_t>(got) : 0);
    return bytes;
}

inline int32_t read_result(InputSource &source, int32_t count = 1) {
    std::string bytes(static_cast<size_t>(count), '?');
    return ZOTARPELM_Read_IO(&source, bytes.data(), count);
}

inline std::string read_all(InputSource &source, int32_t step) {
    std::string all;
    for (;;) {
        const std::string piece = read_some(source, step);
        if (piece.empty()) return all;
        all += piece;
    }
}

inline std::string numbered_bytes(size_t count) {
    std::string bytes(count, '\0');
    for (size_t i = 0; i < count; ++i)
        bytes[i] = static_cast<char>(i * 7 + i / 251);
    return bytes;
}

inline void *writable(std::string &bytes) {
    return bytes.data();
}

// Installed nowhere at first; taken out everywhere at the end.
class Control {
public:
    Control() : control_(PelmHost_NewControl()) {}
    ~Control() {
        PelmHost_UseForThread(nullptr);
        PelmHost_UseForProcess(nullptr);
        PelmHost_ReleaseControl(control_);
    }
    Control(const Control &) = delete;
    Control &operator=(const Control &) = delete;
    operator PelmHostControl *() const { return control_; }
    PelmHostCounters counters() const {
        PelmHostCounters counters;
        PelmHost_GetCounters(control_, &counters);
        return counters;
    }

private:
    PelmHostControl *control_;
};

inline void pause_briefly() {
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
}

inline void let_deadline_pass(PelmHostControl *control) {
    PelmHost_SetDeadline(control, 1);
    while (PelmHost_StopReason(control) == 0)
        pause_briefly();
}

class Pipe {
public:
    explicit Pipe(int flags = 0) { EXPECT_EQ(pipe2(ends_, O_CLOEXEC | flags), 0); }
    ~Pipe() {
        close(ends_[0]);
        close_writer();
    }
    Pipe(const Pipe &) = delete;
    Pipe &operator=(const Pipe &) = delete;

    int reader() const { return ends_[0]; }
    int writer() const { return ends_[1]; }
    void write_bytes(std::string_view bytes) const {
        EXPECT_EQ(write(ends_[1], bytes.data(), bytes.size()), static_cast<ssize_t>(bytes.size()));
    }
    void close_writer() {
        if (ends_[1] >= 0) close(ends_[1]);
        ends_[1] = -1;
    }

private:
    int ends_[2] = {-1, -1};
};

// Writes to a pipe a few bytes at a time, then closes it.
class DribblingWriter {
public:
    DribblingWriter(Pipe &pipe, std::string bytes)
        : thread_([&pipe, bytes = std::move(bytes)] {
              const std::string_view all = bytes;
              for (size_t at = 0, step = 1; at < all.size(); at += step, step = step % 5 + 1) {
                  pipe.write_bytes(all.substr(at, step = std::min(step, all.size() - at)));
                  pause_briefly();
              }
              pipe.close_writer();
          }) {}
    ~DribblingWriter() { thread_.join(); }

private:
    std::thread thread_;
};

class TemporaryFile {
public:
    explicit TemporaryFile(std::string_view contents) : path_(testing::TempDir() + "pelm_host_XXXXXX") {
        descriptor_ = mkstemp(path_.data());
        EXPECT_GE(descriptor_, 0);
        EXPECT_EQ(write(descriptor_, contents.data(), contents.size()), static_cast<ssize_t>(contents.size()));
    }
    ~TemporaryFile() {
        close(descriptor_);
        unlink(path_.c_str());
    }
    TemporaryFile(const TemporaryFile &) = delete;
    TemporaryFile &operator=(const TemporaryFile &) = delete;
    const char *path() const { return path_.c_str(); }
    void resize(int64_t size) const { EXPECT_EQ(ftruncate(descriptor_, off_t{size}), 0); }
    void overwrite_last_byte(int64_t size, char byte) const {
        EXPECT_EQ(pwrite(descriptor_, &byte, 1, off_t{size - 1}), 1);
    }

private:
    std::string path_;
    int descriptor_ = -1;
};

// The number of the next descriptor: it stays the same where none is left open.
inline int next_descriptor() {
    const int descriptor = open("/dev/null", O_RDONLY | O_CLOEXEC);
    close(descriptor);
    return descriptor;
}

} // namespace pelm::host_test

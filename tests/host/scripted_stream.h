// A stdio stream that plays a script: pieces of bytes, errors, and an end that later reads would get past.
#pragma once

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <utility>
#include <vector>

namespace pelm::host_test {

constexpr int no_reason = -1; // a failure that leaves errno at 0

// One answer of the stream: bytes, an errno value when there are none, or an end when there is neither.
struct Answer {
    std::string bytes;
    int error = 0;
};

class ScriptedStream {
public:
    explicit ScriptedStream(std::vector<Answer> answers) : answers_(std::move(answers)) {
        file_ = fopencookie(this, "r", {play, nullptr, nullptr, nullptr});
    }
    ~ScriptedStream() { fclose(file_); }
    ScriptedStream(const ScriptedStream &) = delete;
    ScriptedStream &operator=(const ScriptedStream &) = delete;
    FILE *file() const { return file_; }

private:
    static ssize_t play(void *cookie, char *to, size_t room) {
        auto &self = *static_cast<ScriptedStream *>(cookie);
        if (self.next_ == self.answers_.size()) return 0;
        const Answer &answer = self.answers_[self.next_++];
        if (answer.error != 0) {
            errno = answer.error == no_reason ? 0 : answer.error;
            return -1;
        }
        if (answer.bytes.size() > room) abort();
        memcpy(to, answer.bytes.data(), answer.bytes.size());
        return static_cast<ssize_t>(answer.bytes.size());
    }

    std::vector<Answer> answers_;
    size_t next_ = 0;
    FILE *file_;
};

} // namespace pelm::host_test

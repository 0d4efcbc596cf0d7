// Opens what the user named as an input of the library, and looks at its first bytes.
#pragma once

#include <string>
#include <vector>

#include "PelmHost.h"
#include "tools/bytes.h"

namespace pelm_tool {

enum class SourceChoice { automatic, memory, file, pipe };

class Input {
public:
    Input(const std::string &name, SourceChoice choice); // "-" is standard input; throws Failure
    ~Input();
    Input(const Input &) = delete;
    Input &operator=(const Input &) = delete;

    InputSource *source() { return &source_; }
    Bytes head() const { return head_; } // the first `described_bytes`, or the whole of a shorter file
    int64_t size() const { return source_.size; }

private:
    void read_head(); // throws Failure

    InputSource source_ = {};
    std::vector<uint8_t> head_;
};

// How messages call it.
std::string shown_name(const std::string &name);

} // namespace pelm_tool

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

    // Where the choice was automatic: makes it a memory source, or leaves it the file or pipe that it is. The bytes of
    // a pipe are given front to back, or with `needs_seeks` in any order. Throws Failure.
    void settle(bool in_memory, bool needs_seeks);

    InputSource *source() { return is_viewed_ ? &view_ : &source_; }
    Bytes head() const { return head_; } // the first `described_bytes`, or the whole of a shorter file
    int64_t size() const { return source_.size; }

    std::vector<uint8_t> all_bytes(); // leaves the source at its end
    void throw_if_unreadable();       // Failure, when the last read failed

private:
    void open();      // throws Failure
    void read_head(); // throws Failure

    std::string name_;
    SourceChoice choice_;
    InputSource source_ = {};
    InputSource view_ = {}; // of a spooled pipe's bytes, as a pipe
    bool is_viewed_ = false;
    std::vector<uint8_t> head_;
};

// How messages call it.
std::string shown_name(const std::string &name);

} // namespace pelm_tool

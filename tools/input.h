// Opens what the user named as an input of the library, and looks at its first bytes.
#pragma once

#include <string>
#include <vector>

#include "PelmHost.h"
#include "tools/bytes.h"

namespace pelm_tool {

enum class SourceChoice { automatic, memory, file, pipe };

// How a decoder reads a pipe, all of whose bytes are there.
enum class PipeUse {
    front_to_back,
    front_to_back_if_asked, // and from memory otherwise
    with_seeks
};

class Input {
public:
    Input(const std::string &name, SourceChoice choice); // "-" is standard input; throws Failure
    ~Input();
    Input(const Input &) = delete;
    Input &operator=(const Input &) = delete;

    // Where the choice was automatic: makes it a memory source, or leaves it the file or pipe that it is, with the
    // bytes of the latter as the decoder reads them. Throws Failure.
    void settle(bool in_memory, PipeUse use);

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

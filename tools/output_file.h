// A file that appears whole or not at all: it is written under a passing name in the same folder and takes its real
// name at the end. Devices, pipes and standard output ("-") are written directly.
#pragma once

#include <cstddef>
#include <string>

#include "tools/output.h"

namespace pelm_tool {

class OutputFile final : public Output {
public:
    explicit OutputFile(const std::string &path); // throws Failure
    ~OutputFile();                                // without commit, nothing stays behind
    OutputFile(const OutputFile &) = delete;
    OutputFile &operator=(const OutputFile &) = delete;

    void write(const void *bytes, size_t size) override; // throws Failure
    // Nothing may be written after either; both throw Failure. Many files can wait finished until all of them are
    // committed.
    void finish();
    void commit();

private:
    void open_temporary(unsigned mode);

    std::string path_;
    std::string temporary_; // empty: written directly
    int descriptor_ = -1;   // not a stdio stream: closing one would try again to write what could not be written
};

} // namespace pelm_tool

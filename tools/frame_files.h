// The files of an animation's frames: all of them appear, or none.
#pragma once

#include <list>

#include "tools/output_file.h"
#include "tools/output_names.h"
#include "tools/pixels.h"

namespace pelm_tool {

void write_picture(Output &output, const Picture &picture, OutputType type); // throws Failure

class FrameFiles {
public:
    explicit FrameFiles(const Options &options) : options_(options) {}

    void add(const Picture &picture, size_t index); // throws Failure
    void commit();                                  // throws Failure

private:
    const Options &options_;
    std::list<OutputFile> files_; // finished, under their passing names
};

} // namespace pelm_tool

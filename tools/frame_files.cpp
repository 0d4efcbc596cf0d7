#include "tools/frame_files.h"

#include "tools/writers.h"

namespace pelm_tool {

void write_picture(Output &output, const Picture &picture, OutputType type) {
    switch (type) {
    case OutputType::png: write_png(output, picture); break;
    case OutputType::ppm: write_ppm(output, picture); break;
    case OutputType::pam: write_pam(output, picture); break;
    case OutputType::raw: write_raw(output, picture); break;
    }
}

void FrameFiles::add(const Picture &picture, size_t index) {
    const OutputName name = frame_output_name(options_, index);
    OutputFile &file = files_.emplace_back(name.path);
    write_picture(file, picture, name.type);
    file.finish();
}

void FrameFiles::commit() {
    for (OutputFile &file : files_)
        file.commit();
}

} // namespace pelm_tool

// One writer per kind of output file. Each writes a whole file into `output` and throws Failure; none commits it.
#pragma once

#include "tools/output_file.h"
#include "tools/pixels.h"

namespace pelm_tool {

void write_png(OutputFile &output, const Picture &picture);
void write_ppm(OutputFile &output, const Picture &picture); // alpha is dropped
void write_pam(OutputFile &output, const Picture &picture);
void write_raw(OutputFile &output, const Picture &picture); // the library's bytes as they are

} // namespace pelm_tool

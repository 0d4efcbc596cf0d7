// One writer per kind of output file. Each writes a whole file into `output` and throws Failure.
#pragma once

#include "tools/output.h"
#include "tools/pixels.h"

namespace pelm_tool {

void write_png(Output &output, const Picture &picture);
void write_ppm(Output &output, const Picture &picture); // alpha is dropped
void write_pam(Output &output, const Picture &picture);
void write_raw(Output &output, const Picture &picture); // the library's bytes as they are

} // namespace pelm_tool

// The most that a decode may ask its host for, by docs/formats.md, from the bytes of the file.
#pragma once

#include "tests/sweeps/decodes.h"

namespace pelm::sweeps {

// Everything that may be alive at once, refused or not. `info` is the request after the decode.
uint64_t memory_limit(const Decode &decode, const Setting &setting, const Bytes &file, const ImageDecodeInfo &info);

} // namespace pelm::sweeps

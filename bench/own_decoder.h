// This library, called as a host does it.
#pragma once

#include <string>

#include "bench/output.h"
#include "bench/work.h"

namespace bench {

using Call = int32_t (*)(ImageDecodeInfo *info, void *output, int32_t width, int32_t height);

struct Request {
    Call call;
    Format format;
    Box box;
    uint32_t flags = PELM_PLACE_FIT;
};

bool decode_memory(const Request &request, const Bytes &file, uint8_t *output);

// All frames, one after the other into the same buffer.
bool play_memory(const Request &request, const Bytes &file, uint8_t *output);

// From a file, by reads of 16 KB.
bool decode_stream(const Request &request, const std::string &path, uint8_t *output);

} // namespace bench

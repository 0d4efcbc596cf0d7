#include "bench/own_decoder.h"

#include "PelmAnimation.h"
#include "PelmHost.h"

namespace bench {
namespace {

ImageDecodeInfo info_for(const Request &request, InputSource &source) {
    ImageDecodeInfo info{};
    info.input = &source;
    info.outputFormat = request.format.code;
    info.flags = request.flags;
    return info;
}

int32_t decode(const Request &request, ImageDecodeInfo &info, uint8_t *output) {
    return request.call(&info, output, request.box.width, request.box.height);
}

// PNG joins image data in the file's memory: every decode gets a fresh copy, as a host would make it.
bool open_memory(const Request &request, const Bytes &file, InputSource &source) {
    static Bytes copy;
    uint8_t *bytes = const_cast<uint8_t *>(file.data());
    if (request.call == ZOTARPELMI_DecodePNG) {
        copy.assign(file.begin(), file.end());
        bytes = copy.data();
    }
    return PelmHost_OpenMemory(&source, PELM_SOURCE_MEMORY, bytes, static_cast<int32_t>(file.size())) == 0;
}

} // namespace

bool decode_memory(const Request &request, const Bytes &file, uint8_t *output) {
    InputSource source;
    if (!open_memory(request, file, source)) return false;
    ImageDecodeInfo info = info_for(request, source);
    const int32_t result = decode(request, info, output);
    PelmHost_Close(&source);
    return result == PELM_RESULT_DONE;
}

bool play_memory(const Request &request, const Bytes &file, uint8_t *output) {
    InputSource source;
    if (!open_memory(request, file, source)) return false;
    ImageDecodeInfo info = info_for(request, source);
    int32_t result = PELM_RESULT_DONE;
    while (result == PELM_RESULT_DONE)
        result = decode(request, info, output);
    PelmAnimation_Restart(&info, ZOTARPELMI_AborAGIF);
    PelmHost_Close(&source);
    return result == PELM_RESULT_LAST_FRAME;
}

bool decode_stream(const Request &request, const std::string &path, uint8_t *output) {
    InputSource source;
    if (PelmHost_OpenFile(&source, path.c_str(), 16384) != 0) return false;
    ImageDecodeInfo info = info_for(request, source);
    const int32_t result = decode(request, info, output);
    PelmHost_Close(&source);
    return result == PELM_RESULT_DONE;
}

} // namespace bench

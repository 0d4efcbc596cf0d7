#include "tests/support/two_step.h"

namespace pelm::test {

void give_staging(InputSource &source) {
    if (source.kind != PELM_SOURCE_STREAM && source.kind != PELM_SOURCE_STREAM_ALT) return;
    source.data = static_cast<uint8_t *>(TestHost::get().allocate(static_cast<uint32_t>(source.bufferSize)));
}

BmpCalls two_steps(const BmpRequest &request, int32_t divisor) {
    return [request, divisor](ImageDecodeInfo &info, uint8_t *output) {
        const ImageDecodeInfo before = info;
        if (ZOTARPELMI_PreInitBMP(&info, divisor) != PELM_RESULT_DONE) return 0;
        info.imageWidth = before.imageWidth;
        info.imageHeight = before.imageHeight;
        info.preInitMode = before.preInitMode;
        give_staging(*info.input);
        return ZOTARPELMI_DecodeBMPSKIA(&info, output, request.box_width, request.box_height);
    };
}

} // namespace pelm::test

// The public PNG calls: which result of the driver means what to a host.
#include "png/driver.h"
#include "png/entry.h"

namespace {

using pelm::CallStyle;

int32_t decode(ImageDecodeInfo *info, void *output, int32_t boxWidth, int32_t boxHeight, int32_t rows,
               CallStyle style) {
    info->decodeStarted = 1;
    info->iterative = style == CallStyle::iterative ? 1 : 0;
    switch (pelm::drive_png(*info, output, boxWidth, boxHeight, rows, style)) {
    case PNG_DONE: return PELM_RESULT_DONE;
    case PNG_ROWS_REMAIN:
        if (style != CallStyle::one_shot) return PELM_RESULT_MORE;
        break;
    default: break;
    }
    PELMI_DestroyDecodePng(info);
    return PELM_RESULT_FAILED;
}

} // namespace

int32_t ZOTARPELMI_DecodePNG(ImageDecodeInfo *info, void *output, int32_t boxWidth, int32_t boxHeight) {
    if (info == nullptr) return PELM_RESULT_FAILED;
    return decode(info, output, boxWidth, boxHeight, info->imageHeight, CallStyle::one_shot);
}

int32_t ZOTARPELMI_DecodePNGIter(ImageDecodeInfo *info, void *output, int32_t boxWidth, int32_t boxHeight) {
    if (info == nullptr) return PELM_RESULT_FAILED;
    return decode(info, output, boxWidth, boxHeight, 0, CallStyle::iterative);
}

int32_t ZOTARPELMI_DecodePNGLine(ImageDecodeInfo *info, void *output, int32_t boxWidth, int32_t boxHeight,
                                 int32_t rows) {
    if (info == nullptr) return PELM_RESULT_FAILED;
    return decode(info, output, boxWidth, boxHeight, rows, CallStyle::line);
}

int32_t ZOTARPELMI_DestroyPNGInfo(ImageDecodeInfo *info) {
    if (info == nullptr) return PELM_RESULT_FAILED;
    return static_cast<int32_t>(PELMI_DestroyDecodePng(info));
}

int32_t ZOTARPELMI_AbortPNGIter(ImageDecodeInfo *info) {
    return ZOTARPELMI_DestroyPNGInfo(info);
}

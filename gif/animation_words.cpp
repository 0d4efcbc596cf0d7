// The request's animated-GIF words, for callers that know the request only as a handle.
#include "frame/export.h"

uint32_t ZOTARPELMI_GetAGIFDelayTime(const ImageDecodeInfo *info) {
    return info == nullptr ? 0 : info->frameDelay;
}

uint32_t ZOTARPELMI_GetAGIFColorTableState(const ImageDecodeInfo *info) {
    return info == nullptr ? 0 : info->colorTableState;
}

void *ZOTARPELMI_GetAGIFGlobalColorTable(const ImageDecodeInfo *info) {
    return info == nullptr ? nullptr : info->globalColorTable;
}

void *ZOTARPELMI_GetAGIFLocalColorTable(const ImageDecodeInfo *info) {
    return info == nullptr ? nullptr : info->localColorTable;
}

// Beginning an animation again. What the request owns goes back to the memory service that the decoder took it from.
#include "PelmAnimation.h"
#include "PelmHost.h"

namespace {

void free_and_clear(void *&block) {
    if (block != nullptr) ZOTARPELM_OsFree(block);
    block = nullptr;
}

} // namespace

void PelmAnimation_Restart(ImageDecodeInfo *info, int32_t (*abortDecode)(ImageDecodeInfo *info)) {
    if (info == nullptr) return;
    if (abortDecode != nullptr) abortDecode(info);
    free_and_clear(info->globalColorTable);
    free_and_clear(info->localColorTable);
}

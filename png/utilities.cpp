// Exported utilities that the decoder itself does not call.
#include "frame/host.h"
#include "png/chunks.h"
#include "png/entry.h"

namespace {

constexpr uint32_t alpha_colour_type = 4; // bit of the colour type

void free_block(void *block) {
    if (block != nullptr) ZOTARPELM_OsFree(block);
}

} // namespace

uint32_t PELMI_GetAlphaTrFlag(ImageDecodeInfo *info) {
    if (info == nullptr || !pelm::is_readable(info->input)) return 0;
    PngInputBuffer reader{};
    if (!pelm::open_reader(reader, *info->input)) return 0;
    auto *const state = static_cast<PngDecodeState *>(ZOTARPELM_OsMalloc(sizeof(PngDecodeState)));
    // Required: without memory for the record the read buffer is not freed, and otherwise only for kind 0
    // (docs/oddities.md, "PELMI_GetAlphaTrFlag leaks").
    if (state == nullptr) return 0;
    ZOTARPELM_OsMemset(state, 0, sizeof(PngDecodeState));

    __PELMI_PngParserMain(state, &reader);
    const bool has_alpha = (state->colourType & alpha_colour_type) != 0;
    const uint32_t answer = has_alpha || (state->ancillaryFlags & PNG_HAS_TRNS) != 0 ? 1 : 0;
    free_block(state->paletteAlpha);
    free_block(state->palette);
    free_block(state->idatTable);
    ZOTARPELM_OsFree(state);
    if (info->input->kind == PELM_SOURCE_STREAM) ZOTARPELM_OsFree(reader.data);
    return answer;
}

PngTrInfo *PELMI_FastImgCreatePngTrInfo() {
    auto *const record = static_cast<PngTrInfo *>(ZOTARPELM_OsMalloc(sizeof(PngTrInfo)));
    if (record != nullptr) ZOTARPELM_OsMemset(record, 0, sizeof(PngTrInfo));
    return record;
}

int32_t PELMI_FastImgDestroyPngTrInfo(PngTrInfo *record) {
    if (record->ownsBlock != 0) free_block(record->block);
    ZOTARPELM_OsFree(record);
    return 1;
}

void __PELMI_PngFreeTextList(PngTextNode **head) {
    PngTextNode *node = *head;
    while (node != nullptr) {
        PngTextNode *const next = node->next;
        free_block(node->text);
        node->text = nullptr;
        ZOTARPELM_OsFree(node);
        node = next;
    }
}

// Exported utilities that the decoder itself does not call.
#include "frame/memory.h"
#include "png/chunks.h"
#include "png/entry.h"

namespace {

constexpr uint32_t alpha_colour_type = 4; // bit of the colour type

} // namespace

uint32_t PELMI_GetAlphaTrFlag(ImageDecodeInfo *info) {
    if (info == nullptr || !pelm::is_readable(info->input)) return 0;
    PngInputBuffer reader{};
    if (!pelm::open_reader(reader, *info->input)) return 0;
    auto *state = pelm::new_record<PngDecodeState>();
    // Required: without memory for the record the read buffer is not freed, and otherwise only for kind 0
    // (docs/oddities.md, "PELMI_GetAlphaTrFlag leaks").
    if (state == nullptr) return 0;

    __PELMI_PngParserMain(state, &reader);
    const bool has_alpha = (state->colourType & alpha_colour_type) != 0;
    const uint32_t answer = has_alpha || (state->ancillaryFlags & PNG_HAS_TRNS) != 0 ? 1 : 0;
    pelm::free_block(state->paletteAlpha);
    pelm::free_block(state->palette);
    pelm::free_block(state->idatTable);
    pelm::free_block(state);
    if (info->input->kind == PELM_SOURCE_STREAM) pelm::free_block(reader.data);
    return answer;
}

PngTrInfo *PELMI_FastImgCreatePngTrInfo() {
    return pelm::new_record<PngTrInfo>();
}

int32_t PELMI_FastImgDestroyPngTrInfo(PngTrInfo *record) {
    if (record->ownsBlock != 0) pelm::free_block(record->block);
    pelm::free_block(record);
    return 1;
}

void __PELMI_PngFreeTextList(PngTextNode **head) {
    PngTextNode *node = *head;
    while (node != nullptr) {
        PngTextNode *const next = node->next;
        pelm::free_block(node->text);
        pelm::free_block(node);
        node = next;
    }
}

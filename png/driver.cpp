// The driver that the public calls share: sets a decode up on its first call, goes on with it on later ones.
#include "png/driver.h"
#include "frame/memory.h"
#include "frame/placement.h"
#include "png/chunks.h"
#include "png/entry.h"
#include "png/image_data.h"
#include "png/placing.h"

namespace pelm {
namespace {

bool make_reader(PngDecodeState &state, InputSource &source) {
    state.input = new_record<PngInputBuffer>();
    state.readsMemory = source.kind == PELM_SOURCE_MEMORY ? 1 : 0;
    return state.input != nullptr && open_reader(*state.input, source);
}

// Not checked: without them nothing is written, and the result stays.
void allocate_accumulators(PngDecodeState &state) {
    state.resizeRowAccum = allocate_array<uint32_t>(state.imageWidth);
    state.resizeOutAccum = allocate_array<uint32_t>(state.scaledWidth);
    if (state.resizeOutAccum != nullptr) ZOTARPELM_OsMemset(state.resizeOutAccum, 0, state.scaledWidth * 4);
}

// PNG_ROWS_REMAIN when there is an image to decode; otherwise the driver's result, with the state gone.
uint32_t set_up(ImageDecodeInfo &info, int32_t boxWidth, int32_t boxHeight) {
    if (!is_readable(info.input)) return PNG_NO_MEMORY;
    auto *const state = new_record<PngDecodeState>();
    if (state == nullptr) return PNG_NO_MEMORY;
    info.decoderState = state;
    state->rotationDegrees = static_cast<uint32_t>(rotation_of(info.flags));
    state->iterativeMode = info.iterative;
    const bool parsed = make_reader(*state, *info.input) && __PELMI_PngParserMain(state, state->input) == PNG_DONE &&
                        state->imageWidth != 0 && state->imageHeight != 0;
    if (!parsed) {
        PELMI_DestroyDecodePng(&info);
        return PNG_NO_MEMORY;
    }
    state->wholeWidth = state->imageWidth;
    state->wholeHeight = state->imageHeight;
    scale_png(*state, info.flags, info.decodeStarted, boxWidth, boxHeight);
    info.outputWidth = static_cast<int32_t>(state->scaledWidth);
    info.outputHeight = static_cast<int32_t>(state->scaledHeight);
    // Required: nothing to show is a success (docs/oddities.md, "Nothing left of the image").
    if (state->scaledWidth == 0 || state->scaledHeight == 0) {
        PELMI_DestroyDecodePng(&info);
        return PNG_DONE;
    }
    const bool interlaced = state->interlaceMethod != 0;
    if (!interlaced) allocate_accumulators(*state);
    state->outputFormat = info.outputFormat;
    place_png(*state, info.flags, boxWidth, boxHeight);
    if (interlaced && (info.flags & PELM_INTERLACE_MASK) == PELM_INTERLACE_FRAME) {
        state->interlaceFrame =
            allocate_array<uint32_t>(uint64_t{state->scaledWidth} * state->scaledHeight); // not checked either
        state->interlaceFrameUsed = 1;
    }
    return PNG_ROWS_REMAIN;
}

// False when the source cannot be the one that the decode began with.
bool come_back(ImageDecodeInfo &info, PngDecodeState &state) {
    if (!is_readable(info.input)) return false;
    if ((info.input->kind == PELM_SOURCE_MEMORY) != (state.readsMemory != 0)) return false;
    state.iterativeMode = info.iterative;
    state.outputCursor = 0;
    state.input->source = info.input;
    return true;
}

uint32_t run_loop(ImageDecodeInfo &info, PngDecodeState &state) {
    uint32_t total = 0;
    const int64_t area = area_position(state);
    const uint32_t *const width = &state.scaledWidth;
    const uint32_t *const height = &state.scaledHeight;
    const bool interlaced = state.interlaceMethod != 0;
    if (state.readsMemory != 0)
        return interlaced ? _PELMI_PngInflateZStreamDataInterlaced(&info, &total, 0, area, width, height)
                          : _PELMI_PngInflateZStreamData(&info, &total, 0, area, width, height);
    return interlaced
               ? _PELMI_PngInflateZStreamDataInterlaced_streamming(&info, state.input, &total, 0, area, width, height)
               : _PELMI_PngInflateZStreamData_streamming(&info, state.input, &total, 0, area, width, height);
}

} // namespace

uint32_t drive_png(ImageDecodeInfo &info, void *output, int32_t boxWidth, int32_t boxHeight, int32_t rows,
                   CallStyle style) {
    if (info.decoderState == nullptr) {
        const uint32_t code = set_up(info, boxWidth, boxHeight);
        if (code != PNG_ROWS_REMAIN) return code;
    } else if (!come_back(info, *static_cast<PngDecodeState *>(info.decoderState))) {
        PELMI_DestroyDecodePng(&info);
        return PNG_NO_MEMORY;
    }

    PngDecodeState &state = *static_cast<PngDecodeState *>(info.decoderState);
    if (state.interlaceMethod != 0 && rows != 0 && rows != info.imageHeight) {
        PELMI_DestroyDecodePng(&info); // passes cannot be decoded by lines
        return PNG_BAD_LINE_REQUEST;
    }
    use_output(state, output, boxWidth, boxHeight);
    // A negative number lies behind the rows done, or far ahead of the last one: nothing stops there.
    if (rows != 0) state.stopRow = state.rowsDone + static_cast<uint32_t>(rows);
    state.firstRowOfCall = state.rowsDone;
    state.bandBase = style == CallStyle::line ? state.firstRowOfCall : 0;
    const uint32_t code = run_loop(info, state);
    switch (code) {
    case PNG_ROWS_REMAIN: return code;
    case PNG_ENDED_EARLY: return PNG_DONE; // the rows before the bad code are the result
    default: PELMI_DestroyDecodePng(&info); return code;
    }
}

} // namespace pelm

uint32_t PELMI_FastImgDecodePng(ImageDecodeInfo *info, void *output, int32_t boxWidth, int32_t boxHeight,
                                int32_t rows) {
    if (info == nullptr) return PNG_NO_MEMORY;
    const pelm::CallStyle style = info->iterative != 0 ? pelm::CallStyle::iterative : pelm::CallStyle::line;
    return pelm::drive_png(*info, output, boxWidth, boxHeight, rows, style);
}

uint32_t PELMI_DestroyDecodePng(ImageDecodeInfo *info) {
    using pelm::free_block;
    if (info == nullptr) return 1;
    auto *state = static_cast<PngDecodeState *>(info->decoderState);
    if (state == nullptr) return 1;
    free_block(state->rowBuffers);
    free_block(state->inflate.window.bytes);
    free_block(state->zeroRow);
    free_block(state->inflate.dynamic);
    PELMI_FreePNGHuffmanMemory(&state->fixedHuffmanPool);
    PELMI_FreePNGHuffmanMemory(&state->dynamicHuffmanPool);
    if (state->input != nullptr && state->readsMemory == 0) free_block(state->input->data);
    free_block(state->input);
    free_block(state->paletteAlpha);
    free_block(state->palette);
    free_block(state->resizeRowAccum);
    free_block(state->resizeOutAccum);
    free_block(state->interlaceFrame);
    free_block(state->idatTable);
    free_block(state);
    info->decoderState = nullptr;
    return 1;
}

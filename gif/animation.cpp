// Animations: one composed frame of the whole screen after the other, at once or in slices.
#include "frame/host.h"
#include "frame/memory.h"
#include "frame/placement.h"
#include "gif/working.h"

namespace pelm {
namespace {

constexpr uint32_t raw_table_bytes = 1024;

void *new_raw_table() {
    void *const table = allocate(raw_table_bytes);
    if (table != nullptr) ZOTARPELM_OsMemset(table, 0, raw_table_bytes);
    return table;
}

int32_t end(ImageDecodeInfo &info, GifDecoderState *state, int32_t result) {
    PELMI_DelGIFDecoderInfo(state);
    info.decoderState = nullptr;
    return result;
}

// Screen rows outside the frame, from the canvas.
void write_canvas_rows(GifDecoderState &state, int32_t from, int32_t behind) {
    for (int32_t row = from; row < behind && row < state.screenHeight; ++row) {
        state.sourceRow = row;
        state.canvasRow = state.canvas + static_cast<ptrdiff_t>(row) * state.screenWidth;
        PELMI_WriteTheLine(&state, state.outputStart);
    }
}

void write_rows_above(GifDecoderState &state) {
    write_canvas_rows(state, 0, state.imageTop);
    state.sourceRow = state.imageTop;
    state.canvasRow = state.rowBuffer;
}

void write_rows_below(GifDecoderState &state) {
    write_canvas_rows(state, state.imageTop + state.imageHeight, state.screenHeight);
}

// What the walk to the next frame found decides what the call that delivered this one gives.
int32_t deliver(ImageDecodeInfo &info, GifDecoderState *state, int32_t found) {
    if (found != PELM_RESULT_DONE) return end(info, state, found);
    info.decoderState = state;
    return found;
}

// The tables of the frames to come are copied to the request's local table.
int32_t seek_frame(ImageDecodeInfo &info, GifDecoderState &state) {
    if (info.localColorTable != nullptr) ZOTARPELM_OsMemset(info.localColorTable, 0, raw_table_bytes);
    state.rawTableCopy = static_cast<uint8_t *>(info.localColorTable);
    return PELMI_SeekImageData(state.input->source, &state);
}

void report_frame(ImageDecodeInfo &info, const GifDecoderState &state) {
    info.frameDelay = state.delayMs;
    info.colorTableState = state.activeTable != state.globalTable ? 1 : 0;
    if (info.colorTableState != 0 && info.localColorTable != nullptr)
        ZOTARPELM_OsMemcpy(info.localColorTable, state.localTable, raw_table_bytes);
}

// Required: the tables are the caller's to free, and allocated anew for every decode (docs/oddities.md, "Colour tables
// of animations").
bool allocate_raw_tables(ImageDecodeInfo &info) {
    info.globalColorTable = new_raw_table();
    if (info.globalColorTable == nullptr) return false;
    info.localColorTable = new_raw_table();
    return info.localColorTable != nullptr;
}

GifDecoderState *begin_frames(ImageDecodeInfo &info, Size box, void *out) {
    if (!allocate_raw_tables(info)) return nullptr;
    GifDecoderState *const state = PELMI_InitializeGIF(&info, box.width, box.height, 1, out);
    if (state == nullptr) return nullptr;
    state->startedBy = GIF_BY_FRAMES;
    if (seek_frame(info, *state) != PELM_RESULT_FAILED) return state;
    PELMI_DelGIFDecoderInfo(state);
    return nullptr;
}

GifDecoderState *begin_slices(ImageDecodeInfo &info, Size box, void *out) {
    GifDecoderState *const state = PELMI_InitializeGIF(&info, box.width, box.height, 1, out);
    if (state == nullptr) return nullptr;
    state->startedBy = GIF_FRAMES_ITERATIVE;
    state->framePhase = GIF_FRAME_FOUND;
    if (PELMI_SeekImageData(info.input, state) != PELM_RESULT_FAILED) return state;
    PELMI_DelGIFDecoderInfo(state);
    return nullptr;
}

int32_t decode_frame(ImageDecodeInfo &info, GifDecoderState *state) {
    write_rows_above(*state);
    PELMI_DecodeGIFImage(state->input->source, state, state->outputStart); // what is there of it is the frame
    report_frame(info, *state);
    write_rows_below(*state);
    return deliver(info, state, seek_frame(info, *state));
}

int32_t begin_frame_slices(ImageDecodeInfo &info, GifDecoderState *state) {
    write_rows_above(*state);
    PELMI_DecodeGIFImageIter(state->input->source, state, state->outputStart, 1); // the next call tells how it ended
    state->framePhase = GIF_IN_FRAME;
    info.decoderState = state;
    return PELM_RESULT_MORE;
}

int32_t next_frame_slice(ImageDecodeInfo &info, GifDecoderState *state) {
    InputSource *const source = state->input->source;
    const int32_t result = PELMI_DecodeGIFImageIter(source, state, state->outputStart, 0);
    if (result == PELM_RESULT_MORE) return result;
    write_rows_below(*state);
    state->framePhase = GIF_BETWEEN_FRAMES;
    const int32_t found = PELMI_SeekImageData(source, state);
    info.hasTransparency = state->hasTransparency;
    return deliver(info, state, found);
}

} // namespace
} // namespace pelm

int32_t ZOTARPELMI_DecodeAGIF(ImageDecodeInfo *info, void *outBuffer, int32_t outWidth, int32_t outHeight) {
    if (info == nullptr) return PELM_RESULT_FAILED;
    auto *state = static_cast<GifDecoderState *>(info->decoderState);
    if (state == nullptr) state = pelm::begin_frames(*info, {outWidth, outHeight}, outBuffer);
    if (state == nullptr || state->startedBy != GIF_BY_FRAMES) return PELM_RESULT_FAILED;
    return pelm::decode_frame(*info, state);
}

int32_t ZOTARPELMI_DecodeAGIFIter(ImageDecodeInfo *info, void *outBuffer, int32_t outWidth, int32_t outHeight) {
    if (info == nullptr) return PELM_RESULT_FAILED;
    auto *state = static_cast<GifDecoderState *>(info->decoderState);
    if (state == nullptr) state = pelm::begin_slices(*info, {outWidth, outHeight}, outBuffer);
    if (state == nullptr || state->startedBy != GIF_FRAMES_ITERATIVE) return PELM_RESULT_FAILED;
    return state->framePhase == GIF_IN_FRAME ? pelm::next_frame_slice(*info, state)
                                             : pelm::begin_frame_slices(*info, state);
}

int32_t ZOTARPELMI_AborAGIF(ImageDecodeInfo *info) {
    return ZOTARPELMI_AbortGIFIter(info);
}

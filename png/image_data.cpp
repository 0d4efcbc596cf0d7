#include "png/image_data.h"

#include <algorithm>

#include "frame/memory.h"
#include "png/entry.h"
#include "png/idat_input.h"
#include "png/inflate/inflate.h"
#include "png/rows.h"

namespace pelm {
namespace {

// Where the next call comes back to. The places within a block differ only in name: the core's record knows the rest.
enum : uint32_t { resume_in_stored = 1, resume_at_symbol = 2, resume_at_row = 4, resume_at_block = 5 };

uint32_t place_within_block(Step step) {
    switch (step) {
    case Step::stored: return resume_in_stored;
    case Step::symbols: return resume_at_symbol;
    default: return resume_at_row;
    }
}

// Required: a pause before the first complete row is not resumed (docs/oddities.md, "Iterative PNG decodes that start
// over").
bool resumes(const PlainRows &rows) {
    const PngDecodeState &state = *rows.state;
    return state.rowsDone != 0 && state.resumePoint >= resume_in_stored && state.resumePoint <= resume_at_block;
}

bool resumes(const Adam7Rows &rows) {
    return rows.state->rowsDone != 0 && rows.state->resumePoint == resume_at_block;
}

// The pool of the fixed codes' trees is part of what hosts budget for, and the first allocation that can fail here;
// the codes themselves are constant tables.
template <class Kind>
bool allocate_stream_memory(Kind &rows) {
    PngDecodeState &state = *rows.state;
    if (state.fixedHuffmanPool == nullptr) state.fixedHuffmanPool = allocate_array<HuffmanNodePool>(1);
    if (state.fixedHuffmanPool == nullptr || !allocate_rows(rows)) return false;
    if (state.inflate.window.bytes == nullptr) state.inflate.window.bytes = allocate_array<uint8_t>(window_allocation);
    return state.inflate.window.bytes != nullptr;
}

// Puts the whole decode to the beginning of the stream, for the first time or once more.
template <class Kind>
Stop start(Kind &rows, const PngInputBuffer *stream) {
    PngDecodeState &state = *rows.state;
    if (!allocate_stream_memory(rows)) return Stop::no_memory;
    state.resumePoint = 0;
    restart(state.inflate);
    restart_rows(rows);
    if (stream != nullptr) return open_stream(state) ? Stop::go_on : Stop::input_ended_stored;
    join_idat_chunks(state);
    state.inputNext = state.idatTable[0].memoryAddress;
    return Stop::go_on;
}

template <class Kind>
Stop run(Kind &rows, bool streams) {
    PngDecodeState &state = *rows.state;
    const bool pause_at_blocks = state.iterativeMode != 0;
    if (streams) {
        StreamInput input = stream_input(state);
        const Stop stop = inflate(state.inflate, input, rows, state.dynamicHuffmanPool, pause_at_blocks);
        keep_unread(input);
        return stop;
    }
    MemoryInput input = memory_input(state);
    const Stop stop = inflate(state.inflate, input, rows, state.dynamicHuffmanPool, pause_at_blocks);
    state.inputNext = input.next;
    return stop;
}

// Interlaced images are measured by the pass that came last.
void reduce_further(PngDecodeState &state, const Rows &rows) {
    const uint32_t image_side = std::max(state.imageWidth, state.imageHeight);
    const uint32_t output_side = std::max(rows.output_width, rows.output_height);
    if (output_side != 0 && image_side / output_side >= 4)
        __PELMI_NearestInterpolateOutput(&state, rows.area, rows.output_width, rows.output_height);
}

// The one place that says what each outcome is called and what it leaves behind.
uint32_t conclude(ImageDecodeInfo &info, PngDecodeState &state, Stop stop) {
    switch (stop) {
    case Stop::finished: PELMI_DestroyDecodePng(&info); return PNG_DONE;
    case Stop::bad_code: PELMI_DestroyDecodePng(&info); return PNG_ENDED_EARLY;
    case Stop::host_stopped: PELMI_DestroyDecodePng(&info); return PNG_STOPPED;
    case Stop::no_memory: PELMI_DestroyDecodePng(&info); return PNG_NO_MEMORY;
    case Stop::rows_done: state.resumePoint = place_within_block(state.inflate.step); return PNG_ROWS_REMAIN;
    case Stop::block_ended: state.resumePoint = resume_at_block; return PNG_ROWS_REMAIN;
    case Stop::input_ended: return PNG_INPUT_ENDED;
    case Stop::input_ended_stored: return PNG_STOPPED;
    case Stop::no_lookup_memory: return PNG_NO_LOOKUP_MEMORY;
    case Stop::bad_stream:
    case Stop::go_on: break;
    }
    return PNG_BAD_DATA;
}

template <class Kind>
uint32_t decode(ImageDecodeInfo *info, const PngInputBuffer *stream, uint32_t *total, int64_t area, uint32_t width,
                uint32_t height) {
    auto *const state = static_cast<PngDecodeState *>(info->decoderState);
    if (state == nullptr) return PNG_BAD_DATA;
    Kind rows = {{state, width, height, area}};
    Stop stop = resumes(rows) ? ask_host(rows) : start(rows, stream);
    if (stop == Stop::go_on) stop = run(rows, stream != nullptr);
    if (stop == Stop::finished) {
        *total = state->inflate.window.total;
        finish_image(rows);
        reduce_further(*state, rows);
    }
    return conclude(*info, *state, stop);
}

} // namespace
} // namespace pelm

uint32_t _PELMI_PngInflateZStreamData(ImageDecodeInfo *info, uint32_t *total, uint32_t, int64_t area,
                                      const uint32_t *outputWidth, const uint32_t *outputHeight) {
    return pelm::decode<pelm::PlainRows>(info, nullptr, total, area, *outputWidth, *outputHeight);
}

uint32_t _PELMI_PngInflateZStreamData_streamming(ImageDecodeInfo *info, PngInputBuffer *input, uint32_t *total,
                                                 uint32_t, int64_t area, const uint32_t *outputWidth,
                                                 const uint32_t *outputHeight) {
    return pelm::decode<pelm::PlainRows>(info, input, total, area, *outputWidth, *outputHeight);
}

uint32_t _PELMI_PngInflateZStreamDataInterlaced(ImageDecodeInfo *info, uint32_t *total, uint32_t, int64_t area,
                                                const uint32_t *outputWidth, const uint32_t *outputHeight) {
    return pelm::decode<pelm::Adam7Rows>(info, nullptr, total, area, *outputWidth, *outputHeight);
}

uint32_t _PELMI_PngInflateZStreamDataInterlaced_streamming(ImageDecodeInfo *info, PngInputBuffer *input,
                                                           uint32_t *total, uint32_t, int64_t area,
                                                           const uint32_t *outputWidth, const uint32_t *outputHeight) {
    return pelm::decode<pelm::Adam7Rows>(info, input, total, area, *outputWidth, *outputHeight);
}

uint32_t __PELMI_NearestInterpolateOutput(PngDecodeState *, int64_t, uint32_t, uint32_t) {
    return 0;
}

// From a request to a record that is ready to decode, and its end.
#include <algorithm>
#include <limits>

#include "frame/host.h"
#include "frame/memory.h"
#include "frame/placement.h"
#include "frame/scaling.h"
#include "frame/sizes.h"
#include "gif/colours.h"
#include "gif/pixel_buffer.h"
#include "gif/working.h"

namespace pelm {
namespace {

constexpr uint32_t table_bytes = 1024;

template <class Element>
Element *allocate_zeroed(uint64_t count) {
    auto *const block = allocate_array<Element>(count);
    if (block != nullptr) ZOTARPELM_OsMemset(block, 0, static_cast<uint32_t>(count * sizeof(Element)));
    return block;
}

bool is_known_kind(uint32_t kind) {
    return kind == PELM_SOURCE_STREAM || kind == PELM_SOURCE_MEMORY || kind == PELM_SOURCE_STREAM_ALT ||
           kind == PELM_SOURCE_SEQUENTIAL;
}

bool read_screen(GifDecoderState &state, const ImageDecodeInfo &info) {
    // What colours without a table show is not left to chance.
    ZOTARPELM_OsMemset(state.globalTable, 0, table_bytes);
    ZOTARPELM_OsMemset(state.localTable, 0, table_bytes);
    state.activeTable = state.globalTable;
    state.input->source = info.input;
    state.input->cursor = state.input->buffer;
    state.transparentIndex = -1;
    state.rawTableCopy = static_cast<uint8_t *>(info.globalColorTable);
    return PELMI_ParseGIFHeader(info.input, &state) != 0 && state.screenWidth != 0 && state.screenHeight != 0;
}

int32_t narrowed(int64_t side) {
    return static_cast<int32_t>(
        std::clamp<int64_t>(side, std::numeric_limits<int32_t>::min(), std::numeric_limits<int32_t>::max()));
}

void set_scaled_size(GifDecoderState &state, Size box, bool stretch) {
    const Size screen = {state.screenWidth, state.screenHeight};
    const Size box_for_image = turns_sideways(state.rotation) ? Size{box.height, box.width} : box;
    const bool same = box_for_image.width == screen.width && box_for_image.height == screen.height;
    const Scaling scaling =
        stretch ? Scaling{box_for_image.width, box_for_image.height, same} : scale_to_fit(screen, box_for_image);
    // Only sides below 0, in which nothing is drawn, can be beyond 32 bits.
    state.scaledWidth = narrowed(scaling.width);
    state.scaledHeight = narrowed(scaling.height);
    state.oneToOne = scaling.one_to_one ? 1 : 0;
}

// False when the buffer, if there is one, or the steps in it are beyond what the record can hold.
bool place_in_output(GifDecoderState &state, Size box, bool exact, void *out) {
    const int32_t pixel_bytes = GifFormats::size(state.outputFormat);
    const Size scaled = {state.scaledWidth, state.scaledHeight};
    // Required: an exact buffer has the unturned sides of the scaled image, also when it is turned (docs/oddities.md,
    // "Exact placement of turned images").
    const Size buffer = exact ? scaled : box;
    size_t bytes = 0;
    const bool fits = buffer_bytes(buffer.width, buffer.height, pixel_bytes, bytes);
    if (fits && bytes == 0) return true; // nothing will be written
    BytePlacement placement{};
    if (!fits || !place_bytes(state.rotation, buffer, scaled, pixel_bytes, placement)) return out == nullptr;
    state.output = {static_cast<uint8_t *>(out), out == nullptr ? 0 : bytes};
    state.outputStart = placement.first;
    state.rowStep = placement.row_step / gif_step_unit(state.outputFormat);
    state.pixelStep = placement.pixel_step / gif_step_unit(state.outputFormat);
    return true;
}

bool allocate_rows(GifDecoderState &state) {
    if (!reserve_pixel_row(state, state.screenWidth)) return false;
    state.rowBuffer = allocate_zeroed<uint32_t>(static_cast<uint32_t>(state.screenWidth));
    if (state.rowBuffer == nullptr) return false;
    if (state.animated == 0) return true;
    const uint64_t pixels = static_cast<uint64_t>(state.screenWidth) * static_cast<uint64_t>(state.screenHeight);
    state.canvas = allocate_array<uint32_t>(pixels);
    if (state.canvas == nullptr) return false;
    ZOTARPELM_OsMemset(state.canvas, 0xFF, static_cast<uint32_t>(4 * pixels));
    return true;
}

bool set_up(GifDecoderState &state, const ImageDecodeInfo &info, Size box, uint32_t animated, void *out) {
    if (PELMI_CreateGIFDecoderInfo(&state) == 0) return false;
    state.animated = animated;
    state.outputFormat = info.outputFormat;
    if (!read_screen(state, info)) return false;
    const uint32_t mode = placement_mode(info.flags);
    state.rotation = rotation_of(info.flags);
    state.requestedWidth = box.width;
    set_scaled_size(state, box, mode == PELM_PLACE_STRETCH);
    return place_in_output(state, box, mode == PELM_PLACE_EXACT, out) && allocate_rows(state);
}

} // namespace

bool reserve_pixel_row(GifDecoderState &state, int32_t width) {
    if (state.pixelBuffer != nullptr && width <= state.pixelBufferWidth) return true;
    free_block(state.pixelBuffer);
    state.pixelBuffer = allocate_zeroed<uint8_t>(static_cast<uint32_t>(width + longest_string + written_behind));
    state.pixelBufferWidth = width;
    return state.pixelBuffer != nullptr;
}

} // namespace pelm

int32_t PELMI_CreateGIFDecoderInfo(GifDecoderState *state) {
    using pelm::allocate_array;
    if ((state->input = pelm::new_record<GifInput>()) == nullptr) return 0;
    if ((state->input->buffer = allocate_array<uint8_t>(gif_input_bytes)) == nullptr) return 0;
    if ((state->globalTable = allocate_array<uint32_t>(256)) == nullptr) return 0;
    if ((state->localTable = allocate_array<uint32_t>(2 * 256)) == nullptr) return 0;
    state->finishedTable = state->localTable + 256;
    if ((state->lzw = allocate_array<GifLzwTables>(1)) == nullptr) return 0;
    *state->lzw = {};
    if ((state->lzw->prefix = allocate_array<uint32_t>(gif_table_entries)) == nullptr) return 0;
    if ((state->lzw->suffix = allocate_array<uint8_t>(gif_table_entries)) == nullptr) return 0;
    auto *const lengths = allocate_array<GifStringLengths>(1);
    if (lengths == nullptr) return 0;
    state->lzw->length = lengths->length;
    state->fastStrings = &lengths->fast;
    return 1;
}

void PELMI_DelGIFDecoderInfo(GifDecoderState *state) {
    using pelm::free_block;
    if (state == nullptr) return;
    if (state->input != nullptr) free_block(state->input->buffer);
    free_block(state->input);
    free_block(state->pixelBuffer);
    free_block(state->frameLineBuffer);
    free_block(state->globalTable);
    free_block(state->localTable);
    free_block(state->canvas);
    free_block(state->rowBuffer);
    if (state->lzw != nullptr) {
        free_block(state->lzw->prefix);
        free_block(state->lzw->suffix);
        free_block(state->lzw->length);
    }
    free_block(state->lzw);
    free_block(state);
}

GifDecoderState *PELMI_InitializeGIF(ImageDecodeInfo *info, int32_t outWidth, int32_t outHeight, uint32_t animated,
                                     void *outBuffer) {
    if (info == nullptr || info->input == nullptr || !pelm::is_known_kind(info->input->kind)) return nullptr;
    auto *const state = pelm::new_record<GifDecoderState>();
    if (state == nullptr) return nullptr;
    if (!pelm::set_up(*state, *info, {outWidth, outHeight}, animated, outBuffer)) {
        PELMI_DelGIFDecoderInfo(state);
        return nullptr;
    }
    info->outputWidth = state->scaledWidth;
    info->outputHeight = state->scaledHeight;
    return state;
}

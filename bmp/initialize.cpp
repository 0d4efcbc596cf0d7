#include "bmp/initialize.h"

#include "bmp/colours.h"
#include "bmp/working.h"
#include "frame/memory.h"

namespace pelm {
namespace {

bool is_seekable_stream(const InputSource &input) {
    return input.kind == PELM_SOURCE_STREAM || input.kind == PELM_SOURCE_STREAM_ALT;
}

bool allocate_staging(BmpState &state, InputSource &input) {
    if (!is_seekable_stream(input)) return true;
    const int32_t stride = row_stride(state.width, state.bitsPerPixel);
    input.bufferSize = input.bufferSize < stride ? stride : input.bufferSize / stride * stride;
    state.output.stagingBytes = input.bufferSize;
    input.data = allocate_array<uint8_t>(static_cast<uint32_t>(input.bufferSize));
    return input.data != nullptr;
}

// Two rows by contract, although the scan of frame/sampling.h's sample lines never has more than one open.
bool allocate_accumulators(BmpState &state) {
    if (state.scaledWidth <= 0) return true;
    const uint64_t words = 2 * static_cast<uint64_t>(state.scaledWidth);
    state.accumulators = allocate_array<uint32_t>(words);
    if (state.accumulators == nullptr) return false;
    ZOTARPELM_OsMemset(state.accumulators, 0, static_cast<uint32_t>(4 * words));
    return true;
}

SetUp set_up(BmpState &state, ImageDecodeInfo &info, const Target &target) {
    uint8_t bytes[bmp_header_bytes];
    BmpHeader header{};
    SetUp step = read_header(*info.input, bytes);
    if (step == SetUp::done) step = parse_header(bytes, header);
    return step == SetUp::done ? complete_state(state, header, info, target, Calls::direct) : step;
}

} // namespace

SetUp complete_state(BmpState &state, const BmpHeader &header, ImageDecodeInfo &info, const Target &target,
                     Calls calls) {
    InputSource &input = *info.input;
    state.width = header.width;
    state.height = header.height;
    state.topDown = header.top_down ? 1 : 0;
    state.bitsPerPixel = header.bits_per_pixel;
    state.pixelDataOffset = header.pixel_data_offset;
    SetUp step = read_colours(state, header, input, calls);
    if (step == SetUp::done) step = set_geometry(state, info, target);
    if (step != SetUp::done) return step;

    state.input = &input; // from here on the staging buffer is the record's to free
    if (calls == Calls::direct && !allocate_staging(state, input)) return SetUp::refused;
    return allocate_accumulators(state) ? SetUp::done : SetUp::refused;
}

BmpState *hang_state(ImageDecodeInfo &info, BmpState *state) {
    info.outputWidth = state->scaledWidth;
    info.outputHeight = state->scaledHeight;
    info.decoderState = state;
    return state;
}

BmpState *new_state(ImageDecodeInfo &info, const Target &target) {
    auto *const state = new_record<BmpState>();
    if (state == nullptr) return nullptr;
    switch (set_up(*state, info, target)) {
    case SetUp::done: break;
    case SetUp::refused: PELMI_BMP_DeleteDecInfo(state); return nullptr;
    case SetUp::abandoned: return nullptr;
    }
    return hang_state(info, state);
}

void end_decode(ImageDecodeInfo &info, BmpState *state) {
    PELMI_BMP_DeleteDecInfo(state);
    info.decoderState = nullptr;
}

} // namespace pelm

BmpState *PELMI_BMP_Initialize(ImageDecodeInfo *info, int32_t outWidth, int32_t outHeight, void *output) {
    if (info == nullptr || info->input == nullptr) return nullptr;
    return pelm::new_state(*info, {{outWidth, outHeight}, info->flags, output});
}

void PELMI_BMP_DeleteDecInfo(BmpState *state) {
    if (state == nullptr) return;
    InputSource *const input = state->input;
    if (input != nullptr && pelm::is_seekable_stream(*input)) pelm::free_block(input->data);
    pelm::free_block(state->palette);
    pelm::free_block(state->accumulators);
    pelm::free_block(state);
}

int32_t PELMI_BMP_DestroyBMP(ImageDecodeInfo *info) {
    if (info == nullptr) return 0;
    auto *const state = static_cast<BmpState *>(info->decoderState);
    if (state == nullptr) return 1;
    pelm::free_block(state->palette);
    pelm::free_block(info->decoderState);
    return 1;
}

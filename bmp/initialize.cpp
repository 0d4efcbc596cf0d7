// From a request to a record that is ready to decode: header, colours, size and place in the output, buffers.
#include "bmp/colours.h"
#include "bmp/header.h"
#include "bmp/working.h"
#include "frame/formats.h"
#include "frame/memory.h"
#include "frame/scaling.h"
#include "frame/sizes.h"

namespace pelm {
namespace {

// The first pixel and the steps from there, in the record's units. False when they do not fit it.
bool place_in_output(BmpState &state, Size buffer, Size scaled) {
    BytePlacement placement{};
    if (!place_bytes(state.rotation, buffer, scaled, bytes_per_pixel(state.outputFormat), placement)) return false;
    state.outputCursor = placement.first;
    state.rowStep = placement.row_step * (state.topDown != 0 ? -1 : 1);
    state.pixelStep = placement.pixel_step / pixel_step_unit(state.outputFormat);
    return true;
}

SetUp set_geometry(BmpState &state, ImageDecodeInfo &info, Size box, void *output) {
    const uint32_t mode = placement_mode(info.flags);
    state.rotation = rotation_of(info.flags);
    state.requestedWidth = box.width;
    info.decodeStarted = 1;

    const Size box_for_image = turns_sideways(state.rotation) ? Size{box.height, box.width} : box;
    const Size image = {state.width, state.height};
    Scaling scaling = {box_for_image.width, box_for_image.height, false};
    if (mode != PELM_PLACE_STRETCH) {
        if (image.height == 0 && (box_for_image.width < image.width || box_for_image.height < 0)) return SetUp::refused;
        scaling = scale_to_fit(image, box_for_image);
    }
    Size scaled{};
    if (!scaling.narrow_to(scaled)) return SetUp::refused;
    state.scaledWidth = scaled.width;
    state.scaledHeight = scaled.height;
    state.oneToOne = scaling.one_to_one ? 1 : 0;

    // Required: an exact buffer has the unturned sides of the scaled image, also when it is turned (docs/oddities.md,
    // "Exact placement of turned images").
    const Size buffer = mode == PELM_PLACE_EXACT ? scaled : box;
    state.outputFormat = info.outputFormat;
    size_t bytes = 0;
    if (!buffer_bytes(buffer.width, buffer.height, bytes_per_pixel(state.outputFormat), bytes)) return SetUp::refused;
    if (bytes == 0 || state.scaledWidth <= 0 || state.scaledHeight <= 0) return SetUp::done; // nothing will be written
    state.output = {static_cast<uint8_t *>(output), output == nullptr ? 0 : bytes};
    return place_in_output(state, buffer, scaled) ? SetUp::done : SetUp::refused;
}

bool allocate_staging(BmpState &state, InputSource &input) {
    if (input.kind != PELM_SOURCE_STREAM && input.kind != PELM_SOURCE_STREAM_ALT) return true;
    const int32_t stride = row_stride(state.width, state.bitsPerPixel);
    input.bufferSize = input.bufferSize < stride ? stride : input.bufferSize / stride * stride;
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

SetUp set_up(BmpState &state, ImageDecodeInfo &info, Size box, void *output) {
    InputSource &input = *info.input;
    uint8_t bytes[bmp_header_bytes];
    BmpHeader header{};
    SetUp step = read_header(input, bytes);
    if (step == SetUp::done) step = parse_header(bytes, header);
    if (step != SetUp::done) return step;

    state.width = header.width;
    state.height = header.height;
    state.topDown = header.top_down ? 1 : 0;
    state.bitsPerPixel = header.bits_per_pixel;
    state.pixelDataOffset = header.pixel_data_offset;
    step = read_colours(state, header, input);
    if (step == SetUp::done) step = set_geometry(state, info, box, output);
    if (step != SetUp::done) return step;

    state.input = &input; // from here on the staging buffer is the record's to free
    return allocate_staging(state, input) && allocate_accumulators(state) ? SetUp::done : SetUp::refused;
}

} // namespace
} // namespace pelm

BmpState *PELMI_BMP_Initialize(ImageDecodeInfo *info, int32_t outWidth, int32_t outHeight, void *output) {
    if (info == nullptr || info->input == nullptr) return nullptr;
    auto *const state = pelm::new_record<BmpState>();
    if (state == nullptr) return nullptr;

    switch (pelm::set_up(*state, *info, {outWidth, outHeight}, output)) {
    case pelm::SetUp::done: break;
    case pelm::SetUp::refused: PELMI_BMP_DeleteDecInfo(state); return nullptr;
    case pelm::SetUp::abandoned: return nullptr;
    }
    info->outputWidth = state->scaledWidth;
    info->outputHeight = state->scaledHeight;
    info->decoderState = state;
    return state;
}

void PELMI_BMP_DeleteDecInfo(BmpState *state) {
    if (state == nullptr) return;
    InputSource *const input = state->input;
    const bool staged =
        input != nullptr && (input->kind == PELM_SOURCE_STREAM || input->kind == PELM_SOURCE_STREAM_ALT);
    if (staged) pelm::free_block(input->data);
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

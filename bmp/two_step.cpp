// A BMP in two calls, for graphics libraries: the first one tells the image's size and parks the header in the record,
// the second one brings the buffer and decodes.
#include "bmp/calls.h"
#include "bmp/initialize.h"
#include "bmp/working.h"
#include "frame/memory.h"
#include "frame/sizes.h"

namespace pelm {
namespace {

// Tells the caller the image's size. False when it does not fit the words.
bool report_size(ImageDecodeInfo &info, BmpState &state, const BmpHeader &header, int32_t divisor) {
    const int64_t width = int64_t{header.width} / divisor;
    const int64_t height = (header.top_down ? -int64_t{header.height} : header.height) / divisor;
    if (!fits_int32(width) || !fits_int32(height)) return false;
    state.width = header.width;
    state.height = header.height;
    state.topDown = header.top_down ? 1 : 0;
    state.requestedWidth = static_cast<int32_t>(height);
    info.imageWidth = header.width;
    info.imageHeight = header.height;
    info.outputWidth = static_cast<int32_t>(width);
    info.outputHeight = static_cast<int32_t>(height);
    info.preInitMode = 2;
    info.decoderState = &state;
    return true;
}

// A caller's staging buffer must hold a row.
bool source_is_ready(const InputSource &input, const BmpHeader &header) {
    switch (input.kind) {
    case PELM_SOURCE_MEMORY: return input.data != nullptr;
    case PELM_SOURCE_STREAM:
    case PELM_SOURCE_STREAM_ALT:
        return input.data != nullptr && input.bufferSize >= row_stride(header.width, header.bits_per_pixel);
    default: return input.kind == PELM_SOURCE_SEQUENTIAL;
    }
}

bool source_holds_all_rows(const InputSource &input, const BmpHeader &header) {
    const int64_t stride = row_stride(header.width, header.bits_per_pixel);
    return input.size >= header.pixel_data_offset + header.height * stride;
}

bool complete_parked(BmpState &state, ImageDecodeInfo &info, const Target &target) {
    uint8_t bytes[bmp_header_bytes];
    ZOTARPELM_OsMemcpy(bytes, state.headerCopy, bmp_header_bytes);
    ZOTARPELM_OsMemset(state.headerCopy, 0, bmp_header_bytes); // a completed record is none that is parked
    state.output = {{}, info.input->bufferSize, 0};            // in the same place
    BmpHeader header{};
    if (!parse_parked_header(bytes, header) || !source_is_ready(*info.input, header)) return false;
    if (header.compression == plain_rows && !source_holds_all_rows(*info.input, header)) return false;

    state.requestedHeight = target.box.height;
    state.compression = header.compression;
    return complete_state(state, header, info, target, Calls::two_step) == SetUp::done;
}

} // namespace
} // namespace pelm

int32_t ZOTARPELMI_PreInitBMP(ImageDecodeInfo *info, int32_t sampleDivisor) {
    if (info == nullptr || info->input == nullptr) return PELM_RESULT_FAILED;
    InputSource &input = *info->input;
    ZOTARPELM_Seek_IO(&input, 0, 0);
    if (sampleDivisor == 0) return PELM_RESULT_FAILED;
    if (input.kind == PELM_SOURCE_MEMORY && input.data == nullptr) return PELM_RESULT_FAILED;
    auto *const state = pelm::new_record<BmpState>();
    if (state == nullptr) return PELM_RESULT_FAILED;

    state->input = &input;
    pelm::read_or_zeros(input, state->headerCopy, pelm::bmp_header_bytes);
    // Required: the record stays allocated (docs/oddities.md, "Refusals that leak").
    if (!pelm::is_bmp(state->headerCopy)) return PELM_RESULT_FAILED;
    pelm::BmpHeader header{};
    if (pelm::parse_info_fields(state->headerCopy, header) && pelm::report_size(*info, *state, header, sampleDivisor))
        return PELM_RESULT_DONE;
    ZOTARPELM_OsFree(state);
    return PELM_RESULT_FAILED;
}

// Required: a refusal frees the record, and a seekable stream's staging buffer, and leaves decoderState pointing at it
// (docs/oddities.md, "Refusals in two steps").
BmpState *PELMI_BMP_InitializeSKIA(ImageDecodeInfo *info, int32_t outWidth, int32_t outHeight, void *output) {
    if (info == nullptr || info->decoderState == nullptr) return nullptr;
    auto *const state = static_cast<BmpState *>(info->decoderState);
    state->input = info->input;
    if (info->input != nullptr && pelm::complete_parked(*state, *info, {{outWidth, outHeight}, info->flags, output}))
        return pelm::hang_state(*info, state);
    PELMI_BMP_DeleteDecInfo(state);
    return nullptr;
}

int32_t ZOTARPELMI_DecodeBMPSKIA(ImageDecodeInfo *info, void *output, int32_t outWidth, int32_t outHeight) {
    BmpState *const state = PELMI_BMP_InitializeSKIA(info, outWidth, outHeight, output);
    if (state == nullptr) return PELM_RESULT_FAILED;
    pelm::decode_by_depth(*state, state->outputCursor, state->scaledHeight);
    pelm::end_decode(*info, state);
    return PELM_RESULT_DONE;
}

// The structure of a GIF file (GIF89a): header, logical screen, and the walk over blocks from one image
// to the next.
#include "frame/bytes.h"
#include "frame/host.h"
#include "gif/input.h"
#include "gif/pixel_buffer.h"

namespace pelm {
namespace {

enum class Walk { goes_on, image, trailer, failed };

constexpr int32_t header_bytes = 13;
constexpr int32_t descriptor_bytes = 9;
constexpr uint8_t image_separator = 0x2C, extension_introducer = 0x21, trailer_byte = 0x3B;
constexpr uint8_t graphic_control = 0xF9, plain_text = 0x01, comment = 0xFE, application = 0xFF;
constexpr uint32_t has_table = 0x80; // in the packed byte of the screen and of an image

// Any version of the form "89a"; the last byte may also be one of the characters between "Z" and "a".
bool is_gif_signature(const uint8_t *bytes) {
    const auto is_digit = [](uint8_t byte) { return byte >= '0' && byte <= '9'; };
    return bytes[0] == 'G' && bytes[1] == 'I' && bytes[2] == 'F' && is_digit(bytes[3]) && is_digit(bytes[4]) &&
           bytes[5] >= 'A' && bytes[5] <= 'z';
}

// The colour table whose size the packed byte of its owner tells.
bool read_table(GifInput &input, InputSource *source, uint32_t packed, uint8_t *raw_copy, uint32_t *table) {
    const int32_t count = 1 << ((packed & 7) + 1);
    if (!have_bytes(input, source, 3 * count)) return false;
    const uint8_t *const raw = take(input, 3 * count);
    if (raw_copy != nullptr) ZOTARPELM_OsMemcpy(raw_copy, raw, static_cast<uint32_t>(3 * count));
    PELMI_MakeColorTable(raw, count, table);
    return true;
}

bool read_graphic_control(GifDecoderState &state, InputSource *source) {
    constexpr int32_t bytes_behind_size = 5;
    if (!have_bytes(*state.input, source, bytes_behind_size)) return false;
    const uint8_t *const block = take(*state.input, bytes_behind_size);
    state.disposal = (block[0] >> 2) & 7u;
    state.hasTransparency = block[0] & 1u;
    state.delayMs = read_u16le(block + 1) * 10u;
    state.transparentIndex = state.hasTransparency != 0 ? block[3] : -1;
    return block[4] == 0; // the terminator
}

// From behind the first size byte to behind the terminator.
bool skip_sub_blocks(GifInput &input, InputSource *source, int32_t size) {
    while (size != 0) {
        if (!have_bytes(input, source, size + 1)) return false;
        size = take(input, size + 1)[size];
    }
    return true;
}

Walk read_extension(GifDecoderState &state, InputSource *source) {
    GifInput &input = *state.input;
    if (!have_bytes(input, source, 2)) return Walk::failed;
    const uint8_t label = take(input, 1)[0];
    switch (label) {
    case graphic_control:
        return take(input, 1)[0] == 4 && read_graphic_control(state, source) ? Walk::goes_on : Walk::failed;
    case plain_text:
    case comment:
    case application: return skip_sub_blocks(input, source, take(input, 1)[0]) ? Walk::goes_on : Walk::failed;
    default:
        // Required: the body of any other extension is read as stray bytes (docs/oddities.md, "Unknown extensions").
        return Walk::goes_on;
    }
}

Walk read_image_descriptor(GifDecoderState &state, InputSource *source) {
    GifInput &input = *state.input;
    if (!have_bytes(input, source, descriptor_bytes)) return Walk::failed;
    const uint8_t *const bytes = take(input, descriptor_bytes);
    state.imageLeft = read_u16le(bytes);
    state.imageTop = read_u16le(bytes + 2);
    state.imageWidth = read_u16le(bytes + 4);
    state.imageHeight = read_u16le(bytes + 6);
    const uint32_t packed = bytes[8];
    state.activeTable = state.globalTable;
    if ((packed & has_table) != 0) {
        if (!read_table(input, source, packed, state.rawTableCopy, state.localTable)) return Walk::failed;
        state.activeTable = state.localTable;
    }
    state.interlaced = (packed >> 6) & 1;

    if (!have_bytes(input, source, 1)) return Walk::failed;
    state.lzwMinCodeSize = take(input, 1)[0];
    if (state.lzwMinCodeSize > 12 || !reserve_pixel_row(state, state.imageWidth)) return Walk::failed;
    state.sourceRow = 0;
    state.coloursAreFinished = 0;
    return Walk::image;
}

Walk read_block(GifDecoderState &state, InputSource *source) {
    if (!have_bytes(*state.input, source, 1)) return Walk::failed;
    switch (take(*state.input, 1)[0]) {
    case image_separator: return read_image_descriptor(state, source);
    case extension_introducer: return read_extension(state, source);
    case trailer_byte: return Walk::trailer;
    default: return Walk::goes_on; // stray
    }
}

} // namespace
} // namespace pelm

int32_t PELMI_ParseGIFHeader(InputSource *source, GifDecoderState *state) {
    GifInput &input = *state->input;
    ZOTARPELM_Seek_IO(source, 0, 0);
    input.bytesLeft = 0;
    if (!pelm::have_bytes(input, source, pelm::header_bytes)) return 0;
    const uint8_t *const header = pelm::take(input, pelm::header_bytes);
    if (!pelm::is_gif_signature(header)) return 0;
    state->screenWidth = pelm::read_u16le(header + 6);
    state->screenHeight = pelm::read_u16le(header + 8);
    const uint32_t packed = header[10];
    state->colorResolution = (packed >> 4) & 7;
    state->backgroundIndex = header[11];
    state->aspectRatio = header[12];
    if ((packed & pelm::has_table) == 0) return 1;
    return pelm::read_table(input, source, packed, state->rawTableCopy, state->globalTable) ? 1 : 0;
}

int32_t PELMI_SeekImageData(InputSource *source, GifDecoderState *state) {
    for (;;) {
        switch (pelm::read_block(*state, source)) {
        case pelm::Walk::goes_on: break;
        case pelm::Walk::image: return PELM_RESULT_DONE;
        case pelm::Walk::trailer: return PELM_RESULT_LAST_FRAME;
        case pelm::Walk::failed: return PELM_RESULT_FAILED;
        }
    }
}

#include "png/chunks.h"

#include <algorithm>

#include "frame/memory.h"
#include "png/crc32.h"
#include "png/idat_index.h"

namespace pelm {
namespace {

constexpr uint32_t chunk_type(const char (&name)[5]) {
    return static_cast<uint32_t>(static_cast<uint8_t>(name[0])) << 24 |
           static_cast<uint32_t>(static_cast<uint8_t>(name[1])) << 16 |
           static_cast<uint32_t>(static_cast<uint8_t>(name[2])) << 8 |
           static_cast<uint32_t>(static_cast<uint8_t>(name[3]));
}

constexpr uint32_t checksum_bytes = 4;
constexpr uint32_t palette_block = 768;

bool signature_matches(PngInputBuffer &input) {
    constexpr uint8_t signature[8] = {0x89, 'P', 'N', 'G', 0x0D, 0x0A, 0x1A, 0x0A};
    for (const uint8_t wanted : signature) {
        uint8_t byte = 0;
        if (!read_byte(input, byte) || byte != wanted) return false;
    }
    return true;
}

// Where a chunk's data begins, so that it can be read again behind the checksum.
struct DataPlace {
    uint32_t bufferStart, readPos, bytesLeft;
};

bool checksum_matches(PngInputBuffer &input, uint32_t type, uint32_t length) {
    const uint8_t name[4] = {static_cast<uint8_t>(type >> 24), static_cast<uint8_t>(type >> 16),
                             static_cast<uint8_t>(type >> 8), static_cast<uint8_t>(type)};
    uint32_t crc = crc32_go_on(crc32_start, name, 4);
    while (length > 0) {
        if (!have_bytes(input, 1)) return false;
        const uint32_t run = std::min(length, input.bytesLeft);
        crc = crc32_go_on(crc, take(input, run), run);
        length -= run;
    }
    uint32_t stored = 0;
    return read_u32(input, stored) && stored == ~crc;
}

bool go_back(PngInputBuffer &input, const DataPlace &place) {
    if (reads_memory(input)) {
        input.readPos = place.readPos;
        input.bytesLeft = place.bytesLeft;
        return true;
    }
    ZOTARPELM_Seek_IO(input.source, static_cast<int32_t>(place.bufferStart), 0);
    input.bytesLeft = 0;
    input.sourceEnd = place.bufferStart;
    if (__checkbuffer_util1(&input, static_cast<int32_t>(place.readPos)) != PNG_DONE) return false;
    if (input.bytesLeft < place.readPos) return false;
    take(input, place.readPos);
    return true;
}

bool depth_fits_colour_type(uint8_t depth, uint8_t colour_type) {
    const bool known_depth = depth == 1 || depth == 2 || depth == 4 || depth == 8 || depth == 16;
    switch (colour_type) {
    case 0: return known_depth;
    case 2:
    case 4:
    case 6: return depth == 8 || depth == 16;
    case 3: return known_depth && depth <= 8;
    default: return false;
    }
}

uint32_t read_ihdr(PngDecodeState &state, PngInputBuffer &input, uint32_t length) {
    uint8_t tail[5]; // depth, colour type, compression, filter, interlace
    if (length != 13 || !read_u32(input, state.imageWidth) || !read_u32(input, state.imageHeight))
        return PNG_FORMAT_ERROR;
    for (uint8_t &byte : tail)
        if (!read_byte(input, byte)) return PNG_FORMAT_ERROR;
    state.bitDepth = tail[0];
    state.colourType = tail[1];
    state.interlaceMethod = tail[4];
    if (tail[2] != 0 || tail[3] != 0 || state.interlaceMethod > 1) return PNG_FORMAT_ERROR;

    state.hasAlphaChannel = (state.colourType & 4) != 0 ? 1 : 0;
    const uint32_t colours = state.colourType == 2 || state.colourType == 6 ? 3 : 1;
    const uint32_t channels = colours + state.hasAlphaChannel;
    state.bitsPerPixel = static_cast<uint8_t>(state.bitDepth * channels);
    state.bytesPerPixel = static_cast<uint8_t>(((state.bitDepth + 7u) >> 3) * channels);
    if (state.imageWidth == 0 || state.imageHeight == 0) return PNG_FORMAT_ERROR;
    if (!depth_fits_colour_type(state.bitDepth, state.colourType)) return PNG_FORMAT_ERROR;
    state.chunkSeenFlags |= PNG_SEEN_IHDR;
    return PNG_DONE;
}

// A second palette takes the place of the first.
bool allocate_palette(PngDecodeState &state, uint32_t length) {
    free_block(state.palette);
    free_block(state.paletteAlpha);
    const uint32_t alpha_block = std::max(length * 2, 2u);
    state.palette = allocate_array<uint8_t>(palette_block);
    if (state.palette == nullptr) return false;
    state.paletteAlpha = static_cast<uint16_t *>(allocate(alpha_block));
    if (state.paletteAlpha == nullptr) return false;
    ZOTARPELM_OsMemset(state.palette, 0, palette_block);
    ZOTARPELM_OsMemset(state.paletteAlpha, 0xFF, alpha_block);
    return true;
}

uint32_t read_plte(PngDecodeState &state, PngInputBuffer &input, uint32_t length) {
    if ((state.chunkSeenFlags & PNG_SEEN_IHDR) == 0) return PNG_FORMAT_ERROR;
    if (length % 3 != 0 || length > palette_block) return PNG_FORMAT_ERROR;
    if (!allocate_palette(state, length)) return PNG_NO_MEMORY;
    state.paletteCount = length / 3;
    state.chunkSeenFlags |= PNG_SEEN_PLTE;
    for (uint32_t done = 0; done < length;) {
        if (!have_bytes(input, 1)) return PNG_FORMAT_ERROR;
        const uint32_t run = std::min(length - done, input.bytesLeft);
        ZOTARPELM_OsMemcpy(state.palette + done, take(input, run), run);
        done += run;
    }
    return PNG_DONE;
}

uint32_t read_idat(PngDecodeState &state, PngInputBuffer &input, uint32_t length) {
    // A chunk without data ends the walk; it holds nothing to index.
    if (length != 0 && !index_idat(state, input, length)) return PNG_NO_MEMORY;
    return skip_bytes(input, length) ? PNG_DONE : PNG_FORMAT_ERROR;
}

uint32_t read_trns(PngDecodeState &state, PngInputBuffer &input, uint32_t length, uint32_t type) {
    if (__PELMI_PngParseTRNSbKGd(&state, &input, length, type, &state) != PNG_DONE) return PNG_FORMAT_ERROR;
    state.ancillaryFlags |= PNG_HAS_TRNS;
    return PNG_DONE;
}

bool is_kept(const PngDecodeState &state, uint32_t type) {
    switch (type) {
    case chunk_type("IHDR"):
    case chunk_type("IDAT"):
    case chunk_type("IEND"):
    case chunk_type("tRNS"): return true;
    case chunk_type("PLTE"): return state.colourType == 3 || (state.chunkSeenFlags & PNG_SEEN_IHDR) == 0;
    default: return false;
    }
}

// The data of a chunk that is kept, up to its checksum.
uint32_t read_chunk(PngDecodeState &state, PngInputBuffer &input, uint32_t length, uint32_t type) {
    switch (type) {
    case chunk_type("IHDR"): return read_ihdr(state, input, length);
    case chunk_type("IDAT"): return read_idat(state, input, length);
    case chunk_type("tRNS"): return read_trns(state, input, length, type);
    case chunk_type("PLTE"): return read_plte(state, input, length);
    default: return length == 0 ? PNG_DONE : PNG_FORMAT_ERROR; // IEND
    }
}

uint32_t parse_chunk(PngDecodeState &state, PngInputBuffer &input, uint32_t &length) {
    uint32_t type = 0;
    if (!read_u32(input, length) || length > input.sourceSize) return PNG_FORMAT_ERROR;
    if (!read_u32(input, type)) return PNG_FORMAT_ERROR;
    const DataPlace data = {input.bufferStart, input.readPos, input.bytesLeft};
    if (!checksum_matches(input, type, length)) return PNG_BAD_DATA;
    if (!go_back(input, data)) return PNG_FORMAT_ERROR;

    uint64_t left = checksum_bytes;
    if (is_kept(state, type)) {
        const uint32_t code = read_chunk(state, input, length, type);
        if (code != PNG_DONE) return code;
    } else {
        left += length;
    }
    return skip_bytes(input, left) ? PNG_DONE : PNG_FORMAT_ERROR;
}

} // namespace
} // namespace pelm

uint32_t __PELMI_PngParserMain(PngDecodeState *state, PngInputBuffer *input) {
    using namespace pelm;
    state->idatCount = 0;
    state->idatIndexed = 0;
    state->ancillaryFlags = 0;
    if (!signature_matches(*input)) return PNG_FORMAT_ERROR;

    // Required: any chunk without data ends the file, whatever its type (docs/oddities.md, "Empty chunks").
    uint32_t length = 0;
    do {
        const uint32_t code = parse_chunk(*state, *input, length);
        if (code != PNG_DONE) return code;
    } while (length != 0);
    return state->idatCount == 0 ? PNG_BAD_DATA : PNG_DONE;
}

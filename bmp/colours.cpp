#include "bmp/colours.h"

#include <algorithm>

#include "frame/bytes.h"
#include "frame/memory.h"

namespace pelm {
namespace {

constexpr int32_t palette_entry_bytes = 4;

// Every index finds an entry, however few the file brings: pixels are not checked against their number.
constexpr int32_t smallest_palette = 256 * palette_entry_bytes;

// Required: the size comes from the place of the pixel array, never from the header's colour count, and a 16-bit entry
// count above 32767 is negative (docs/oddities.md, "Palettes").
int32_t palette_bytes(uint32_t pixel_data_offset) {
    constexpr int32_t default_entries = 13;
    if (pixel_data_offset <= bmp_header_bytes) return default_entries * palette_entry_bytes;
    const auto entries = static_cast<int16_t>((pixel_data_offset - bmp_header_bytes) >> 2 & 0xFFFF);
    return entries * palette_entry_bytes;
}

SetUp read_palette(BmpState &state, const BmpHeader &header, InputSource &input) {
    const int32_t bytes = palette_bytes(header.pixel_data_offset);
    if (bytes < 0) return SetUp::refused;
    const auto block = static_cast<uint32_t>(std::max(bytes, smallest_palette));
    state.palette = allocate_array<uint8_t>(block);
    if (state.palette == nullptr) return SetUp::refused;
    ZOTARPELM_OsMemset(state.palette, 0, block);
    if (bytes == 0) return SetUp::done;

    if (input.kind == PELM_SOURCE_MEMORY) {
        const int32_t there = std::min(bytes, input.size - bmp_header_bytes);
        if (there > 0) ZOTARPELM_OsMemcpy(state.palette, input.data + bmp_header_bytes, static_cast<uint32_t>(there));
        return SetUp::done;
    }
    // Required: a short palette leaves the record and the palette allocated (docs/oddities.md, "Refusals that leak").
    return ZOTARPELM_Read_IO(&input, state.palette, bytes) < bytes ? SetUp::abandoned : SetUp::done;
}

struct Masks {
    uint32_t red, green, blue;
    uint32_t red_shift, green_shift, blue_shift; // to the channel's place in an RGB565 value
};

constexpr Masks masks_555 = {0x7C00, 0x03E0, 0x001F, 1, 1, 0};
constexpr Masks accepted_masks[] = {
    {0xF800, 0x07E0, 0x001F, 0, 0, 0},
    masks_555,
    {0x0F00, 0x00F0, 0x000F, 4, 3, 1},
};

void use_masks(BmpState &state, const Masks &masks) {
    state.redMask = masks.red;
    state.greenMask = masks.green;
    state.blueMask = masks.blue;
    state.redShift = masks.red_shift;
    state.greenShift = masks.green_shift;
    state.blueShift = masks.blue_shift;
}

SetUp read_mask(InputSource &input, int32_t offset, uint32_t &mask) {
    uint8_t bytes[4];
    if (input.kind == PELM_SOURCE_MEMORY) {
        if (input.size < offset + 4) return SetUp::refused;
        mask = read_u32le(input.data + offset);
        return SetUp::done;
    }
    // Required: short masks leave the record allocated (docs/oddities.md, "Refusals that leak").
    if (ZOTARPELM_Read_IO(&input, bytes, 4) < 4) return SetUp::abandoned;
    mask = read_u32le(bytes);
    return SetUp::done;
}

SetUp read_masks(BmpState &state, InputSource &input) {
    uint32_t masks[3] = {};
    int32_t offset = bmp_header_bytes;
    for (uint32_t &mask : masks) {
        const SetUp got = read_mask(input, offset, mask);
        if (got != SetUp::done) return got;
        offset += 4;
    }
    for (const Masks &known : accepted_masks) {
        if (masks[0] != known.red || masks[1] != known.green || masks[2] != known.blue) continue;
        use_masks(state, known);
        return SetUp::done;
    }
    return SetUp::refused;
}

} // namespace

SetUp read_colours(BmpState &state, const BmpHeader &header, InputSource &input) {
    switch (header.bits_per_pixel) {
    case 1:
    case 4:
    case 8: return read_palette(state, header, input);
    case 16: break;
    default: return SetUp::done;
    }
    if (header.compression == 0) {
        use_masks(state, masks_555);
        return SetUp::done;
    }
    return read_masks(state, input);
}

} // namespace pelm

#include "bmp/colours.h"

#include <algorithm>

#include "frame/bytes.h"
#include "frame/memory.h"

namespace pelm {
namespace {

constexpr int32_t palette_entry_bytes = 4;

// Every index finds an entry, however few the file brings: pixels are not checked against their number.
constexpr int32_t smallest_palette = 256 * palette_entry_bytes;

constexpr int32_t palette_bytes(int32_t entries) {
    return static_cast<int16_t>(entries) * palette_entry_bytes;
}

// Required: the size comes from the place of the pixel array, never from the header's colour count, and a 16-bit entry
// count above 32767 is negative (docs/oddities.md, "Palettes"). In two steps there is no default, and the count is
// rounded towards zero (docs/oddities.md, "Headers in two steps").
int32_t palette_bytes(uint32_t pixel_data_offset, Calls calls) {
    constexpr uint32_t palette_start = bmp_header_bytes;
    constexpr int32_t default_entries = 13;
    const uint32_t room = pixel_data_offset - palette_start;
    if (calls == Calls::two_step) return palette_bytes(static_cast<int32_t>(room) / palette_entry_bytes);
    return palette_bytes(pixel_data_offset <= palette_start ? default_entries : static_cast<int32_t>(room >> 2));
}

// `count` bytes of a memory source as far as it has them; the rest of `bytes` stays as it is.
void copy_as_far_as_there(const InputSource &input, int32_t offset, uint8_t *bytes, int32_t count) {
    const int32_t there = std::min(count, std::max(input.size, offset) - offset);
    if (there > 0) ZOTARPELM_OsMemcpy(bytes, input.data + offset, static_cast<uint32_t>(there));
}

SetUp read_palette(BmpState &state, const BmpHeader &header, InputSource &input, Calls calls) {
    const int32_t bytes = palette_bytes(header.pixel_data_offset, calls);
    if (bytes < 0) return SetUp::refused;
    const auto block = static_cast<uint32_t>(std::max(bytes, smallest_palette));
    state.palette = allocate_array<uint8_t>(block);
    if (state.palette == nullptr) return SetUp::refused;
    ZOTARPELM_OsMemset(state.palette, 0, block);
    if (bytes == 0) return SetUp::done;

    if (input.kind == PELM_SOURCE_MEMORY) {
        copy_as_far_as_there(input, bmp_header_bytes, state.palette, bytes);
        return SetUp::done;
    }
    const int32_t got = read_or_zeros(input, state.palette, bytes);
    // Required: a short palette leaves the record and the palette allocated (docs/oddities.md, "Refusals that leak").
    return got < bytes && calls == Calls::direct ? SetUp::abandoned : SetUp::done;
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

SetUp read_mask(InputSource &input, int32_t offset, uint32_t &mask, Calls calls) {
    uint8_t bytes[4] = {};
    if (input.kind == PELM_SOURCE_MEMORY) {
        if (input.size < offset + 4 && calls == Calls::direct) return SetUp::refused;
        copy_as_far_as_there(input, offset, bytes, 4);
    } else if (ZOTARPELM_Read_IO(&input, bytes, 4) < 4 && calls == Calls::direct) {
        // Required: short masks leave the record allocated (docs/oddities.md, "Refusals that leak").
        return SetUp::abandoned;
    }
    mask = read_u32le(bytes);
    return SetUp::done;
}

SetUp read_masks(BmpState &state, InputSource &input, Calls calls) {
    uint32_t masks[3] = {};
    int32_t offset = bmp_header_bytes;
    for (uint32_t &mask : masks) {
        const SetUp got = read_mask(input, offset, mask, calls);
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

SetUp read_colours(BmpState &state, const BmpHeader &header, InputSource &input, Calls calls) {
    switch (header.bits_per_pixel) {
    case 1:
    case 4:
    case 8: return read_palette(state, header, input, calls);
    case 16: break;
    default: return SetUp::done;
    }
    if (header.compression == 0) {
        use_masks(state, masks_555);
        return SetUp::done;
    }
    return read_masks(state, input, calls);
}

} // namespace pelm

// The tRNS chunk: an alpha per palette entry, or one colour that is transparent.
#include <algorithm>

#include "frame/bytes.h"
#include "png/chunks.h"

namespace {

using namespace pelm;

constexpr uint32_t alphas_per_entry = 3; // room in paletteAlpha

// Required: alphas without an entry are passed over, the others count (docs/oddities.md, "Alphas beyond the palette").
uint32_t read_palette_alphas(PngDecodeState &state, PngInputBuffer &input, uint32_t length) {
    const uint32_t room = alphas_per_entry * state.paletteCount;
    for (uint32_t i = 0; i < length; ++i) {
        uint8_t alpha = 0;
        if (!read_byte(input, alpha)) return PNG_FORMAT_ERROR;
        if (i < room) state.paletteAlpha[i] = alpha;
    }
    return PNG_DONE;
}

// Required: at 16 bits a grey key keeps the low byte of its sample, and narrow keys are widened with zeros while
// narrow samples are not compared with keys at all (docs/oddities.md, "Colour keys of narrow grey images").
uint16_t grey_key(uint8_t low_byte, uint8_t depth) {
    switch (depth) {
    case 1: return low_byte != 0 ? 255 : 0;
    case 2:
    case 4: return static_cast<uint16_t>(low_byte << (8 - depth));
    default: return low_byte;
    }
}

uint32_t read_grey_key(const PngDecodeState &state, PngInputBuffer &input, uint32_t length, PngDecodeState &target) {
    if (length != 2) return PNG_BAD_DATA;
    if (!have_bytes(input, 2)) return PNG_FORMAT_ERROR;
    const uint8_t *const bytes = take(input, 2);
    const uint16_t key = grey_key(bytes[1], state.bitDepth);
    target.transparentKeyRed = target.transparentKeyGreen = target.transparentKeyBlue = key;
    for (uint16_t &sample : target.transparentSamples)
        sample = read_u16be(bytes);
    return PNG_DONE;
}

// Required: at 8 bits a key is compared in all its bits (docs/oddities.md, "Colour keys above 255").
uint32_t read_rgb_key(const PngDecodeState &state, PngInputBuffer &input, uint32_t length, PngDecodeState &target) {
    if (length != 6) return PNG_BAD_DATA;
    if (!have_bytes(input, 6)) return PNG_FORMAT_ERROR;
    const uint8_t *const bytes = take(input, 6);
    for (uint32_t i = 0; i < 3; ++i)
        target.transparentSamples[i] = read_u16be(bytes + 2 * i);
    const int32_t shift = state.bitDepth == 16 ? 8 : 0;
    target.transparentKeyRed = static_cast<uint16_t>(target.transparentSamples[0] >> shift);
    target.transparentKeyGreen = static_cast<uint16_t>(target.transparentSamples[1] >> shift);
    target.transparentKeyBlue = static_cast<uint16_t>(target.transparentSamples[2] >> shift);
    return PNG_DONE;
}

} // namespace

uint32_t __PELMI_PngParseTRNSbKGd(PngDecodeState *keyRecord, PngInputBuffer *input, uint32_t chunkLength, uint32_t,
                                  PngDecodeState *keyTarget) {
    if ((keyRecord->chunkSeenFlags & PNG_SEEN_IHDR) == 0) return PNG_TRNS_BEFORE_IHDR;
    switch (keyRecord->colourType) {
    case 0: return read_grey_key(*keyRecord, *input, chunkLength, *keyTarget);
    case 2: return read_rgb_key(*keyRecord, *input, chunkLength, *keyTarget);
    case 3:
        if ((keyRecord->chunkSeenFlags & PNG_SEEN_PLTE) == 0) return PNG_BAD_DATA;
        return read_palette_alphas(*keyRecord, *input, chunkLength);
    default: return PNG_BAD_DATA;
    }
}

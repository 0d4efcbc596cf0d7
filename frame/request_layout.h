// The caller-owned records lie on exact 32-bit words where pointers are 32 bits wide; hosts of that architecture
// address them by word number.
#pragma once

#include <cstddef>

#include "PelmImageDecoder.h"

namespace pelm {

// True where `offset` is that of the given 32-bit word, or where the rule does not apply.
constexpr bool lies_on_word(size_t offset, size_t word) {
    return sizeof(void *) != 4 || offset == 4 * word;
}

static_assert(lies_on_word(offsetof(InputSource, kind), 0));
static_assert(lies_on_word(offsetof(InputSource, data), 1));
static_assert(lies_on_word(offsetof(InputSource, hostContext), 2));
static_assert(lies_on_word(offsetof(InputSource, size), 3));
static_assert(lies_on_word(offsetof(InputSource, consumed), 4));
static_assert(lies_on_word(offsetof(InputSource, hostPosition), 5));
static_assert(lies_on_word(offsetof(InputSource, bufferSize), 6));
static_assert(lies_on_word(sizeof(InputSource), 7));

static_assert(lies_on_word(offsetof(ImageDecodeInfo, input), 0));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, outputFormat), 1));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, flags), 2));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, reserved3), 3));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, reserved4), 4));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, imageWidth), 5));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, imageHeight), 6));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, outputWidth), 7));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, outputHeight), 8));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, decodeStarted), 9));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, preInitMode), 10));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, reserved11), 11));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, reserved12), 12));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, reserved13), 13));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, hasTransparency), 14));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, decoderState), 15));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, reserved16), 16));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, iterative), 17));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, frameDelay), 18));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, colorTableState), 19));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, globalColorTable), 20));
static_assert(lies_on_word(offsetof(ImageDecodeInfo, localColorTable), 21));
static_assert(lies_on_word(sizeof(ImageDecodeInfo), 22));

} // namespace pelm

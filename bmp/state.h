// The private record of a BMP decode, which hangs from `decoderState`. How a row of pixels is stored in the file is
// known to the readers, not to the record.
#pragma once

#include "frame/clip.h"
#include "frame/export.h"
#include "frame/request_layout.h"

// Of a decode that has its output.
struct BmpOutput {
    OutputBuffer buffer;
    int32_t stagingBytes; // kinds 0 and 2: of InputSource.data, whatever the caller makes of bufferSize later
    int64_t cursorCarry;  // what outputCursor has no room for: a multiple of 2^32, and 0 on 64-bit systems
};

// Allocated with ZOTARPELM_OsMalloc and zeroed. On a 32-bit system: 40 words in this order.
struct BmpState {
    int32_t width;  // stored image, in pixels; above 0 once set up
    int32_t height; // absolute; may be 0
    uint16_t bitsPerPixel;
    uint32_t pixelDataOffset; // file offset of the pixel array, as the header says
    uint32_t compression;     // 1 or 2: rows are run-length codes where the depth is 8 or 4; set in two steps only
    uint8_t *palette;         // blue, green, red, reserved; at least 256 entries, or NULL at depths without one
    uint32_t redMask;         // 16 bits per pixel: the colour's bits in a pixel ...
    uint32_t greenMask;
    uint32_t blueMask;
    uint32_t redShift; // ... and the left shift that moves them to their place in an RGB565 value
    uint32_t greenShift;
    uint32_t blueShift;
    int32_t scaledWidth; // image in the output, in the image's own orientation
    int32_t scaledHeight;
    uint32_t *accumulators;  // 2 rows of scaledWidth words, or NULL when scaledWidth is not above 0
    uint32_t oneToOne;       // 1: written pixel for pixel
    int32_t requestedWidth;  // the box width of the call; while parked the height over the sample divisor
    int32_t requestedHeight; // the box height; in two steps only
    int32_t rotation;        // clockwise degrees: 0, 90, 180 or 270
    int32_t rowStep;         // bytes from an image row to the next one in the output; negated for top-down files
    int32_t pixelStep;       // from an image pixel to the next one: in pixels for RGB565, otherwise in bytes
    uint32_t topDown;        // 1: the first stored row is the top one
    intptr_t outputCursor;   // byte offset, from the start of the output buffer, of the first pixel of the first image
                             // row of the band. An offset, for it may lie outside the buffer
    InputSource *input;
    uint32_t outputFormat;
    int32_t rowsDone; // output rows of earlier bands
    union {
        uint8_t headerCopy[54]; // a parked record's file header, before the output is known
        BmpOutput output;       // afterwards
    };
};

static_assert(pelm::lies_on_word(offsetof(BmpState, width), 0));
static_assert(pelm::lies_on_word(offsetof(BmpState, height), 1));
static_assert(pelm::lies_on_word(offsetof(BmpState, bitsPerPixel), 2));
static_assert(pelm::lies_on_word(offsetof(BmpState, pixelDataOffset), 3));
static_assert(pelm::lies_on_word(offsetof(BmpState, compression), 4));
static_assert(pelm::lies_on_word(offsetof(BmpState, palette), 5));
static_assert(pelm::lies_on_word(offsetof(BmpState, redMask), 6));
static_assert(pelm::lies_on_word(offsetof(BmpState, redShift), 9));
static_assert(pelm::lies_on_word(offsetof(BmpState, scaledWidth), 12));
static_assert(pelm::lies_on_word(offsetof(BmpState, scaledHeight), 13));
static_assert(pelm::lies_on_word(offsetof(BmpState, accumulators), 14));
static_assert(pelm::lies_on_word(offsetof(BmpState, oneToOne), 15));
static_assert(pelm::lies_on_word(offsetof(BmpState, requestedWidth), 16));
static_assert(pelm::lies_on_word(offsetof(BmpState, requestedHeight), 17));
static_assert(pelm::lies_on_word(offsetof(BmpState, rotation), 18));
static_assert(pelm::lies_on_word(offsetof(BmpState, rowStep), 19));
static_assert(pelm::lies_on_word(offsetof(BmpState, pixelStep), 20));
static_assert(pelm::lies_on_word(offsetof(BmpState, topDown), 21));
static_assert(pelm::lies_on_word(offsetof(BmpState, outputCursor), 22));
static_assert(pelm::lies_on_word(offsetof(BmpState, input), 23));
static_assert(pelm::lies_on_word(offsetof(BmpState, outputFormat), 24));
static_assert(pelm::lies_on_word(offsetof(BmpState, rowsDone), 25));
static_assert(pelm::lies_on_word(offsetof(BmpState, headerCopy), 26));
static_assert(pelm::lies_on_word(sizeof(BmpState), 40));

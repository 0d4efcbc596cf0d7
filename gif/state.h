// The private records of a GIF decode, which hang from `decoderState`.
#pragma once

#include "frame/clip.h"
#include "frame/export.h"
#include "frame/request_layout.h"

constexpr int32_t gif_input_bytes = 16384;
constexpr int32_t gif_table_entries = 4096; // of the string table: codes have 12 bits at most

// The buffered reader that all GIF input goes through.
struct GifInput {
    int32_t bytesLeft; // unread ones from `cursor` on
    uint8_t *cursor;
    uint8_t *buffer; // gif_input_bytes
    InputSource *source;
};

static_assert(pelm::lies_on_word(sizeof(GifInput), 4));

// Strings of the LZW code, each as another code's string and one more pixel. gif_table_entries of each.
struct GifLzwTables {
    uint32_t *prefix; // the code that this one extends
    uint8_t *suffix;  // its last pixel
    uint32_t *length; // pixels
};

static_assert(pelm::lies_on_word(sizeof(GifLzwTables), 3));

// The same strings, cut into groups of eight pixels: gif/lzw/fast_strings.h.
struct GifFastStrings {
    uint64_t group[gif_table_entries];
    uint32_t link[gif_table_entries];
};

// One allocation: what GifLzwTables.length points to, and room behind it.
struct GifStringLengths {
    uint32_t length[gif_table_entries];
    GifFastStrings fast;
};

// Which calls a parked record belongs to: no others go on with it.
enum GifCalls : uint32_t { GIF_ONE_SHOT, GIF_ITERATIVE, GIF_BY_LINES, GIF_BY_FRAMES, GIF_FRAMES_ITERATIVE };

enum GifPhase : uint32_t { GIF_FRAME_FOUND = 0, GIF_BETWEEN_FRAMES = 1, GIF_IN_FRAME = 2 };

// Whether an image goes on, or what the next driver call gives.
enum GifEnding : uint32_t { GIF_GOES_ON = 0, GIF_ENDED, GIF_FAILED };

// Allocated with ZOTARPELM_OsMalloc and zeroed. On a 32-bit system: 62 words in this order. A packed colour is
// R << 20 | G << 10 | B.
struct GifDecoderState {
    int32_t screenWidth; // the logical screen, in pixels; neither side is 0
    int32_t screenHeight;
    uint32_t colorResolution;
    uint32_t backgroundIndex;
    uint32_t aspectRatio;
    uint32_t *globalTable; // 256 packed colours
    int32_t imageLeft;     // the current image on the screen
    int32_t imageTop;
    int32_t imageWidth;
    int32_t imageHeight;
    uint32_t interlaced;  // the pass being drawn, 1 to 4; 0 otherwise
    uint32_t *localTable; // 256 packed colours
    uint32_t lzwMinCodeSize;
    uint32_t disposal; // these four: of the latest graphic control, also when it came before an earlier image
    uint32_t hasTransparency;
    int32_t transparentIndex; // or -1
    uint32_t delayMs;
    uint32_t *activeTable; // one of the two
    GifLzwTables *lzw;
    uint32_t outputFormat;
    int32_t savedPixelCount; // decoded pixels that wait in pixelBuffer
    uint8_t *pixelBuffer;    // a row of the wider of screen and image, and room for a string
    GifInput *input;
    int32_t requestedWidth; // the width argument of the call
    int32_t scaledWidth;    // the screen in the output, in its own orientation; may be 0 or below
    int32_t scaledHeight;
    uint32_t oneToOne;
    int32_t rotation; // clockwise degrees: 0, 90, 180 or 270
    int32_t rowStep;  // in the output, from a row to the next one: in pixels for the 16-bit formats, otherwise in bytes
    int32_t pixelStep;     // from a pixel to the next one, in the same units
    int32_t sourceRow;     // screen row of the next image row
    intptr_t outputStart;  // byte offset, from the start of the output buffer, of the first pixel of the first row. An
                           // offset, for it may lie outside the buffer
    void *frameLineBuffer; // stays NULL
    uint32_t *canvas;      // animations: the screen as packed colours, gif_never_painted at first
    uint32_t *rowBuffer;   // animations: the composed row; screenWidth packed colours
    uint32_t animated;
    int32_t rowsOut;        // line calls: output rows of this call so far
    uint32_t savedPrevCode; // the LZW decoder between calls
    uint32_t savedCode;
    uint32_t savedFirstPixel;
    uint32_t savedCodeSize;
    uint32_t savedNextCode;
    int32_t savedRowsDone;
    uint32_t savedBitCount;
    uint32_t savedBitBuffer;
    int32_t savedBlockLeft;
    uint8_t *rawTableCopy;     // 1024 bytes for the colour tables as they are in the file, or NULL
    int32_t pixelBufferWidth;  // pixels of a row that pixelBuffer has room for
    int64_t samplePosition;    // line calls: the next output row's place, in units of a screen row's scaledHeight-th
    OutputBuffer output;       // of the first call; line calls: of the current one
    const uint32_t *canvasRow; // animations: the packed colours that the row writers read
    GifPhase framePhase;
    GifCalls startedBy;
    GifEnding ending;
    GifFastStrings *fastStrings; // NULL: every image is decoded by the careful loop alone
    uint32_t usesFastStrings;    // 1 as long as the current image's data is as encoders write it
    uint32_t savedFilled;
    uint32_t *finishedTable;     // 256 pixels of the output format: behind the local table
    uint32_t coloursAreFinished; // 1 once they are those of the current image
    uint32_t reserved[1];
};

// A canvas pixel that no frame has painted.
constexpr uint32_t gif_never_painted = 0xFFFFFFFF;

static_assert(pelm::lies_on_word(offsetof(GifDecoderState, screenWidth), 0));
static_assert(pelm::lies_on_word(offsetof(GifDecoderState, globalTable), 5));
static_assert(pelm::lies_on_word(offsetof(GifDecoderState, interlaced), 10));
static_assert(pelm::lies_on_word(offsetof(GifDecoderState, lzwMinCodeSize), 12));
static_assert(pelm::lies_on_word(offsetof(GifDecoderState, activeTable), 17));
static_assert(pelm::lies_on_word(offsetof(GifDecoderState, savedPixelCount), 20));
static_assert(pelm::lies_on_word(offsetof(GifDecoderState, input), 22));
static_assert(pelm::lies_on_word(offsetof(GifDecoderState, requestedWidth), 23));
static_assert(pelm::lies_on_word(offsetof(GifDecoderState, rowStep), 28));
static_assert(pelm::lies_on_word(offsetof(GifDecoderState, outputStart), 31));
static_assert(pelm::lies_on_word(offsetof(GifDecoderState, canvas), 33));
static_assert(pelm::lies_on_word(offsetof(GifDecoderState, rowsOut), 36));
static_assert(pelm::lies_on_word(offsetof(GifDecoderState, savedPrevCode), 37));
static_assert(pelm::lies_on_word(offsetof(GifDecoderState, savedBlockLeft), 45));
static_assert(pelm::lies_on_word(offsetof(GifDecoderState, rawTableCopy), 46));
static_assert(pelm::lies_on_word(offsetof(GifDecoderState, samplePosition), 48));
static_assert(pelm::lies_on_word(sizeof(GifDecoderState), 62));

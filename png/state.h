// The private records of a PNG decode, which hang from `decoderState`, and the decoder's internal result codes.
#pragma once

#include "frame/clip.h"
#include "frame/export.h"
#include "frame/request_layout.h"
#include "png/inflate/state.h"

// Results that pass between the decoder's own functions. The public calls map them.
enum PngCode : uint32_t {
    PNG_NO_LOOKUP_MEMORY = 0,
    PNG_DONE = 1,
    PNG_TRNS_BEFORE_IHDR = 3,
    PNG_BAD_DATA = 6,
    PNG_NO_MEMORY = 7, // or a file that cannot be parsed, as the driver reports it
    PNG_STOPPED = 8,   // by the host; in the parser: format error
    PNG_FORMAT_ERROR = 8,
    PNG_ROWS_REMAIN = 9,
    PNG_BAD_LINE_REQUEST = 10,
    PNG_INPUT_ENDED = 11,
    PNG_ENDED_EARLY = 12
};

constexpr uint32_t PNG_READ_BUFFER_SIZE = 16384;
constexpr uint32_t IDAT_TABLE_STEP = 2048; // entries

enum : uint32_t { PNG_SEEN_IHDR = 1, PNG_SEEN_PLTE = 2 };
enum : uint32_t { PNG_HAS_TRNS = 0x1000 };

// The sums of the output row in progress. While nothing can be seen they are not brought up to date: a later call may
// want them, and makes up for it.
enum : uint32_t {
    PNG_SUMS_HOLD = 0,
    PNG_SUMS_ARE_OLD = 1,    // to be cleared
    PNG_SUMS_LACK_A_LINE = 2 // to be cleared; then line 0, from the row in resizeRowAccum, comes first
};

// One IDAT chunk.
struct PngIdatEntry {
    uint32_t length; // of its data; streams count it down as they read
    union {
        uint8_t *memoryAddress; // memory: the first data byte
        uintptr_t wholeLength;  // streams: what `length` began with, for a decode that starts over
    };
    uint32_t sourceOffset; // streams: of the first data byte; memory: 0
};

static_assert(pelm::lies_on_word(sizeof(PngIdatEntry), 3));

// The buffered reader that all PNG input goes through. For memory `data` is the caller's and everything counts as
// buffered from the start.
struct PngInputBuffer {
    InputSource *source;
    uint32_t sourceEnd;   // offset in the source behind the last byte read into `data`
    uint32_t bufferStart; // offset noted for data[0]; too large by the carried bytes after a top-up
    uint32_t sourceSize;
    uint32_t readPos;   // of the next unread byte in `data`
    uint32_t bytesLeft; // unread ones from there on
    uint8_t *data;      // PNG_READ_BUFFER_SIZE bytes, or the caller's memory
};

static_assert(pelm::lies_on_word(sizeof(PngInputBuffer), 7));

struct PngSamplePoint {
    uint32_t x, y;
};

namespace pelm {
struct FinishedColours;
}

// Fills the record up to the size that hosts of 32-bit systems account for.
constexpr size_t png_state_fill = 150;

// Allocated with ZOTARPELM_OsMalloc and zeroed.
struct PngDecodeState {
    uint16_t transparentKeyRed; // tRNS, as 8-bit samples are compared with it
    uint16_t transparentKeyGreen;
    uint16_t transparentKeyBlue;
    uint32_t isOneToOne;
    uint32_t hasAlphaChannel;
    uint32_t imageWidth; // while Adam7 rows are decoded: of the pass
    uint32_t imageHeight;
    uint8_t bitDepth;
    uint8_t colourType;
    uint8_t interlaceMethod; // while Adam7 rows are decoded: the pass, 1 to 8
    uint16_t *paletteAlpha;  // per entry: 0xFFFF or the tRNS byte; 3 x paletteCount entries
    uint32_t idatTotalBytes;
    uint8_t *palette; // 256 RGB triplets
    uint32_t paletteCount;
    const uint8_t *currentRow; // the unfiltered row that the pixel writer reads
    uint32_t ancillaryFlags;   // PNG_HAS_TRNS
    uint32_t chunkSeenFlags;
    uint8_t bitsPerPixel;
    uint8_t bytesPerPixel; // at least 1: the filters' distance
    PngIdatEntry *idatTable;
    uint32_t idatCount;
    uint32_t idatCapacity;
    uint32_t outputFormat;
    uint32_t outputStride;  // pixels per row of the caller's buffer
    uint32_t outputOffsetX; // of the placed image in the buffer; 32-bit two's complement
    uint32_t outputOffsetY;
    uint32_t scaledWidth; // in the image's own orientation
    uint32_t scaledHeight;

    // The image-data loops.
    uint8_t *rowBuffers;             // finished colours, two or three rows and room, one allocation
    pelm::FinishedColours *finished; // there; NULL: they are not
    uint8_t *zeroRow;                // Adam7
    pelm::InflateState inflate;
    uint8_t *rowNow; // the one being filled, filter byte first
    uint8_t *rowBefore;
    uint8_t *rowAhead;        // a third one, NULL for very long rows
    uint32_t rowAheadIsDone;  // it holds the row that rowNow is being filled with, reconstructed
    uint32_t rowFilled;       // bytes of it so far
    uint32_t rowLength;       // filter byte included
    uint32_t idatIndexed;     // entries of idatTable; idatCount counts down as streams use them up
    uint32_t idatIndex;       // the entry being read
    uint32_t resumePoint;     // 1 to 4: rows done; 5: block ended; 0: the stream starts over
    const uint8_t *inputNext; // memory: the next compressed byte
    uint32_t skipStatusCheck; // the host is not polled
    uint32_t wholeWidth;      // of the image, whatever pass imageWidth and imageHeight stand for
    uint32_t wholeHeight;
    uint32_t passRow;               // Adam7: index of the row being filled
    uint16_t transparentSamples[3]; // tRNS at full width
    uint8_t readsMemory;            // the decode began with a memory source
    uint8_t idatJoined;
    uint8_t exactPlacement;
    OutputBuffer output; // of the current call
    uint32_t exactRows;  // rows of scaledWidth pixels that an exact buffer has
    uint32_t bandBase;   // output row that the first row of the current call's buffer shows (scaled)
    uint32_t sums;       // PNG_SUMS_: what resizeOutAccum is worth
    uint32_t reserved[png_state_fill];

    PngSamplePoint samplePoints[4];
    uint32_t sourceX; // running source positions of the scaled grey path
    uint32_t sourceY;
    uint32_t rowsWritten; // calls of the pixel writer
    uint32_t rowFlag;
    uint32_t rowsDone;
    uint32_t stopRow; // 0: no line mode
    uint32_t firstRowOfCall;
    // For who calls the frame writer; decodes themselves reckon in 64 bits.
    intptr_t outputCursor; // byte offset in the caller's buffer of the pixel that shows image pixel (0, 0)
    int32_t outputRowStep;
    int32_t outputPixelStep;  // RGB565: in 16-bit units
    uint32_t *resizeRowAccum; // imageWidth words; may be NULL
    uint32_t *resizeOutAccum; // scaledWidth words; may be NULL
    uint32_t resizeState;     // 0, 1: the sample line of output row rowsDone that comes next
    uint32_t *interlaceFrame;
    uint32_t interlaceFrameUsed;
    HuffmanNodePool *fixedHuffmanPool;
    HuffmanNodePool *dynamicHuffmanPool;
    PngInputBuffer *input;
    uint32_t iterativeMode;
    uint32_t rotationDegrees;
};

static_assert(pelm::lies_on_word(sizeof(PngDecodeState), 244));

/*
 * Still-image decoders for BMP, WBMP, PNG and GIF: the caller-owned records and the public calls.
 *
 * A decode is one request (ImageDecodeInfo) that names an input (InputSource), an output format, a rotation and a
 * placement; a call decodes it straight into a buffer of the caller. Zero both records before the first use. The
 * InputSource stays where and as it is, and open, from a decode's first call to its end, and `decoderState` is passed
 * only to calls of the family that has set it: nothing checks that. `outputFormat` and `flags` count on a decode's
 * first call only (in two steps on the second one): its later calls write what that one asked for, whatever they say.
 * While a decode is in progress its source is not for other calls: they move it, and a one-shot call for BMP or WBMP
 * takes a stream's buffer away, so that memory is lost and rows are missing. ZOTARPELMI_PreInitBMP loses the decode of
 * its request. The library allocates, reads and polls only through the host services that PelmHost.h declares.
 *
 * Every call runs on the caller's thread. Decodes with separate requests and sources never disturb each other.
 */
#ifndef PELM_IMAGE_DECODER_H
#define PELM_IMAGE_DECODER_H

#include <stdint.h>

#if defined(__GNUC__)
#define PELM_API __attribute__((visibility("default")))
#else
#define PELM_API
#endif

#ifdef __cplusplus
extern "C" {
#endif

/* What a public call returns. */
enum {
    PELM_RESULT_FAILED = 0,     /* bad or unsupported input, no input, or no memory */
    PELM_RESULT_DONE = 1,       /* the image, or the rows asked for, have been written */
    PELM_RESULT_LAST_FRAME = 3, /* animated GIF: the last frame has been delivered */
    PELM_RESULT_MORE = 4,       /* iterative calls: rows were written and more remain */
    PELM_RESULT_DATA_ENDED = 5  /* BMP line call: a read gave nothing although the source holds more */
};

/* How the decoders reach the encoded bytes: InputSource.kind. */
enum {
    PELM_SOURCE_STREAM = 0,     /* read and seek services */
    PELM_SOURCE_MEMORY = 1,     /* `size` bytes at `data`, read in place */
    PELM_SOURCE_STREAM_ALT = 2, /* the same as 0 */
    PELM_SOURCE_SEQUENTIAL = 4  /* read only, never moved while BMP rows are decoded; PNG needs seeks here too */
};

/*
 * Output pixel formats: ImageDecodeInfo.outputFormat. Named in the order of bytes in memory, except for the 16-bit
 * ones, which are values in native byte order. BMP and PNG write 0, 1, 5, 6, 7 and 8, WBMP 0, 1, 7 and 8. A code that a
 * decoder does not write is not refused: the call succeeds and the output stays as it was. Only WBMP fails then.
 */
enum {
    PELM_FORMAT_RGB565 = 0,    /* 2 bytes: (R >> 3) << 11 | (G >> 2) << 5 | (B >> 3) */
    PELM_FORMAT_RGB888 = 1,    /* 3 bytes: R, G, B */
    PELM_FORMAT_ARGB8888 = 5,  /* 4 bytes: alpha, R, G, B */
    PELM_FORMAT_RGB565_A8 = 6, /* 3 bytes: RGB565 low byte, RGB565 high byte, alpha */
    PELM_FORMAT_RGBA8888 = 7,  /* 4 bytes: R, G, B, alpha */
    PELM_FORMAT_BGRA8888 = 8,  /* 4 bytes: B, G, R, alpha */
    PELM_FORMAT_BGR565 = 10,   /* 2 bytes: (B >> 3) << 11 | (G >> 2) << 5 | (R >> 3); GIF only */
    PELM_FORMAT_BGR888 = 11,   /* 3 bytes: B, G, R; GIF only */
    PELM_FORMAT_BGRX8888 = 12  /* 4 bytes: B, G, R, 255; GIF only */
};

/* ImageDecodeInfo.flags: one rotation, clockwise, and one placement. */
enum {
    PELM_ROTATE_0 = 0x0,
    PELM_ROTATE_90 = 0x4,
    PELM_ROTATE_180 = 0x8,
    PELM_ROTATE_270 = 0xC,
    PELM_ROTATE_MASK = 0xC,

    PELM_PLACE_FIT = 0x000,     /* reduce to fit the box (never enlarge), keep the aspect, centre; other values, too */
    PELM_PLACE_EXACT = 0x100,   /* reduce as for FIT; the buffer holds exactly the scaled image, in rows of its width */
    PELM_PLACE_STRETCH = 0x700, /* exactly the box, both ways, without keeping the aspect */
    PELM_PLACE_MASK = 0x700,

    PELM_INTERLACE_FRAME = 0x1000, /* PNG: collect an interlaced image in a whole-frame buffer before writing it */
    PELM_INTERLACE_MASK = 0x3000
};

/*
 * Where the encoded bytes come from. Owned by the caller, shared with the host services. On a 32-bit system every
 * field is one 32-bit word, in this order.
 */
typedef struct InputSource {
    uint32_t kind;     /* PELM_SOURCE_ */
    uint8_t *data;     /* kind 1: the caller's bytes. Kinds 0 and 2: a staging buffer that the library allocates
                          and frees; the caller neither sets nor frees it, except for ZOTARPELMI_DecodeBMPSKIA (WBMP,
                          kind 0: NULL after every call) */
    void *hostContext; /* the host services' own */
    int32_t size;      /* bytes at `data` (kind 1), or in the whole stream */
    int32_t consumed; /* bytes delivered so far, written by the host services (and PNG). A read that gives nothing while
                         consumed == size is an end of data, otherwise a failed read */
    int32_t hostPosition; /* the host services' own */
    int32_t bufferSize;   /* kinds 0, 2 and 4: proposed size of the buffer for row reads, in bytes. BMP rounds it
                             down to whole rows, or up to one, and writes it back (kinds 0 and 2); with a caller's
                             buffer it uses whole rows, and the word stays */
} InputSource;

/*
 * One decode request. Owned by the caller; on a 32-bit system every field is one 32-bit word, in this order.
 * The caller sets `input`, `outputFormat` and `flags`; the rest is the library's, but for what a call says it reads.
 */
typedef struct ImageDecodeInfo {
    InputSource *input;
    uint32_t outputFormat; /* PELM_FORMAT_ */
    uint32_t flags;        /* PELM_ROTATE_ | PELM_PLACE_ | PELM_INTERLACE_FRAME */
    uint32_t reserved3;
    uint32_t reserved4;
    int32_t imageWidth; /* stored image, in pixels: ZOTARPELMI_PreInitBMP tells it */
    int32_t imageHeight;
    int32_t outputWidth; /* image after scaling, in pixels, measured in the image's own orientation */
    int32_t outputHeight;
    uint32_t decodeStarted; /* 1 once a decode has begun */
    uint32_t preInitMode;
    uint32_t reserved11;
    uint32_t reserved12;
    uint32_t reserved13;
    uint32_t hasTransparency; /* GIF: 1 when the image uses a transparent colour. One-shot and iterative calls of still
                                 images set it; ZOTARPELMI_DecodeAGIFIter does behind a frame, for the next one */
    void *decoderState;       /* the format's own state between calls; NULL when no decode is in progress */
    uint32_t reserved16;
    uint32_t iterative;       /* PNG: 1 during iterative calls */
    uint32_t frameDelay;      /* animated GIF: delay of the current frame in milliseconds */
    uint32_t colorTableState; /* animated GIF: 1 when the current frame has a colour table of its own */
    void *globalColorTable;   /* animated GIF: 1024 bytes */
    void *localColorTable;    /* animated GIF: 1024 bytes */
} ImageDecodeInfo;

/*
 * All decode calls, unless they say otherwise: `output` is a buffer of outWidth x outHeight pixels of the output
 * format, top row first, without padding between rows and with any alignment. In placement PELM_PLACE_EXACT it is
 * instead exactly as large as the scaled image: outWidth x outHeight pixels are enough for it in boxes of sides below
 * 2^22. Pixels that the image does not cover keep their contents, and nothing is written outside the buffer. A NULL
 * `info` gives 0; with a NULL `output` the decode runs and writes nothing. docs/formats.md says how to ask for an
 * image's size first.
 */

/*
 * Decodes a whole BMP. Accepted: headers of 12, 40 and 56 to 64 bytes; 1, 4, 8, 16, 24 and 32 bits per pixel;
 * uncompressed, and bit fields at 16 bits. docs/formats.md lists what is refused.
 * Returns PELM_RESULT_DONE (also for a truncated pixel array: the rows that are missing are not written), and then
 * `decoderState` is NULL; or PELM_RESULT_FAILED, and then it is as it was.
 */
PELM_API int32_t ZOTARPELMI_DecodeBMP(ImageDecodeInfo *info, void *output, int32_t outWidth, int32_t outHeight);

/*
 * The same in bands of rows, all into the buffer of the first call: pass the same request, buffer and box each time.
 * `output` counts in the first call only. Kind 4 is for whole images: its rows are read from where the stream stands,
 * whichever band is wanted.
 *
 * IterLine: the next `rows` rows of the scaled image, or as many as remain. Keep `rows` the same until the end: each
 * later band is placed by its own height, as if all before had been as high. 0 or fewer rows decode nothing.
 * PELM_RESULT_DONE, and then `decoderState` is NULL when the image is complete; or PELM_RESULT_FAILED, and then a
 * decode in progress is as it was: only a source that is gone fails a later band.
 *
 * Iter: the next 100 rows. PELM_RESULT_MORE while rows remain, then PELM_RESULT_DONE; or PELM_RESULT_FAILED.
 */
PELM_API int32_t ZOTARPELMI_DecodeBMPIterLine(ImageDecodeInfo *info, void *output, int32_t outWidth, int32_t outHeight,
                                              int32_t rows);
PELM_API int32_t ZOTARPELMI_DecodeBMPIter(ImageDecodeInfo *info, void *output, int32_t outWidth, int32_t outHeight);

/* Forgets a decode in progress by setting `decoderState` to NULL, and FREES NOTHING: finish the decode instead, or call
 * PELMI_BMP_DestroyBMP before, which frees a part. Returns 1, or 0 for a NULL `info`. */
PELM_API int32_t ZOTARPELMI_AbortBMPIter(ImageDecodeInfo *info);

/*
 * The same in bands, each into a buffer of its own, which is this call's alone (a decode that it has begun writes
 * nothing by the calls above): `output` has outWidth x `rows` pixels (fewer rows when fewer remain), and the band
 * begins in its first row, centred horizontally only. Never turned; of the placements only PELM_PLACE_STRETCH counts.
 * `rows` may differ from call to call; 0 or fewer decode nothing. PELM_RESULT_DONE, or PELM_RESULT_DATA_ENDED when a
 * read failed before the band was complete; and then `decoderState` is NULL when the image is complete.
 * PELM_RESULT_FAILED for what is refused and without memory (no decode is in progress then), and when the source is
 * gone (then it still is).
 */
PELM_API int32_t ZOTARPELMI_DecodeBMPLine(ImageDecodeInfo *info, void *output, int32_t outWidth, int32_t outHeight,
                                          int32_t rows);

/*
 * The same in two steps, for graphics libraries that choose a divisor and a buffer once they know the size. These calls
 * know RLE8 and RLE4, take every header for one of 40 bytes, and refuse files that are too short for their rows.
 *
 * PreInit reads the header and sets imageWidth and imageHeight (positive for a top-down file, too), and outputWidth and
 * outputHeight: these over `sampleDivisor`, fractions dropped, the height of a top-down file with the other sign. Clear
 * imageHeight before the request serves a PNG. PELM_RESULT_DONE, and `decoderState` holds a record for
 * DecodeBMPSKIA, or for PELMI_BMP_DestroyBMP when there will be no decode, and for no other call; or
 * PELM_RESULT_FAILED (a divisor of 0 too), and `decoderState` is as it was.
 *
 * DecodeBMPSKIA decodes into the box, which need not be what PreInit proposed. Leave the source where PreInit left it.
 * Kinds 0 and 2 need a staging buffer before the call: `data` from ZOTARPELM_OsMalloc, of `bufferSize` bytes, at least
 * a stored row. It BELONGS TO THE LIBRARY once the call has begun on a parked record: it is freed, and `data` is NULL,
 * when the call returns. PELM_RESULT_DONE, and `decoderState` is NULL; or PELM_RESULT_FAILED, and then the record is
 * freed and `decoderState` STILL POINTS AT IT: set it to NULL before the request is used again, and never pass it on.
 */
PELM_API int32_t ZOTARPELMI_PreInitBMP(ImageDecodeInfo *info, int32_t sampleDivisor);
PELM_API int32_t ZOTARPELMI_DecodeBMPSKIA(ImageDecodeInfo *info, void *output, int32_t outWidth, int32_t outHeight);

/* Frees the BMP state record that a decode in progress left in `decoderState`, and its palette; nothing else that
 * hangs from it. `decoderState` is NULL then. Returns 1, or 0 for a NULL `info`. */
PELM_API int32_t PELMI_BMP_DestroyBMP(ImageDecodeInfo *info);

/*
 * A whole WBMP of type 0, from memory (kind 1) or a seekable stream (kind 0 only). Writes formats 0, 1, 7 and 8, black
 * and white pixel for pixel, in five levels of grey where it is reduced; black is transparent (alpha 0) in the former.
 * `flags` must be PELM_PLACE_STRETCH to stretch; with any other value, PELM_PLACE_EXACT too, the image is fitted into a
 * buffer of outWidth x outHeight pixels, and never turned.
 * Returns PELM_RESULT_DONE, also when nothing is left of the image in the box (`outputWidth` and `outputHeight` are set
 * only when something is), or PELM_RESULT_FAILED, also for formats that it does not write.
 */
PELM_API int32_t ZOTARPELMI_DecodeWBMP(ImageDecodeInfo *info, void *outBuffer, int32_t outWidth, int32_t outHeight);

/*
 * PNG of every colour type and depth. An alpha channel, tRNS alphas and a transparent
 * colour blend over the buffer in formats 0 and 1 and are carried in the others. docs/formats.md lists what is refused,
 * docs/oddities.md what may surprise.
 *
 * A memory source (kind 1) is MODIFIED when the file has two or more IDAT chunks: they are joined in place. Streams are
 * read twice and must seek, also kind 4.
 */

/* A whole PNG. Rows are limited to info->imageHeight when that is not 0: leave it 0. PELM_RESULT_DONE (also for a
 * stream of pixels that breaks off in a bad code: the rows before it are written) or PELM_RESULT_FAILED; decoderState
 * is NULL afterwards. */
PELM_API int32_t ZOTARPELMI_DecodePNG(ImageDecodeInfo *info, void *output, int32_t boxWidth, int32_t boxHeight);

/* The rows of one deflate block per call: PELM_RESULT_MORE until the image is complete, then PELM_RESULT_DONE, or
 * PELM_RESULT_FAILED; behind these two decoderState is NULL. Pass the same box and buffer each time. A first block
 * without a complete row makes every call start over: when two calls bring no row (ZOTARPELM_CheckExStatus is called
 * behind every row), destroy the decode and use the one-shot call. docs/oddities.md tells more. */
PELM_API int32_t ZOTARPELMI_DecodePNGIter(ImageDecodeInfo *info, void *output, int32_t boxWidth, int32_t boxHeight);

/* Up to `rows` further rows: PELM_RESULT_MORE while rows remain, then PELM_RESULT_DONE or PELM_RESULT_FAILED; the state
 * goes as for ZOTARPELMI_DecodePNGIter. 0 keeps the limit of the call before, below 0 there is none. `output` is the
 * WHOLE BOX in every call, never a buffer of `rows` rows: pixel for pixel rows go where they belong; of a reduced image
 * each call's rows begin where the image begins, behind the margins and turned as images of its kind are. `rows` counts
 * output rows (of grey of 8 bits, source rows that are used); where an image is stretched a call may write more, and a
 * limit that comes to the image's own height ends no call. Interlaced images take 0 rows only, or as many as
 * info->imageHeight says. */
PELM_API int32_t ZOTARPELMI_DecodePNGLine(ImageDecodeInfo *info, void *output, int32_t boxWidth, int32_t boxHeight,
                                          int32_t rows);

/* Give up a decode in progress and free all of it. 1, or 0 for a NULL `info`. Both do the same. */
PELM_API int32_t ZOTARPELMI_DestroyPNGInfo(ImageDecodeInfo *info);
PELM_API int32_t ZOTARPELMI_AbortPNGIter(ImageDecodeInfo *info);

/* 1 when the PNG at the request's input has an alpha channel or a tRNS chunk, else 0; a file that is damaged behind
 * these still gives 1. Leaves the source where it ended, and for kinds 2 and 4 a 16384-byte block allocated. */
PELM_API uint32_t PELMI_GetAlphaTrFlag(ImageDecodeInfo *info);

/* A zeroed transparency record for companion code, or NULL; and its end, with the block that it owns, which came from
 * ZOTARPELM_OsMalloc. The record must not be NULL there; returns 1. */
typedef struct PngTrInfo {
    uint32_t reserved[9];
    uint32_t ownsBlock;
    void *block;
} PngTrInfo;

PELM_API PngTrInfo *PELMI_FastImgCreatePngTrInfo(void);
PELM_API int32_t PELMI_FastImgDestroyPngTrInfo(PngTrInfo *record);

/*
 * The first image of a GIF, drawn from the left edge of the logical screen on, in formats 0, 1, 5, 7, 8, 10, 11 and 12.
 * The screen's size decides the size in the output. Transparent pixels show their colour; hasTransparency tells of
 * them. When globalColorTable is not NULL every colour table is copied there as it is in the file (768 bytes at most).
 * docs/formats.md lists what is refused, docs/oddities.md what may surprise. In slices (ZOTARPELMI_DecodeAGIFIter too)
 * the word of the first call holds until the end: the block stays with the request as long.
 *
 * A decode that one kind of call has begun goes on with the same kind only: another one gives 0 and leaves it. Do not
 * hand over a decoderState of another image format.
 */

/* The whole image. PELM_RESULT_DONE, also for a truncated file (rows that are missing become zeros where
 * docs/formats.md says so), or PELM_RESULT_FAILED. Neither reads nor writes decoderState. A file that breaks off, or is
 * malformed, between its header and its first image LEAKS the decode's memory: nothing can free it. */
PELM_API int32_t ZOTARPELMI_DecodeGIF(ImageDecodeInfo *info, void *outBuffer, int32_t outWidth, int32_t outHeight);

/* About 16 rows per call, of narrow images more (one code may be 4096 pixels): PELM_RESULT_MORE until the image has
 * ended, then PELM_RESULT_DONE or PELM_RESULT_FAILED. The first call decodes no row; the output arguments of later ones
 * are not looked at. Leaks as ZOTARPELMI_DecodeGIF. */
PELM_API int32_t ZOTARPELMI_DecodeGIFIter(ImageDecodeInfo *info, void *outBuffer, int32_t outWidth, int32_t outHeight);

/* Gives up a decode in progress and frees all of it. 1, or 0 for a NULL `info`. */
PELM_API int32_t ZOTARPELMI_AbortGIFIter(ImageDecodeInfo *info);

/* Up to `rowsWanted` further rows, unturned and left-aligned, to a buffer of rowsWanted rows of outWidth pixels, as
 * the decode's first call has it: later ones go on with that. Call again while decoderState is not NULL:
 * PELM_RESULT_DONE for the rows of a call, PELM_RESULT_FAILED when there are no more although the image is not
 * complete. Interlaced images are refused; nothing leaks. A reduced image needs one more call behind its last row,
 * which writes nothing. */
PELM_API int32_t ZOTARPELMI_DecodeGIFLine(ImageDecodeInfo *info, void *outBuffer, int32_t outWidth, int32_t outHeight,
                                          int32_t rowsWanted);

/*
 * Animations: every frame is the whole screen, composed of what the frames before left and the frame's own pixels, by
 * their disposal. Timing and loops are the caller's: after the last frame the next call begins again with the first.
 * The output arguments count on the first call of a decode only. PelmAnimation.h of the default host library tells what
 * a player wants to know beforehand. Formats and general rules are those of still images; nothing leaks.
 */

/* One frame per call: PELM_RESULT_DONE when another one follows, PELM_RESULT_LAST_FRAME for the last one (the decode's
 * memory has been freed), or PELM_RESULT_FAILED (likewise). Behind the last frame of a file without a trailer that is
 * PELM_RESULT_FAILED, too, with the frame written. Sets frameDelay and colorTableState. The first call of a
 * decode overwrites globalColorTable and localColorTable with new blocks of 1024 bytes from ZOTARPELM_OsMalloc: the
 * CALLER frees and clears both after each decode, also after a failed one. globalColorTable then holds the global
 * table's raw RGB triplets. localColorTable holds, after a call, the raw triplets of the next frame's own table, or
 * zeros. */
PELM_API int32_t ZOTARPELMI_DecodeAGIF(ImageDecodeInfo *info, void *outBuffer, int32_t outWidth, int32_t outHeight);

/* The same in slices of about 16 rows: PELM_RESULT_MORE while a frame is in progress. Allocates no tables and sets
 * neither frameDelay nor colorTableState, but hasTransparency, of the next frame. */
PELM_API int32_t ZOTARPELMI_DecodeAGIFIter(ImageDecodeInfo *info, void *outBuffer, int32_t outWidth, int32_t outHeight);

/* Gives up an animation and frees its state, but not the two tables. 1, or 0 for a NULL `info`. */
PELM_API int32_t ZOTARPELMI_AborAGIF(ImageDecodeInfo *info);

/* The animated-GIF words of the request; 0 or NULL for a NULL `info`. */
PELM_API uint32_t ZOTARPELMI_GetAGIFDelayTime(const ImageDecodeInfo *info);
PELM_API uint32_t ZOTARPELMI_GetAGIFColorTableState(const ImageDecodeInfo *info);
PELM_API void *ZOTARPELMI_GetAGIFGlobalColorTable(const ImageDecodeInfo *info);
PELM_API void *ZOTARPELMI_GetAGIFLocalColorTable(const ImageDecodeInfo *info);

#ifdef __cplusplus
}
#endif

#endif

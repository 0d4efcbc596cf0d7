/*
 * What a player of animated GIFs asks and the decoding calls do not tell: how many frames there are, for how long each
 * is shown, how often the whole is played, and how to start again. Part of libPelmHost; works over sources of every
 * kind through the read and seek services, the library's own or the application's.
 */
#ifndef PELM_ANIMATION_H
#define PELM_ANIMATION_H

#include <stdint.h>

#include "PelmImageDecoder.h"

#ifdef __cplusplus
extern "C" {
#endif

/* How the blocks of a file end: PelmAnimation.ending. Whichever it is, the frames before it are decoded; but the call
 * that delivers the last of them returns PELM_RESULT_LAST_FRAME only at a trailer, otherwise PELM_RESULT_FAILED. */
enum {
    PELM_ANIMATION_TRAILER = 0, /* as it should */
    PELM_ANIMATION_CUT = 1,     /* the data ends without a trailer, perhaps inside a block */
    PELM_ANIMATION_DAMAGED = 2  /* a block that the decoder refuses */
};

typedef struct PelmAnimation {
    uint32_t screenWidth; /* of the logical screen, in pixels; 0 is refused by the decoder */
    uint32_t screenHeight;
    uint32_t globalColours;   /* entries of the global colour table; 0: there is none */
    uint32_t backgroundIndex; /* into it */
    uint32_t frameCount;
    int32_t loopCount; /* as stored (NETSCAPE2.0 or ANIMEXTS1.0); -1: none is. The last one counts */
    uint32_t plays;    /* how often to play it all: 1 without a loop count, 0 (for ever) for a stored 0, otherwise
                          once and then as often as stored, as browsers do */
    uint32_t ending;   /* PELM_ANIMATION_ */
} PelmAnimation;

typedef struct PelmAnimationFrame {
    uint32_t left; /* on the screen, in pixels; parts outside of it are not shown */
    uint32_t top;
    uint32_t width;
    uint32_t height;
    uint32_t
        completeRows;    /* rows of pixels that its data holds whole, in stored order; `height` when none is missing */
    uint32_t delay;      /* milliseconds, as stored: what the decoder reports */
    uint32_t shownDelay; /* PelmAnimation_ShownDelay of it */
    uint32_t disposal;   /* 0 to 7, as stored: 2 clears the frame's area, 3 brings back what was below, others keep */
    int32_t transparentIndex; /* -1: none */
    uint32_t interlaced;      /* 1 or 0 */
    uint32_t localColours;    /* entries of its own colour table; 0: it uses the global one */
} PelmAnimationFrame;

/*
 * Describes the GIF at the source, and up to `count` of its frames from the first on in `frames`, which may be NULL
 * when `count` is 0: a first call tells how many there are. Delay, disposal and transparency are those that the decoder
 * uses: a frame without a graphic control block of its own has those of the frame before it.
 *
 * These are the frames that the decoder delivers, but for files whose trailer comes before any image: they have none
 * here. It tolerates bytes between blocks, scans extensions that it does not know for further blocks, and goes on right
 * behind the last byte of image data that it needed; so the image data is followed code by code, without making pixels
 * of it. Takes about 25 KB of stack, no other memory, and reads the source once from its first byte to its last block.
 *
 * Returns 0 and leaves the source at its first byte; EINVAL when the header is not a GIF's, or breaks off; ESPIPE when
 * the source cannot be moved back, after a few bytes of it were lost: spool it. `*animation` is zeroed then. A read
 * that fails counts as the end of the data; PelmHost_ReadError tells.
 */
PELM_API int PelmAnimation_Describe(InputSource *source, PelmAnimation *animation, PelmAnimationFrame *frames,
                                    uint32_t count);

/* For how many milliseconds to show a frame of this delay: what lies below 20 becomes 100, as in browsers. */
PELM_API uint32_t PelmAnimation_ShownDelay(uint32_t delay);

/*
 * Makes the request ready for the first frame again, over the same source: gives up a decode in progress, and frees and
 * clears `globalColorTable` and `localColorTable`, which every first ZOTARPELMI_DecodeAGIF call allocates and no call
 * frees. Also the way to end: before the request is given up. `abortDecode` is ZOTARPELMI_AborAGIF (this library does
 * not link the decoder). Call it with the source still open. A NULL request is fine.
 */
PELM_API void PelmAnimation_Restart(ImageDecodeInfo *info, int32_t (*abortDecode)(ImageDecodeInfo *info));

#ifdef __cplusplus
}
#endif

#endif

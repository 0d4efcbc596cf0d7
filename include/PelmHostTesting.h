/*
 * A host for tests: libPelmHostTesting defines the eight services of PelmHost.h so that they fail, come short, stop and
 * pause where a test asks for it, and keep account of every block, read and seek. Link it instead of libPelmHost, to
 * see how your own code takes what a decoder returns then. docs/testing.md shows how.
 *
 * Everything here is kept per thread: threads neither see nor disturb each other, and a block is given back on the
 * thread that it was allocated on.
 */
#ifndef PELM_HOST_TESTING_H
#define PELM_HOST_TESTING_H

#include <stddef.h>
#include <stdint.h>

#include "PelmHost.h"

#ifdef __cplusplus
extern "C" {
#endif

/*
 * What the host does wrong, or differently, from some moment on. Calls of each service are counted from 1, since
 * PelmTest_Reset; 0 means never.
 */
typedef struct PelmTestFaults {
    uint32_t failingAllocation;
    uint32_t failingAllocationsFrom;
    uint32_t largestBlock;  /* larger blocks fail; 0: no limit. At first 64 MiB */
    uint64_t mostLiveBytes; /* what would exceed it fails; 0: no limit */
    /* New blocks hold this byte, at first 0xA5, and freed ones its complement, at first 0x5A, until the C library uses
     * them again. Negative: whatever they happen to hold */
    int32_t filling;
    uint32_t failingRead;
    uint32_t failingReadsFrom;
    int32_t failingReadResult; /* at first -1 */
    uint32_t shortRead;
    uint32_t shortReadsFrom;
    int32_t mostPerRead;            /* bytes that a short read delivers at most; at first 1 */
    uint32_t overclaimingReadsFrom; /* the result is 1000 above what was delivered */
    uint32_t stoppingPoll;
    uint32_t stoppingPollsFrom;
    int32_t stoppingStatus; /* at first -1 */
    uint32_t pausingPoll;
    uint32_t pausingPollsFrom;
    int32_t pausingStatus; /* at first 1 */
    int32_t readFilling;   /* what a read leaves of its room holds this byte; 0: stays as it was */
} PelmTestFaults;

/* The faults that are looked at, to be changed at any time. */
PELM_API PelmTestFaults *PelmTest_Faults(void);

/* Frees what is still allocated, and sets counters, faults and violations back. The observer stays. */
PELM_API void PelmTest_Reset(void);

typedef struct PelmTestCounters {
    uint64_t allocations; /* failed ones included */
    uint64_t failedAllocations;
    uint64_t frees;
    uint64_t liveBlocks;
    uint64_t liveBytes; /* as asked for */
    uint64_t peakBytes;
    uint64_t reads;
    uint64_t faultyReads; /* failed, short or overclaiming by a fault */
    uint64_t bytesRead;
    uint64_t seeks;
    uint64_t polls;
    uint64_t stops;  /* polls that were told to stop */
    uint64_t pauses; /* polls that were told to pause */
    uint64_t sleeps;
    uint64_t violations;
    uint64_t bytesMoved; /* copied and filled by ZOTARPELM_OsMemcpy and ZOTARPELM_OsMemset */
} PelmTestCounters;

PELM_API const PelmTestCounters *PelmTest_Counters(void);

/* The size of the index-th block that is alive, oldest first, and where it is; 0 and NULL when there is none. `block`
 * may be NULL. */
PELM_API uint32_t PelmTest_LiveBlock(uint64_t index, const void **block);

/* Looks at the bytes round every live block, which is otherwise done when it is freed; counts violations. Under
 * AddressSanitizer, which watches them itself, there is nothing to look at. */
PELM_API void PelmTest_CheckBlocks(void);

/* The first thing that the decoders did and must not do, in English, or NULL: writing outside a block, freeing what is
 * not a block (NULL too), a negative read, a pause that was asked for and not taken or taken unasked. */
PELM_API const char *PelmTest_Violation(void);

/* ---- Sources ------------------------------------------------------------------------------------------------- */

/* The bytes that a source delivers, whatever its `size` says: a source may lie about that. */
typedef struct PelmTestBytes {
    uint8_t *bytes;
    int32_t size;
    int32_t endsWithStatedSize; /* 1: reads also end where the source's `size` says */
} PelmTestBytes;

/* A source of any kind over these bytes, which stay the caller's; `bufferSize` is taken as it is. Its position lies in
 * the words that belong to the host. Nothing needs closing. Memory sources filled in by hand are served as well. */
PELM_API void PelmTest_OpenSource(InputSource *source, uint32_t kind, PelmTestBytes *bytes, int32_t bufferSize);

/* ---- Guarded memory ------------------------------------------------------------------------------------------ */

/*
 * Memory between two inaccessible pages. An area ends flush against the upper one or starts right behind the lower one;
 * what lies between it and the other page is filled with canaries. Zero the record before the first use.
 */
typedef struct PelmTestArea {
    uint8_t *bytes; /* the area */
    size_t size;
    uint8_t *mapping; /* with both pages */
    size_t mappingSize;
    uint8_t *room; /* between them */
    size_t roomSize;
} PelmTestArea;

enum { PELM_TEST_AREA_AT_END = 0, PELM_TEST_AREA_AT_START = 1 };

/* `size` bytes of any content, or NULL without memory. The area that the record had before is given up. */
PELM_API uint8_t *PelmTest_TakeArea(PelmTestArea *area, size_t size, int edge);
/* 1 when everything round the area is as it was (as far as 512 bytes away), else 0. */
PELM_API int PelmTest_AreaIsIntact(const PelmTestArea *area);
PELM_API void PelmTest_ReleaseArea(PelmTestArea *area);

/* ---- Looking on ---------------------------------------------------------------------------------------------- */

enum { PELM_TEST_ALLOCATION, PELM_TEST_FREE, PELM_TEST_READ, PELM_TEST_SEEK, PELM_TEST_POLL, PELM_TEST_SLEEP };

typedef struct PelmTestCall {
    int service; /* PELM_TEST_ */
    int served;  /* 0 before the service does anything, 1 afterwards */
    const InputSource *source;
    const void *block;     /* allocated (once served), or to be freed */
    int64_t amount;        /* bytes to allocate or to read, offset of a seek, value of a sleep */
    int32_t origin;        /* of a seek */
    int32_t position;      /* of the source before the call */
    int32_t result;        /* once served: bytes delivered, distance moved, status of a poll */
    const char *violation; /* once served: what was wrong with the call, or NULL */
} PelmTestCall;

/* Called before and after each service. Before it, it may change the faults, which then hold for this call already. */
typedef void (*PelmTestObserver)(void *user, const PelmTestCall *call);
PELM_API void PelmTest_SetObserver(PelmTestObserver observer, void *user); /* NULL removes it */

#ifdef __cplusplus
}
#endif

#endif

/*
 * The host side: the eight services that the decoders call, and the default host library (libPelmHost) that
 * implements them for memory, files, pipes and stdio streams.
 *
 * An application links libPelmHost, or defines the eight ZOTARPELM_ functions itself; its own definition wins.
 */
#ifndef PELM_HOST_H
#define PELM_HOST_H

#include <stdint.h>
#include <stdio.h>

#include "PelmImageDecoder.h"

#ifdef __cplusplus
extern "C" {
#endif

/* ---- The host services: what an implementation must do ------------------------------------------------------ */

/*
 * Copies up to `count` bytes from the source's current position to `destination` and advances. Returns the number of
 * bytes delivered: fewer than asked only at the end of the data, below 1 when nothing was delivered. Keeps
 * `source->consumed` up to date. Must serve memory sources (kind 1) too.
 */
PELM_API int32_t ZOTARPELM_Read_IO(InputSource *source, void *destination, int32_t count);

/*
 * Sets the read position: origin 0 counts `offset` from the first byte of the encoded data, origin 1 from the current
 * position. Returns the distance moved, which is below the distance asked when the data ended first. Only results for
 * origin 1 are looked at.
 */
PELM_API int32_t ZOTARPELM_Seek_IO(InputSource *source, int32_t offset, int32_t origin);

/* Memory: NULL on failure; contents need not be cleared; aligned for any type. The decoders never free NULL; the
 * default library's OsFree takes it. */
PELM_API void *ZOTARPELM_OsMalloc(uint32_t size);
PELM_API void ZOTARPELM_OsFree(void *block);

/* Fill and copy bytes. The copy must also be right when the areas overlap and the source lies above the destination. */
PELM_API void ZOTARPELM_OsMemset(void *destination, int32_t value, uint32_t count);
PELM_API void ZOTARPELM_OsMemcpy(void *destination, const void *source, uint32_t count);

/* Writes the host's wish into `*status`: negative stops the decode, positive pauses it, 0 goes on. Only PNG polls. */
PELM_API void ZOTARPELM_CheckExStatus(int32_t *status);

/* Pauses; called once with a positive status, after which the decode goes on. */
PELM_API void ZOTARPELM_OsSleep(int32_t status);

/* ---- The default host library: sources --------------------------------------------------------------------- */

/*
 * Each opener fills `*source`, whatever it held before, and returns 0, or an errno value (`source` is then zeroed and
 * nothing needs closing). A `bufferSize` of 0 or below means PELM_HOST_BUFFER_SIZE. Close every opened source with
 * PelmHost_Close, after the last call that uses it. A source is used by one thread at a time.
 */
enum { PELM_HOST_BUFFER_SIZE = 65536 };

/* `size` bytes of the caller's, as a source of any kind, with all seeks. Borrowed: they stay the caller's and must
 * outlive the source. PNG decodes from kind 1 may modify them. */
PELM_API int PelmHost_OpenMemory(InputSource *source, uint32_t kind, void *bytes, int32_t size);

/* A regular file as a seekable stream (kind 0; a caller may set kind 2). EFBIG above 2^31 - 1 bytes; ESPIPE for what
 * is not a regular file, which is then left unopened. */
PELM_API int PelmHost_OpenFile(InputSource *source, const char *path, int32_t bufferSize);

/* A regular file or a pipe, read whole into private memory, as a source of any kind. EFBIG beyond `limit` bytes;
 * a limit of 0 or below means 2^31 - 1. ECANCELED or ETIMEDOUT when the control stops it. */
PELM_API int PelmHost_OpenFileInMemory(InputSource *source, uint32_t kind, const char *path, int32_t limit);

/*
 * A stdio stream or a file descriptor, from where it stands, as a sequential source (kind 4). Not closed by
 * PelmHost_Close. `size` is 0x7FFFFFFF until the end has been met and the number of bytes delivered from then on. It
 * cannot be moved back: such a seek moves by 0. EBADF for a descriptor that is not open for reading. A stop asked for
 * through the control ends a read that waits for a descriptor; one that waits inside stdio, when a signal interrupts
 * it as well.
 */
PELM_API int PelmHost_OpenStream(InputSource *source, FILE *stream, int32_t bufferSize);
PELM_API int PelmHost_OpenDescriptor(InputSource *source, int descriptor, int32_t bufferSize);

/* What is left of a stdio stream, read into private memory, as a source of any kind, with its true size and all
 * seeks. Fails as PelmHost_OpenFileInMemory does; the bytes read by then are lost to the stream. */
PELM_API int PelmHost_OpenSpooled(InputSource *source, uint32_t kind, FILE *stream, int32_t limit);

/* Releases what the opener took. Never touches `source->data` of kinds 0 and 2, which is the library's. Leaves the
 * record zeroed; NULL and zeroed records are fine. */
PELM_API void PelmHost_Close(InputSource *source);

/* Why the last read of this source delivered less than asked, or nothing: 0 for an end of data (or no failure at all),
 * ECANCELED or ETIMEDOUT when the control stopped it, otherwise the errno value of the failed read. */
PELM_API int PelmHost_ReadError(const InputSource *source);

/* ---- The default host library: limits, counters, stopping ---------------------------------------------------- */

/*
 * A control limits, counts and stops the decodes that run under it. It is installed for the whole process, or for one
 * thread (which then looks at no other). Without one nothing is limited, counted or stopped. All functions may be
 * called from any thread; a block is always given back to the control that it was allocated under. Every function
 * accepts a NULL control and then does nothing, or answers 0.
 */
typedef struct PelmHostControl PelmHostControl;

PELM_API PelmHostControl *PelmHost_NewControl(void); /* NULL without memory; everything off */
/* Gives the control up. It goes away when it is installed nowhere and its last block is freed. NULL is fine. */
PELM_API void PelmHost_ReleaseControl(PelmHostControl *control);

PELM_API void PelmHost_UseForProcess(PelmHostControl *control); /* NULL: none */
/* NULL: the one of the process. A thread takes its control out before it ends; otherwise the control is never freed. */
PELM_API void PelmHost_UseForThread(PelmHostControl *control);

/* Most bytes alive at once, and in one allocation; 0 means no limit. What exceeds them is a failed allocation. Only
 * what the decoders allocate is limited and counted, not the private memory of sources. */
PELM_API void PelmHost_SetMemoryLimits(PelmHostControl *control, uint64_t liveBytes, uint64_t blockBytes);

/* Asks the decodes to stop. Safe in a signal handler and from any thread. Lasts until PelmHost_Resume. */
PELM_API void PelmHost_Cancel(PelmHostControl *control);
PELM_API void PelmHost_Resume(PelmHostControl *control);

/* Decodes stop this many milliseconds from now; 0 removes the deadline. */
PELM_API void PelmHost_SetDeadline(PelmHostControl *control, uint32_t milliseconds);

/*
 * Called on the decoding thread at every poll (`source` NULL) and after every read of a stream source (kinds 0, 2 and
 * 4), unless the control stops them already. Negative cancels, as PelmHost_Cancel does: what was just read is still
 * delivered, later reads and polls are not. Positive pauses by that many milliseconds (polls only); 0 goes on.
 * Threads that share a control may call it at the same time. NULL removes it, for calls that begin later.
 */
typedef int32_t (*PelmHostProgress)(void *user, const InputSource *source);
PELM_API void PelmHost_SetProgress(PelmHostControl *control, PelmHostProgress progress, void *user);

/* Why decodes under this control have to stop now: 0 not at all, ECANCELED, or ETIMEDOUT (deadline passed). A decode
 * may have ended well before that. PelmHost_ReadError tells whether a stream source was stopped, and why. */
PELM_API int PelmHost_StopReason(const PelmHostControl *control);

typedef struct PelmHostCounters {
    uint64_t liveBytes; /* as asked for by the decoders */
    uint64_t peakBytes;
    uint64_t liveBlocks;
    uint64_t allocations; /* successful ones */
    uint64_t failedAllocations;
    uint64_t reads; /* calls, of any result */
    uint64_t seeks;
} PelmHostCounters;

PELM_API void PelmHost_GetCounters(const PelmHostControl *control, PelmHostCounters *counters);

#ifdef __cplusplus
}
#endif

#endif

// What hangs from InputSource.hostContext, how openers hang it there, and where a source stands.
//
// The position is InputSource.hostPosition. `consumed` only reports it: decoders write there too.
#pragma once

#include <cstdint>

#include "PelmHost.h"
#include "host/feed.h"

namespace pelm::host {

enum class Backing : uint8_t {
    bytes, // bytes in memory
    file,  // a regular file, read at any position
    feed,  // a descriptor or stdio stream, forward only
};

// Stream sources always have one; a source of kind 1 only to remember the bytes that the host owns.
struct SourceContext {
    Backing backing = Backing::bytes;
    bool owned = false;       // the bytes or the file go away with the source
    uint8_t *bytes = nullptr; // of Backing::bytes
    int descriptor = -1;      // of Backing::file
    Feed feed{nullptr, -1};   // of Backing::feed
    int32_t size = 0;         // where the data ends; of a feed INT32_MAX until its end has been met
    int pending_error = 0;    // came after bytes that were delivered: for the next read to report
    int read_error = 0;       // why the last read delivered less than asked; 0 for an end of data
};

bool is_source_kind(uint32_t kind);

// Fills the zeroed record from `context` and takes over what the context owns; on failure (ENOMEM) that is released.
int open_source(InputSource &source, uint32_t kind, const SourceContext &context, int32_t buffer_size);

// Where the data ends, as far as that is known; 0 for a record that names no data.
int32_t data_size(const InputSource &source);

void set_position(InputSource &source, int32_t position);

// The position, put right in records that applications filled by hand, and reported.
int32_t current_position(InputSource &source);

// Reads on from where the stream source stands, whatever backs it, and moves its position. Where the data ends early,
// there its size is from then on.
Fetched fetch(InputSource &source, SourceContext &context, void *destination, int32_t count,
              const PelmHostControl *control);

// Up to `count` bytes from `position` of a regular file.
Fetched fetch_from_file(int descriptor, int32_t position, void *destination, int32_t count,
                        const PelmHostControl *control);

} // namespace pelm::host

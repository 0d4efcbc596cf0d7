// Walks through the chunks of a PNG, as the decoder does: verifies each and hands it over, and tells where and why the
// walk cannot go on. What chunks mean is left to the caller.
#pragma once

#include <string>
#include <vector>

#include "PelmHost.h"
#include "tools/bytes.h"

namespace pelm_tool {

constexpr size_t png_signature_size = 8;

// How many bytes of the signature are right.
size_t matching_signature_bytes(Bytes head);

struct PngChunk {
    int64_t position; // in the file, of its length field
    uint32_t length;
    std::string type;          // four characters; unprintable ones as "?"
    std::vector<uint8_t> data; // as much of it as PLTE may have
};

class PngChunks {
public:
    explicit PngChunks(InputSource &source);

    std::string read_signature();        // why it is wrong; empty: it is right
    std::string read_next(PngChunk &to); // why there is no further chunk that can be relied on; empty: here it is

private:
    size_t read(uint8_t *to, size_t count); // fewer bytes at the end
    std::string verify(PngChunk &chunk, const uint8_t *type);

    InputSource &source_;
    int64_t position_ = 0;
};

std::string shown_chunk(const PngChunk &chunk); // "the IDAT chunk at byte 33"

} // namespace pelm_tool

// One run of the chunk parser, on a record and a reader set up as a decode does it.
#pragma once

#include "png/chunks.h"
#include "tests/png/support/png_builder.h"
#include "tests/support/test_host.h"

namespace pelm::test {

inline constexpr uint32_t source_kinds[] = {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT,
                                            PELM_SOURCE_SEQUENTIAL};

// Forgets what the host recorded; frees everything at the end and expects nothing else to be left.
class Parse {
public:
    Parse(const Bytes &file, uint32_t kind);
    Parse(const Parse &) = delete;
    Parse &operator=(const Parse &) = delete;
    ~Parse();

    uint32_t run();

    TestSource source;
    PngDecodeState state{};
    PngInputBuffer input{};
};

// The result alone.
uint32_t parsed(const Bytes &file, uint32_t kind);

// A picture of `colour_type` and `depth` with whatever that needs, of 3 x 2 pixels.
Png small_png(uint8_t colour_type, uint8_t depth);

// A chunk of no meaning to anyone.
Chunk unknown_chunk(size_t size);

// Parses it from every kind of source.
void expect_result(const Bytes &file, uint32_t wanted, const std::string &what);

// The same chunks with another one put in at `at`.
std::vector<Chunk> with_chunk(std::vector<Chunk> chunks, size_t at, const Chunk &chunk);

} // namespace pelm::test

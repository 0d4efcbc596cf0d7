#include "tests/png/inner/parse.h"

#include <gtest/gtest.h>

namespace pelm::test {

Parse::Parse(const Bytes &file, uint32_t kind) : source(kind, file) {
    TestHost::get().reset();
    input.source = &source.source;
    input.sourceSize = static_cast<uint32_t>(source.source.size);
    if (kind == PELM_SOURCE_MEMORY) {
        input.bytesLeft = input.sourceSize;
        input.data = source.source.data;
    } else {
        input.data = static_cast<uint8_t *>(ZOTARPELM_OsMalloc(PNG_READ_BUFFER_SIZE));
        ZOTARPELM_Seek_IO(&source.source, 0, 0);
    }
}

Parse::~Parse() {
    void *const read_buffer = source.source.kind == PELM_SOURCE_MEMORY ? nullptr : input.data;
    for (void *const block : {read_buffer, static_cast<void *>(state.palette), static_cast<void *>(state.paletteAlpha),
                              static_cast<void *>(state.idatTable)})
        if (block != nullptr) ZOTARPELM_OsFree(block);
    const TestHost &host = TestHost::get();
    EXPECT_TRUE(host.live_blocks().empty()) << testing::PrintToString(host.live_blocks());
    EXPECT_TRUE(host.violations.empty()) << host.violations.front();
    EXPECT_TRUE(source.unchanged());
}

uint32_t Parse::run() {
    return __PELMI_PngParserMain(&state, &input);
}

uint32_t parsed(const Bytes &file, uint32_t kind) {
    Parse parse(file, kind);
    return parse.run();
}

Png small_png(uint8_t colour_type, uint8_t depth) {
    Png png{.width = 3, .height = 2, .colour_type = colour_type, .depth = depth};
    png.rows = noise_rows(png, 1);
    if (colour_type == 3) png.plte = Bytes{1, 2, 3, 4, 5, 6};
    return png;
}

Chunk unknown_chunk(size_t size) {
    Chunk chunk{"teSt", Bytes(size)};
    for (size_t i = 0; i < size; ++i)
        chunk.data[i] = static_cast<uint8_t>(i * 31 + (i >> 8));
    return chunk;
}

void expect_result(const Bytes &file, uint32_t wanted, const std::string &what) {
    for (const uint32_t kind : source_kinds)
        EXPECT_EQ(parsed(file, kind), wanted) << what << ", kind " << kind;
}

std::vector<Chunk> with_chunk(std::vector<Chunk> chunks, size_t at, const Chunk &chunk) {
    chunks.insert(chunks.begin() + static_cast<ptrdiff_t>(at), chunk);
    return chunks;
}

} // namespace pelm::test

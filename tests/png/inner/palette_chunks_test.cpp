// PLTE: lengths, places, repetitions and the blocks that it fills.
#include <gtest/gtest.h>

#include "tests/png/inner/parse.h"

namespace pelm::test {

TEST(Chunks, a_palette_is_a_multiple_of_three_and_at_most_256_entries) {
    for (size_t length = 1; length <= 780; length += length < 10 || length > 760 ? 1 : 25) {
        Png png = small_png(3, 8);
        png.plte = Bytes(length);
        for (size_t i = 0; i < length; ++i)
            (*png.plte)[i] = static_cast<uint8_t>(i * 7 + 1);
        const bool accepted = length % 3 == 0 && length <= 768;
        for (const uint32_t kind : source_kinds) {
            Parse parse(build(png), kind);
            ASSERT_EQ(parse.run(), accepted ? PNG_DONE : PNG_FORMAT_ERROR) << length << " bytes";
            if (!accepted) {
                EXPECT_EQ(parse.state.chunkSeenFlags & PNG_SEEN_PLTE, 0u);
                continue;
            }
            EXPECT_EQ(parse.state.chunkSeenFlags & PNG_SEEN_PLTE, uint32_t{PNG_SEEN_PLTE});
            EXPECT_EQ(parse.state.paletteCount, length / 3);
            ASSERT_TRUE(std::equal(png.plte->begin(), png.plte->end(), parse.state.palette)) << length << " bytes";
            for (size_t i = length; i < 768; ++i)
                ASSERT_EQ(parse.state.palette[i], 0) << "byte " << i << " behind the palette";
            for (size_t i = 0; i < length / 3; ++i)
                ASSERT_EQ(parse.state.paletteAlpha[i], 0xFFFF) << "entry " << i;
        }
    }
}

TEST(Chunks, the_blocks_of_a_palette_are_256_triplets_and_three_alphas_per_entry) {
    Parse parse(build(small_png(3, 8)), PELM_SOURCE_MEMORY);
    EXPECT_EQ(parse.run(), PNG_DONE);
    const std::vector<uint32_t> wanted = {768, 12, static_cast<uint32_t>(2048 * sizeof(PngIdatEntry))};
    EXPECT_EQ(TestHost::get().allocations, wanted);
}

TEST(Chunks, an_empty_palette_is_accepted_and_ends_the_file) {
    Png png = small_png(3, 8);
    png.plte = Bytes{};
    for (const uint32_t kind : source_kinds) {
        Parse parse(build(png), kind);
        EXPECT_EQ(parse.run(), PNG_BAD_DATA); // for no image data came before
        EXPECT_EQ(parse.state.chunkSeenFlags, 3u);
        EXPECT_EQ(parse.state.paletteCount, 0u);
    }
    std::vector<Chunk> chunks = chunks_of(png);
    std::swap(chunks[1], chunks[2]);
    expect_result(file_of(chunks), PNG_DONE, "IDAT before the empty palette");
}

TEST(Chunks, a_palette_before_the_header_is_refused_whatever_the_colour_type) {
    for (const uint8_t colour_type : Bytes{0, 2, 3}) {
        const std::vector<Chunk> chunks = with_chunk(chunks_of(small_png(colour_type, 8)), 0, {"PLTE", {1, 2, 3}});
        expect_result(file_of(chunks), PNG_FORMAT_ERROR, "type " + std::to_string(colour_type));
    }
}

TEST(Chunks, a_palette_in_an_image_of_another_colour_type_is_skipped_unseen) {
    for (const uint8_t colour_type : Bytes{0, 2, 4, 6})
        for (const size_t length : {3u, 4u, 768u, 771u, 769u}) {
            Png png = small_png(colour_type, 8);
            png.plte = Bytes(length, 1);
            for (const uint32_t kind : source_kinds) {
                Parse parse(build(png), kind);
                EXPECT_EQ(parse.run(), PNG_DONE);
                EXPECT_EQ(parse.state.palette, nullptr);
                EXPECT_EQ(parse.state.paletteCount, 0u);
                EXPECT_EQ(parse.state.chunkSeenFlags, 1u);
            }
        }
}

TEST(Chunks, a_second_palette_takes_the_place_of_the_first_and_of_its_alphas) {
    Png png = small_png(3, 8);
    png.trns = Bytes{5, 6};
    png.before_idat = {{"PLTE", {9, 8, 7, 6, 5, 4, 3, 2, 1}}};
    for (const uint32_t kind : source_kinds) {
        Parse parse(build(png), kind);
        EXPECT_EQ(parse.run(), PNG_DONE);
        EXPECT_EQ(parse.state.paletteCount, 3u);
        EXPECT_EQ(parse.state.palette[0], 9);
        EXPECT_EQ(parse.state.palette[8], 1);
        EXPECT_EQ(parse.state.paletteAlpha[0], 0xFFFF);
    } // and nothing has leaked
}

} // namespace pelm::test

// The walk over chunks: what is parsed, skipped and refused, and what is kept of it.
#include <algorithm>

#include <gtest/gtest.h>

#include "tests/png/inner/parse.h"

namespace pelm::test {

namespace {

// Checksum wrong, too short, or no sense: both of these end a decode.
bool is_refusal(uint32_t code) {
    return code == PNG_BAD_DATA || code == PNG_FORMAT_ERROR;
}

struct Layout {
    uint8_t colour_type, depth, bits_per_pixel, bytes_per_pixel, has_alpha;
};

constexpr Layout layouts[] = {{0, 1, 1, 1, 0},   {0, 2, 2, 1, 0},  {0, 4, 4, 1, 0},   {0, 8, 8, 1, 0},
                              {0, 16, 16, 2, 0}, {2, 8, 24, 3, 0}, {2, 16, 48, 6, 0}, {3, 1, 1, 1, 0},
                              {3, 2, 2, 1, 0},   {3, 4, 4, 1, 0},  {3, 8, 8, 1, 0},   {4, 8, 16, 2, 1},
                              {4, 16, 32, 4, 1}, {6, 8, 32, 4, 1}, {6, 16, 64, 8, 1}};

const Layout *layout_of(uint32_t colour_type, uint32_t depth) {
    for (const Layout &layout : layouts)
        if (layout.colour_type == colour_type && layout.depth == depth) return &layout;
    return nullptr;
}

// Where each chunk of a file begins, and the end.
std::vector<size_t> starts_of(const std::vector<Chunk> &chunks) {
    std::vector<size_t> starts = {8};
    for (const Chunk &chunk : chunks)
        starts.push_back(starts.back() + 12 + chunk.data.size());
    return starts;
}

} // namespace

TEST(Chunks, the_header_of_every_layout_is_taken_apart_and_every_other_combination_is_refused) {
    for (uint32_t colour_type = 0; colour_type < 256; ++colour_type)
        for (uint32_t depth = 0; depth < 256; depth += depth < 34 ? 1 : 37) {
            if (colour_type > 8 && colour_type % 16 != 2 && depth > 16) continue;
            Png png = small_png(0, 8);
            png.stream = Bytes{1};
            png.colour_type = static_cast<uint8_t>(colour_type);
            png.depth = static_cast<uint8_t>(depth);
            if (colour_type == 3) png.plte = Bytes{1, 2, 3};
            Parse parse(build(png), PELM_SOURCE_MEMORY);
            const Layout *const layout = layout_of(colour_type, depth);
            ASSERT_EQ(parse.run(), layout != nullptr ? PNG_DONE : PNG_FORMAT_ERROR)
                << "type " << colour_type << " depth " << depth;
            if (layout == nullptr) continue;
            EXPECT_EQ(parse.state.imageWidth, 3u);
            EXPECT_EQ(parse.state.imageHeight, 2u);
            EXPECT_EQ(parse.state.bitDepth, depth);
            EXPECT_EQ(parse.state.colourType, colour_type);
            EXPECT_EQ(parse.state.interlaceMethod, 0u);
            EXPECT_EQ(parse.state.hasAlphaChannel, layout->has_alpha);
            EXPECT_EQ(parse.state.bitsPerPixel, layout->bits_per_pixel);
            EXPECT_EQ(parse.state.bytesPerPixel, layout->bytes_per_pixel);
            EXPECT_EQ(parse.state.chunkSeenFlags, colour_type == 3 ? 3u : 1u);
            EXPECT_EQ(parse.state.ancillaryFlags, 0u);
        }
}

TEST(Chunks, sizes_have_no_upper_limit_and_no_zero) {
    struct Case {
        uint32_t width, height;
        bool accepted;
    };
    for (const Case &one : {Case{1, 1, true},
                            {0, 1, false},
                            {1, 0, false},
                            {0, 0, false},
                            {0x01020304, 0x05060708, true},
                            {0x80000000, 1, true},
                            {0xFFFFFFFF, 0xFFFFFFFF, true}}) {
        Png png;
        png.stream = Bytes{1};
        png.scanlines = Bytes{};
        std::vector<Chunk> chunks = chunks_of(png);
        png.width = one.width;
        png.height = one.height;
        chunks[0] = ihdr_chunk(png);
        for (const uint32_t kind : source_kinds) {
            Parse parse(file_of(chunks), kind);
            EXPECT_EQ(parse.run(), one.accepted ? PNG_DONE : PNG_FORMAT_ERROR);
            EXPECT_EQ(parse.state.imageWidth, one.width);
            EXPECT_EQ(parse.state.imageHeight, one.height);
        }
    }
}

TEST(Chunks, methods_other_than_0_and_interlacing_other_than_0_and_1_are_refused) {
    for (uint32_t value = 1; value < 256; ++value) {
        Png compression = small_png(2, 8), filter = compression, interlace = compression;
        compression.compression_method = filter.filter_method = interlace.interlace = static_cast<uint8_t>(value);
        EXPECT_EQ(parsed(build(compression), PELM_SOURCE_MEMORY), PNG_FORMAT_ERROR) << value;
        EXPECT_EQ(parsed(build(filter), PELM_SOURCE_MEMORY), PNG_FORMAT_ERROR) << value;
        Parse parse(build(interlace), PELM_SOURCE_MEMORY);
        EXPECT_EQ(parse.run(), value == 1 ? PNG_DONE : PNG_FORMAT_ERROR) << value;
        EXPECT_EQ(parse.state.interlaceMethod, value);
    }
}

TEST(Chunks, a_header_of_another_length_is_refused) {
    for (const size_t length : {1u, 4u, 12u, 14u, 26u}) {
        std::vector<Chunk> chunks = chunks_of(small_png(0, 8));
        chunks[0].data.resize(length);
        expect_result(file_of(chunks), PNG_FORMAT_ERROR, std::to_string(length) + " bytes of IHDR");
    }
}

TEST(Chunks, the_signature_must_be_whole_and_right) {
    const Bytes file = build(small_png(0, 8));
    for (size_t bit = 0; bit < 64; ++bit) {
        Bytes wrong = file;
        wrong[bit / 8] = static_cast<uint8_t>(wrong[bit / 8] ^ 1 << bit % 8);
        expect_result(wrong, PNG_FORMAT_ERROR, "bit " + std::to_string(bit));
    }
    expect_result({}, PNG_FORMAT_ERROR, "nothing");
}

TEST(Chunks, any_single_wrong_bit_anywhere_is_refused) {
    Png png = small_png(3, 8);
    png.trns = Bytes{7};
    png.before_idat = {unknown_chunk(5), {"tEXt", {'a', 0, 'b'}}};
    png.idat_sizes = {3, 4};
    const std::vector<Chunk> chunks = chunks_of(png);
    const std::vector<size_t> starts = starts_of(chunks);
    const Bytes file = file_of(chunks);
    ASSERT_EQ(parsed(file, PELM_SOURCE_MEMORY), PNG_DONE);
    for (size_t bit = 64; bit < 8 * file.size(); ++bit) {
        Bytes wrong = file;
        wrong[bit / 8] = static_cast<uint8_t>(wrong[bit / 8] ^ 1 << bit % 8);
        const size_t start = *(std::upper_bound(starts.begin(), starts.end(), bit / 8) - 1);
        const bool in_length = bit / 8 < start + 4;
        for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM}) {
            const uint32_t code = parsed(wrong, kind);
            EXPECT_TRUE(in_length ? is_refusal(code) : code == PNG_BAD_DATA)
                << "byte " << bit / 8 << " bit " << bit % 8 << ": " << code;
        }
    }
}

TEST(Chunks, a_file_cut_anywhere_is_refused) {
    Png png = small_png(3, 8);
    png.trns = Bytes{7};
    png.before_idat = {unknown_chunk(5)};
    png.idat_sizes = {3, 4};
    const Bytes file = build(png);
    for (size_t size = 0; size < file.size(); ++size)
        for (const uint32_t kind : source_kinds) {
            const uint32_t code = parsed({file.begin(), file.begin() + static_cast<ptrdiff_t>(size)}, kind);
            EXPECT_TRUE(is_refusal(code)) << size << " bytes, kind " << kind << ": " << code;
        }
}

TEST(Chunks, a_large_file_cut_anywhere_round_a_read_buffer_is_refused) {
    Png png = small_png(2, 8);
    png.before_idat = {unknown_chunk(20000)};
    const Bytes file = build(png);
    for (size_t size = 16370; size < 16400; ++size)
        for (const uint32_t kind : source_kinds)
            EXPECT_TRUE(is_refusal(parsed({file.begin(), file.begin() + static_cast<ptrdiff_t>(size)}, kind))) << size;
}

TEST(Chunks, a_length_beyond_the_file_is_refused_without_looking_further) {
    for (const uint32_t length : {1000u, 0x7FFFFFFFu, 0x80000000u, 0xFFFFFFFFu}) {
        std::vector<Chunk> chunks = chunks_of(small_png(0, 8));
        chunks[1].length = length;
        expect_result(file_of(chunks), PNG_FORMAT_ERROR, "length " + std::to_string(length));
    }
}

TEST(Chunks, a_length_up_to_the_files_size_is_left_to_the_checksum) {
    std::vector<Chunk> chunks = chunks_of(small_png(0, 8));
    const auto size = static_cast<uint32_t>(file_of(chunks).size());
    chunks[1].length = size;
    expect_result(file_of(chunks), PNG_BAD_DATA, "length of the file");
    chunks[1].length = size + 1;
    expect_result(file_of(chunks), PNG_FORMAT_ERROR, "one more");
}

TEST(Chunks, the_checksum_covers_type_and_data) {
    for (const char *const type : {"IHDR", "PLTE", "IDAT", "teSt", "IEND"}) {
        std::vector<Chunk> chunks = chunks_of(small_png(3, 8));
        chunks.insert(chunks.begin() + 1, unknown_chunk(9));
        for (Chunk &chunk : chunks)
            if (chunk.type == type) chunk.crc = crc32_of(chunk.data);
        expect_result(file_of(chunks), PNG_BAD_DATA, type);
    }
}

TEST(Chunks, an_unknown_chunk_is_skipped_wherever_it_stands) {
    const std::vector<Chunk> chunks = chunks_of(small_png(3, 8));
    for (size_t at = 0; at < chunks.size(); ++at)
        for (const char *const type : {"teSt", "tEXt", "zTXt", "iTXt", "bKGD", "gAMA", "ihdr", "ABCD", "\1\2\3\4"})
            expect_result(file_of(with_chunk(chunks, at, {type, {1, 2, 3}})), PNG_DONE,
                          std::string(type) + " at " + std::to_string(at));
}

TEST(Chunks, the_first_empty_chunk_of_any_type_ends_the_file) {
    for (const char *const type : {"IEND", "teSt", "IDAT", "tEXt"}) {
        Png png = small_png(2, 8);
        png.has_iend = false;
        png.after_idat = {{type, {}}};
        expect_result(build(png), PNG_DONE, type);
        Bytes file = build(png);
        file.insert(file.end(), {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13});
        expect_result(file, PNG_DONE, std::string(type) + " and anything behind it");
    }
}

TEST(Chunks, an_end_with_data_is_refused) {
    Png png = small_png(2, 8);
    png.has_iend = false;
    png.after_idat = {{"IEND", {1}}, {"IEND", {}}};
    expect_result(build(png), PNG_FORMAT_ERROR, "IEND with data");
}

TEST(Chunks, a_file_without_an_end_is_refused) {
    Png png = small_png(2, 8);
    png.has_iend = false;
    for (const uint32_t kind : source_kinds)
        EXPECT_TRUE(is_refusal(parsed(build(png), kind)));
    png.after_idat = {unknown_chunk(4)};
    for (const uint32_t kind : source_kinds)
        EXPECT_TRUE(is_refusal(parsed(build(png), kind)));
}

TEST(Chunks, an_empty_idat_ends_the_file_and_is_not_indexed) {
    Png png = small_png(2, 8);
    png.idat_sizes = {5, 3, 0, 4};
    for (const uint32_t kind : source_kinds) {
        Parse parse(build(png), kind);
        EXPECT_EQ(parse.run(), PNG_DONE);
        EXPECT_EQ(parse.state.idatCount, 2u);
        EXPECT_EQ(parse.state.idatTable[0].length, 5u);
        EXPECT_EQ(parse.state.idatTable[1].length, 3u);
        EXPECT_EQ(parse.state.idatTotalBytes, 8u);
    }
    png.idat_sizes = {0, 5};
    expect_result(build(png), PNG_BAD_DATA, "nothing but an empty IDAT");
}

TEST(Chunks, without_image_data_the_file_is_bad) {
    Png png = small_png(2, 8);
    png.stream = Bytes{};
    expect_result(build(png), PNG_BAD_DATA, "no IDAT");
}

TEST(Chunks, a_second_header_takes_the_place_of_the_first) {
    Png second = small_png(6, 16);
    second.width = 77;
    const std::vector<Chunk> chunks = with_chunk(chunks_of(small_png(0, 8)), 1, ihdr_chunk(second));
    for (const uint32_t kind : source_kinds) {
        Parse parse(file_of(chunks), kind);
        EXPECT_EQ(parse.run(), PNG_DONE);
        EXPECT_EQ(parse.state.imageWidth, 77u);
        EXPECT_EQ(parse.state.bitsPerPixel, 64u);
        EXPECT_EQ(parse.state.hasAlphaChannel, 1u);
    }
}

TEST(Chunks, a_second_header_keeps_flags_and_keys) {
    Png png = small_png(0, 8);
    png.trns = Bytes{0, 9};
    png.before_idat = {ihdr_chunk(small_png(0, 16))};
    Parse parse(build(png), PELM_SOURCE_MEMORY);
    EXPECT_EQ(parse.run(), PNG_DONE);
    EXPECT_EQ(parse.state.ancillaryFlags, uint32_t{PNG_HAS_TRNS});
    EXPECT_EQ(parse.state.transparentKeyRed, 9u);
    EXPECT_EQ(parse.state.bitDepth, 16u);
}

TEST(Chunks, image_data_may_stand_before_header_and_palette) {
    std::vector<Chunk> chunks = chunks_of(small_png(3, 8));
    std::rotate(chunks.begin(), chunks.begin() + 2, chunks.begin() + 3); // IDAT, IHDR, PLTE
    ASSERT_EQ(chunks[0].type, "IDAT");
    for (const uint32_t kind : source_kinds) {
        Parse parse(file_of(chunks), kind);
        EXPECT_EQ(parse.run(), PNG_DONE);
        EXPECT_EQ(parse.state.idatCount, 1u);
        EXPECT_EQ(parse.state.paletteCount, 2u);
    }
}

TEST(Chunks, no_header_at_all_leaves_the_size_0) {
    std::vector<Chunk> chunks = chunks_of(small_png(2, 8));
    chunks.erase(chunks.begin());
    Parse parse(file_of(chunks), PELM_SOURCE_MEMORY);
    EXPECT_EQ(parse.run(), PNG_DONE);
    EXPECT_EQ(parse.state.imageWidth, 0u);
    EXPECT_EQ(parse.state.chunkSeenFlags, 0u);
}

TEST(Chunks, every_failing_allocation_is_reported_and_leaves_nothing_behind) {
    Png png = small_png(3, 8);
    png.before_idat = {{"PLTE", {9, 8, 7}}, unknown_chunk(7)}; // no header is split by a read buffer's end
    png.stream = Bytes(2100);
    png.idat_size = 1;
    for (const uint32_t kind : source_kinds) {
        int count = 0;
        {
            Parse parse(build(png), kind);
            EXPECT_EQ(parse.run(), PNG_DONE);
            count = static_cast<int>(TestHost::get().allocations.size());
        }
        const int before_parsing = kind == PELM_SOURCE_MEMORY ? 0 : 1;
        EXPECT_EQ(count - before_parsing, 7); // two palettes of two blocks, the index, and two to let it grow
        for (int failing = before_parsing + 1; failing <= count; ++failing) {
            Parse parse(build(png), kind);
            TestHost::get().faults.failing_allocation = failing;
            EXPECT_EQ(parse.run(), PNG_NO_MEMORY) << "allocation " << failing << " of " << count;
        }
    }
}

TEST(Chunks, more_image_data_chunks_than_the_index_first_holds_keep_their_order) {
    for (const size_t count : {2047u, 2048u, 2049u, 4096u, 4097u, 5000u}) {
        Png png = small_png(2, 8);
        png.stream = Bytes(count);
        for (size_t i = 0; i < count; ++i)
            (*png.stream)[i] = static_cast<uint8_t>(i * 7);
        png.idat_size = 1;
        for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM}) {
            Parse parse(build(png), kind);
            ASSERT_EQ(parse.run(), PNG_DONE) << count << " chunks, kind " << kind;
            ASSERT_EQ(parse.state.idatCount, count);
            EXPECT_EQ(parse.state.idatCapacity, (count + 2047) / 2048 * 2048);
            EXPECT_EQ(parse.state.idatTotalBytes, count);
            for (size_t i = 0; i < count; ++i) {
                const PngIdatEntry &entry = parse.state.idatTable[i];
                ASSERT_EQ(entry.length, 1u);
                const auto wanted = static_cast<uint32_t>(33 + 13 * i + 8);
                ASSERT_TRUE(kind != PELM_SOURCE_MEMORY || entry.memoryAddress == parse.source.source.data + wanted)
                    << "entry " << i;
                ASSERT_EQ(entry.sourceOffset, kind == PELM_SOURCE_MEMORY ? 0 : wanted) << "entry " << i;
            }
        }
    }
}

TEST(Chunks, image_data_of_any_size_is_indexed_by_address_or_offset) {
    for (const size_t size : {1u, 100u, 16000u, 16384u, 16385u, 50000u}) {
        Png png = small_png(2, 8);
        png.stream = Bytes(3 * size, 5);
        png.idat_size = size;
        png.before_idat = {unknown_chunk(30)};
        const std::vector<size_t> starts = starts_of(chunks_of(png));
        for (const uint32_t kind : source_kinds) {
            Parse parse(build(png), kind);
            ASSERT_EQ(parse.run(), PNG_DONE) << size << " bytes, kind " << kind;
            ASSERT_EQ(parse.state.idatCount, 3u);
            for (size_t i = 0; i < 3; ++i) {
                const PngIdatEntry &entry = parse.state.idatTable[i];
                EXPECT_EQ(entry.length, size);
                const size_t wanted = starts[2 + i] + 8;
                EXPECT_TRUE(kind != PELM_SOURCE_MEMORY || entry.memoryAddress == parse.source.source.data + wanted);
                EXPECT_EQ(entry.sourceOffset, kind == PELM_SOURCE_MEMORY ? 0 : wanted) << "entry " << i;
            }
        }
    }
}

TEST(Chunks, memory_is_parsed_without_the_hosts_reading_services) {
    Png png = small_png(3, 8);
    png.before_idat = {unknown_chunk(40000)};
    const Bytes file = build(png);
    for (const size_t size : {file.size(), file.size() - 1, file.size() - 13, size_t{100}, size_t{10}}) {
        Parse parse({file.begin(), file.begin() + static_cast<ptrdiff_t>(size)}, PELM_SOURCE_MEMORY);
        parse.run();
        EXPECT_TRUE(TestHost::get().reads.empty());
        EXPECT_TRUE(TestHost::get().seeks.empty());
    }
}

TEST(Chunks, flags_and_index_start_anew_with_every_run) {
    Parse parse(build(small_png(2, 8)), PELM_SOURCE_MEMORY);
    parse.state.ancillaryFlags = 0xFFFFFFFF;
    parse.state.idatCount = 7;
    EXPECT_EQ(parse.run(), PNG_DONE);
    EXPECT_EQ(parse.state.ancillaryFlags, 0u);
    EXPECT_EQ(parse.state.idatCount, 1u);
}

} // namespace pelm::test

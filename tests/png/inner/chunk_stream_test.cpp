// What is particular to chunks that come through the read buffer of 16384 bytes.
#include <gtest/gtest.h>

#include "tests/png/inner/parse.h"

namespace pelm::test {

namespace {

constexpr size_t buffer_size = 16384;

// A picture in which the chunk behind an unknown one begins `before` bytes before the end of the first buffer.
Png png_with_next_chunk(uint8_t colour_type, size_t before) {
    Png png = small_png(colour_type, 8);
    png.stream = Bytes(40, 9);
    png.before_plte = {unknown_chunk(buffer_size - before - 33 - 12)};
    return png;
}

// Split so that one to three bytes of a length or a type are carried over.
bool splits_header(size_t before) {
    return (before >= 1 && before <= 3) || (before >= 5 && before <= 7);
}

} // namespace

TEST(ChunkStream, a_header_split_in_its_length_or_type_fails_from_streams_only) {
    const size_t idat_size = 12 + 40;
    for (size_t before = 0; before <= 70; ++before) {
        const Bytes file = build(png_with_next_chunk(2, before));
        EXPECT_EQ(parsed(file, PELM_SOURCE_MEMORY), PNG_DONE);
        const bool fails = splits_header(before) || (before > idat_size && splits_header(before - idat_size));
        for (const uint32_t kind : {PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT, PELM_SOURCE_SEQUENTIAL}) {
            Parse parse(file, kind);
            const uint32_t code = parse.run();
            if (fails) {
                EXPECT_TRUE(code == PNG_BAD_DATA || code == PNG_FORMAT_ERROR) << before << " bytes before: " << code;
                continue;
            }
            ASSERT_EQ(code, PNG_DONE) << before << " bytes before";
            EXPECT_EQ(parse.state.idatTable[0].sourceOffset, buffer_size - before + 8);
        }
    }
}

TEST(ChunkStream, behind_carried_bytes_the_noted_start_is_the_old_end) {
    // The end chunk's header is split. Reading it again starts too far on by the carried bytes, which does no harm
    // where something stands behind the file.
    for (size_t before = 1; before <= 7; ++before) {
        if (!splits_header(before)) continue;
        Png png = png_with_next_chunk(2, before + 12 + 40);
        Bytes file = build(png);
        EXPECT_EQ(parsed(file, PELM_SOURCE_STREAM), PNG_FORMAT_ERROR) << before;
        file.insert(file.end(), 8, 0);
        Parse parse(file, PELM_SOURCE_STREAM);
        EXPECT_EQ(parse.run(), PNG_DONE) << before;
        EXPECT_EQ(parse.input.bufferStart, buffer_size) << before;
    }
}

TEST(ChunkStream, seeks_back_to_the_start_noted_before_the_checksum) {
    Png png = small_png(2, 8);
    png.stream = Bytes(40000, 3);
    Parse parse(build(png), PELM_SOURCE_STREAM);
    EXPECT_EQ(parse.run(), PNG_DONE);
    // IHDR and IDAT go back to the first buffer; the rest of the data and then the checksum are stepped over; the end
    // chunk, read into a fresh buffer, begins it.
    const int32_t end_chunk = 33 + 12 + 40000;
    const std::vector<SeekCall> wanted = {
        {0, 0}, {0, 0}, {0, 0}, {end_chunk - 4 - static_cast<int32_t>(buffer_size), 1}, {4, 1}, {end_chunk, 0}};
    EXPECT_EQ(TestHost::get().seeks.size(), wanted.size());
    EXPECT_TRUE(TestHost::get().seeks == wanted);
    EXPECT_EQ(parse.input.bytesLeft, 0u);
    EXPECT_EQ(parse.source.source.hostPosition, parse.source.source.size);
}

TEST(ChunkStream, reads_whole_buffers_only) {
    Png png = small_png(3, 8);
    png.before_idat = {unknown_chunk(50000)};
    Parse parse(build(png), PELM_SOURCE_STREAM);
    EXPECT_EQ(parse.run(), PNG_DONE);
    for (const ReadCall &read : TestHost::get().reads)
        EXPECT_LE(read.asked, static_cast<int32_t>(buffer_size));
}

TEST(ChunkStream, a_palette_across_the_buffers_end_is_whole) {
    for (size_t before = 8; before <= 40; ++before) {
        Png png = png_with_next_chunk(3, before);
        png.plte = Bytes(21);
        for (size_t i = 0; i < 21; ++i)
            (*png.plte)[i] = static_cast<uint8_t>(i + 1);
        const size_t plte_size = 12 + 21;
        if (before > plte_size && splits_header(before - plte_size)) continue;
        Parse parse(build(png), PELM_SOURCE_STREAM);
        ASSERT_EQ(parse.run(), PNG_DONE) << before << " bytes before";
        ASSERT_TRUE(std::equal(png.plte->begin(), png.plte->end(), parse.state.palette)) << before << " bytes before";
        EXPECT_EQ(parse.state.idatTable[0].sourceOffset, buffer_size - before + plte_size + 8) << before;
    }
}

TEST(ChunkStream, alphas_of_a_palette_across_the_buffers_end_are_whole) {
    for (size_t before = 8; before <= 14; ++before) {
        Png png = png_with_next_chunk(3, before + 18); // PLTE of 2 entries first
        png.trns = Bytes{11, 22, 33};
        Parse parse(build(png), PELM_SOURCE_STREAM);
        ASSERT_EQ(parse.run(), PNG_DONE) << before << " bytes before";
        EXPECT_EQ(parse.state.paletteAlpha[0], 11u);
        EXPECT_EQ(parse.state.paletteAlpha[1], 22u);
    }
}

TEST(ChunkStream, a_key_split_by_the_buffers_end_makes_the_next_chunk_fail) {
    for (size_t before = 8; before <= 16; ++before)
        for (const uint8_t colour_type : Bytes{0, 2}) {
            const size_t length = colour_type == 0 ? 2 : 6;
            if (before > 12 + length) continue; // the next chunk's header would be split
            Png png = png_with_next_chunk(colour_type, before);
            png.trns = Bytes(length, 1);
            EXPECT_EQ(parsed(build(png), PELM_SOURCE_MEMORY), PNG_DONE);
            const bool split = before > 8 && before < 8 + length;
            const uint32_t code = parsed(build(png), PELM_SOURCE_STREAM);
            EXPECT_EQ(code == PNG_DONE, !split) << "type " << int{colour_type} << ", " << before << ": " << code;
        }
}

TEST(ChunkStream, a_seek_that_falls_short_is_refused) {
    Png png = small_png(2, 8);
    png.stream = Bytes(40000, 3);
    png.has_iend = false;
    std::vector<Chunk> chunks = chunks_of(png);
    const Bytes file = file_of(chunks);
    Parse parse(file, PELM_SOURCE_STREAM);
    const uint32_t code = parse.run();
    EXPECT_TRUE(code == PNG_BAD_DATA || code == PNG_FORMAT_ERROR);
}

TEST(ChunkStream, a_read_that_fails_is_the_end_of_the_file) {
    Png png = small_png(3, 8);
    png.trns = Bytes{1};
    png.before_idat = {unknown_chunk(40000)};
    const Bytes file = build(png);
    int reads = 0;
    {
        Parse parse(file, PELM_SOURCE_STREAM);
        EXPECT_EQ(parse.run(), PNG_DONE);
        reads = static_cast<int>(TestHost::get().reads.size());
    }
    for (int failing = 1; failing <= reads; ++failing)
        for (const int32_t result : {-1, 0}) {
            Parse parse(file, PELM_SOURCE_STREAM);
            TestHost::get().faults.failing_reads_from = failing;
            TestHost::get().faults.failing_read_result = result;
            const uint32_t code = parse.run();
            EXPECT_TRUE(code == PNG_BAD_DATA || code == PNG_FORMAT_ERROR) << "read " << failing << ": " << code;
        }
}

TEST(ChunkStream, a_host_that_claims_more_than_it_was_asked_for_does_no_harm) {
    Png png = small_png(2, 8);
    png.before_idat = {unknown_chunk(20000)};
    Parse parse(build(png), PELM_SOURCE_STREAM);
    TestHost::get().faults.overclaiming_reads_from = 1;
    parse.run();
}

// A chunk's data are read once for its checksum, and once more to be used.
TEST(ChunkStream, data_of_which_only_a_part_comes_again_fail) {
    for (const uint8_t colour_type : Bytes{0, 2, 3}) {
        Png png = small_png(colour_type, 8);
        png.trns = Bytes(colour_type == 0 ? 2 : 6, 1);
        if (colour_type == 3) png.trns = Bytes{1, 2};
        const Bytes file = build(png);
        const int chunks = colour_type == 3 ? 5 : 4;
        for (int again = 2; again <= 1 + chunks; ++again)
            for (size_t part = 1; part <= file.size(); ++part) {
                Parse parse(file, PELM_SOURCE_STREAM);
                TestHost::get().faults.short_reads_from = again;
                TestHost::get().faults.most_per_read = static_cast<int32_t>(part);
                TestHost::get().faults.failing_reads_from = again + 1;
                const uint32_t code = parse.run();
                // Only the last chunk is followed by nothing; its checksum is stepped over.
                if (again == 1 + chunks && part >= file.size() - 4)
                    ASSERT_EQ(code, PNG_DONE) << part << " bytes";
                else
                    ASSERT_TRUE(code == PNG_BAD_DATA || code == PNG_FORMAT_ERROR)
                        << "type " << int{colour_type} << ", read " << again << ", " << part << " bytes: " << code;
            }
    }
}

} // namespace pelm::test

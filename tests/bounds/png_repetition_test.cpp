// A megabyte of what says nothing: blocks without data, chunks without use, image data in crumbs.
#include <cstdio>
#include <cstdlib>

#include "png/state.h"
#include "tests/bounds/ways.h"
#include "tests/bounds/work.h"
#include "tests/png/support/png_builder.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

constexpr size_t megabyte = 1000000;
constexpr size_t read_buffer = 16384;

// Up to the end of the first read buffer of a stream. Small chunks behind it part no header by the end of a buffer: it
// comes before one, between length and type, behind them, or within data or checksum, behind which a new buffer begins.
Chunk padding() {
    constexpr size_t signature_and_ihdr = 33, frame = 12;
    return {"tEXt", Bytes(read_buffer - signature_and_ihdr - frame)};
}

class PngRepetition : public BoundsTest {
protected:
    // 1 MB of stored noise in chunks as encoders write them.
    static const Png &ordinary() {
        static const Png png = [] {
            Png made{.width = 600, .height = 556, .colour_type = 2, .depth = 8};
            made.rows = noise_rows(made, 3);
            made.level = 0;
            made.idat_size = 8192;
            return made;
        }();
        return png;
    }
    static Png small() {
        Png png{.width = 5, .height = 4, .colour_type = 2, .depth = 8};
        png.rows = noise_rows(png, 7);
        return png;
    }
    static Asking own_size(const Png &png, uint32_t kind) {
        return {kind, PELM_FORMAT_RGB888, 0, static_cast<int32_t>(png.width), static_cast<int32_t>(png.height)};
    }
    static Bytes pixels_of(const Png &png) {
        Bytes pixels;
        for (const Bytes &row : png.rows)
            pixels.insert(pixels.end(), row.begin(), row.end());
        pixels.resize(pixels.size() / 3 * 4); // the output has room for four bytes per pixel
        return pixels;
    }
    static Work work_of(const Bytes &file, const Png &png, Way way, uint32_t kind) {
        reset_work();
        const Decoded decoded = decode(file, way, own_size(png, kind));
        EXPECT_EQ(decoded.result, 1) << name_of(way) << ", kind " << kind;
        EXPECT_EQ(decoded.output, pixels_of(png)) << name_of(way) << ", kind " << kind;
        EXPECT_TRUE(left_nothing());
        return work();
    }
    // So many bytes of noise, and a few more, as they are.
    static Png stored(uint32_t least) {
        Png png{.width = 80, .height = least / 240 + 1, .colour_type = 2, .depth = 8};
        png.rows = noise_rows(png, 5);
        png.level = 0;
        png.before_idat = {padding()};
        return png;
    }
    // The small picture behind a megabyte of such blocks.
    template <class Block>
    static Bytes file_behind(Block add_block) {
        Png png = small();
        const Bytes data = scanlines_of(png);
        Deflate deflate;
        while (deflate.bits.bit_count() < 8 * megabyte)
            add_block(deflate);
        deflate.fixed(literals(data), Last::yes);
        png.stream = zlib_stream(deflate.bytes(), data);
        return build(png);
    }
    // Nor much more memory: ordinary data of stored blocks does without the codes of the others.
    static void costs_no_more_than_ordinary_data(const Bytes &file) {
        ASSERT_GT(file.size(), megabyte);
        for (const uint32_t kind : every_kind)
            for (const Way way : {Way::png, Way::png_lines})
                EXPECT_TRUE(
                    within(2, work_of(file, small(), way, kind), work_of(build(ordinary()), ordinary(), way, kind)))
                    << name_of(way) << ", kind " << kind;
    }
    static constexpr uint64_t index_step = 2048 * sizeof(PngIdatEntry);
    // What the host copies and fills while the index of so many chunks grows: its entries there and back, and the new
    // table.
    static uint64_t moved_by_index(uint64_t chunks) {
        uint64_t moved = 0;
        for (uint64_t steps = 1; steps * 2048 < chunks; ++steps)
            moved += 2 * steps * index_step + (steps + 1) * index_step;
        return moved;
    }
};

// Codes for the end of a block, and nothing else, in a header as short as can be.
DynamicCodes shortest_codes() {
    DynamicCodes codes;
    codes.literal_lengths = Bytes(257, 0);
    codes.literal_lengths[256] = 1;
    codes.distance_lengths = {1};
    codes.code_length_lengths = Bytes(19, 0);
    (*codes.code_length_lengths)[1] = (*codes.code_length_lengths)[18] = 1;
    codes.sequence = std::vector<LengthSymbol>{{18, 127}, {18, 107}, {1, 0}, {1, 0}}; // 138 and 118 zeros
    return codes;
}

TEST_F(PngRepetition, empty_stored_blocks_cost_what_ordinary_data_does) {
    costs_no_more_than_ordinary_data(file_behind([](Deflate &deflate) { deflate.stored({}, Last::no); }));
}

TEST_F(PngRepetition, empty_fixed_blocks_cost_what_ordinary_data_does) {
    costs_no_more_than_ordinary_data(file_behind([](Deflate &deflate) {
        deflate.block_header(1, Last::no);
        deflate.bits.put_code(0, 7); // the end of the block
    }));
}

TEST_F(PngRepetition, tiny_dynamic_blocks_cost_what_ordinary_data_does) {
    const DynamicCodes codes = shortest_codes(); // under 12 bytes a block
    costs_no_more_than_ordinary_data(file_behind([&codes](Deflate &deflate) { deflate.dynamic(codes, {}, Last::no); }));
}

TEST_F(PngRepetition, each_palette_releases_the_one_before) {
    constexpr size_t palettes = 70000;
    Png png{.width = 1, .height = 1, .colour_type = 3, .depth = 8};
    png.plte = Bytes{1, 2, 3};
    png.before_plte = {padding()};
    const Bytes one = build(png);
    for (size_t i = 1; i < palettes; ++i)
        png.before_idat.push_back({"PLTE", {static_cast<uint8_t>(i), static_cast<uint8_t>(i >> 8), 77}});
    const Bytes file = build(png);
    ASSERT_GT(file.size(), megabyte);
    constexpr size_t last = palettes - 1;
    for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_SEQUENTIAL}) {
        const auto output_of = [&](const Bytes &bytes) {
            reset_work();
            return decode(bytes, Way::png, {kind, PELM_FORMAT_RGB888, 0, 1, 1}).output;
        };
        EXPECT_EQ(output_of(one), (Bytes{1, 2, 3, 0})) << "kind " << kind;
        const Work once = work();
        EXPECT_EQ(output_of(file), (Bytes{static_cast<uint8_t>(last), static_cast<uint8_t>(last >> 8), 77, 0}))
            << "kind " << kind;
        EXPECT_EQ(work().allocations, once.allocations + 2 * last);
        EXPECT_EQ(work().peak_bytes, once.peak_bytes);
        EXPECT_TRUE(left_nothing());
        // Each chunk in a stream is read again behind its checksum, a whole buffer from where it lies; what is left of
        // the buffer's last chunk is carried.
        const bool is_stream = kind != PELM_SOURCE_MEMORY;
        const size_t buffers = file.size() / read_buffer + 1;
        EXPECT_LE(work().reads, is_stream ? once.reads + last + 3 * buffers : 0);
        EXPECT_LE(work().bytes_read, is_stream ? (palettes + 3 * buffers) * read_buffer : 0);
        EXPECT_LE(work().bytes_moved, once.bytes_moved + last * (768 + 6 + 3) + buffers * 16);
    }
}

TEST_F(PngRepetition, twenty_thousand_chunks_of_one_byte_are_one_image) {
    Png png{.width = 80, .height = 84, .colour_type = 2, .depth = 8};
    png.rows = noise_rows(png, 5);
    png.level = 0;
    const Work in_one = work_of(build(png), png, Way::png, PELM_SOURCE_MEMORY);
    const size_t chunks = stream_of(png).size();
    ASSERT_GE(chunks, 20000u);
    png.idat_size = 1;
    for (const Way way : png_ways) {
        const Work got = work_of(build(png), png, way, PELM_SOURCE_MEMORY);
        const uint64_t steps = (chunks + 2047) / 2048;
        EXPECT_EQ(got.allocations, in_one.allocations + 2 * (steps - 1));
        EXPECT_LE(got.peak_bytes, std::max(in_one.peak_bytes, uint64_t{200000}) + 2 * steps * index_step);
        EXPECT_GE(got.bytes_moved, moved_by_index(chunks));
        EXPECT_LE(got.bytes_moved, in_one.bytes_moved + moved_by_index(chunks) + chunks + 64);
    }
}

TEST_F(PngRepetition, twenty_thousand_chunks_in_streams_cost_two_reads_and_one_read_buffer_each) {
    for (const uint32_t size : {1u, 4u}) {
        Png png = stored(20000 * size);
        png.idat_size = size;
        const Bytes file = build(png);
        const size_t chunks = (stream_of(png).size() + size - 1) / size;
        const size_t buffers = file.size() / read_buffer + 1;
        for (const uint32_t kind : {PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT, PELM_SOURCE_SEQUENTIAL}) {
            const Work got = work_of(file, png, Way::png, kind);
            // Each chunk is read again behind its checksum, a whole buffer from where it lies; then its data, and its
            // frame.
            EXPECT_LE(got.reads, 3 * chunks + 3 * buffers);
            EXPECT_LE(got.bytes_read, (chunks + 3 * buffers) * read_buffer + file.size());
            EXPECT_LE(got.seeks, 2 * chunks + 4);
            EXPECT_LE(got.bytes_moved, moved_by_index(chunks) + file.size() + 200000);
        }
    }
}

// docs/reliability.md, "Where it does not hold", states these.
TEST_F(PngRepetition, streams_of_crumbs_are_read_as_often_as_is_stated) {
    struct Stated {
        uint32_t size; // of a chunk's data
        double times;  // that a byte of the file is read
    };
    for (const auto &[size, times] : {Stated{1, 1260}, Stated{4, 1030}, Stated{32, 380}, Stated{512, 35}}) {
        Png png = stored(10000 + 500 * size);
        png.idat_size = size;
        png.after_idat = {padding()}; // so that the last chunks, too, are read again in whole buffers
        const Bytes file = build(png);
        const Work got = work_of(file, png, Way::png, PELM_SOURCE_STREAM);
        const double read = static_cast<double>(got.bytes_read) / static_cast<double>(file.size() - 2 * read_buffer);
        std::printf("IDAT chunks of %u bytes: a stream's bytes are read %.1f times\n", size, read);
        EXPECT_NEAR(read, times, times / 50) << "chunks of " << size;
    }
}

TEST_F(PngRepetition, a_million_chunks_of_one_byte_are_one_image) {
    Png png = ordinary();
    if (quick()) {
        png = stored(100000);
    }
    png.idat_size = 1;
    const size_t chunks = stream_of(png).size();
    ASSERT_GE(chunks, quick() ? 100000u : 1000000u);
    const Work got = work_of(build(png), png, Way::png, PELM_SOURCE_MEMORY);
    // Quadratic, in steps of 2048.
    EXPECT_GE(got.bytes_moved, moved_by_index(chunks));
    EXPECT_LE(got.bytes_moved, moved_by_index(chunks) + chunks + 200000);
    EXPECT_LE(got.peak_bytes, 2 * (chunks + 2048) * sizeof(PngIdatEntry) + 200000);
}

} // namespace
} // namespace pelm::test

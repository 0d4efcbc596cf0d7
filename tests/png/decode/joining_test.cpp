// Several IDAT chunks in memory are joined in place, once; streams and everything else leave the file alone. And where
// the walk over the chunks ends.
#include "tests/png/decode/decoding.h"

namespace pelm::test {
namespace {

class PngJoining : public PngDecoding {
protected:
    Picture picture = noise_picture(rgb, 8, 12, 10);
    Request request{7, 0, 12, 10};

    Png split(size_t size) const {
        Png png = png_of(picture);
        png.idat_size = size;
        return png;
    }
    Bytes whole() const {
        Bytes expected = background(12 * 10 * 4);
        draw(picture, request, expected);
        return expected;
    }
    static Bytes memory_of(const Decode &decode) {
        const uint8_t *const bytes = decode.source.source.data;
        return {bytes, bytes + decode.source.source.size};
    }
};

// The file's bytes once its IDAT chunks have been joined.
Bytes joined(const Png &png) {
    std::vector<Chunk> chunks = chunks_of(png);
    Bytes file = file_of(chunks);
    std::vector<Chunk> kept;
    Bytes stream;
    bool placed = false;
    for (const Chunk &chunk : chunks) {
        if (chunk.type == "IDAT")
            stream.insert(stream.end(), chunk.data.begin(), chunk.data.end());
        else if (!placed && stream.empty())
            kept.push_back(chunk);
        placed = placed || chunk.type == "IDAT";
    }
    kept.push_back({"IDAT", stream});
    kept.push_back({"IEND", {}});
    const Bytes front = file_of(kept);
    std::copy(front.begin(), front.end(), file.begin());
    return file;
}

TEST_F(PngJoining, several_chunks_become_one_in_the_callers_memory) {
    for (const size_t size : {1u, 5u, 100u, 300u})
        for (const bool between : {false, true}) {
            Png png = split(size);
            if (between) png.after_idat = {{"tEXt", {'a', 0, 'b'}}, {"IDAT", {}}};
            const Bytes file = build(png);
            Decode decode(file, PELM_SOURCE_MEMORY, request);
            Output output(12 * 10 * 4);
            EXPECT_EQ(decode.one_shot(output.data()), 1);
            EXPECT_EQ(output.bytes(), whole());
            const Bytes wanted = joined(png);
            EXPECT_EQ(memory_of(decode), wanted) << "chunks of " << size;

            // It is a file of one chunk now.
            output.fill(background(output.size()));
            EXPECT_EQ(decode.one_shot(output.data()), 1);
            EXPECT_EQ(output.bytes(), whole());
            EXPECT_EQ(memory_of(decode), wanted);
        }
}

TEST_F(PngJoining, exactly_two_chunks_leave_room_for_exactly_one_and_an_end) {
    Png png = png_of(picture);
    png.idat_sizes = {7};
    png.after_idat = {{"tEXt", {'a', 0, 'b'}}};
    Decode decode(build(png), PELM_SOURCE_MEMORY, request);
    EXPECT_EQ(decode.one_shot(nullptr), 1);
    const Bytes after = memory_of(decode), wanted = joined(png);
    EXPECT_EQ(after, wanted);
    const Bytes text = bytes_of(png.after_idat[0]);
    EXPECT_TRUE(std::search(after.begin(), after.end(), text.begin(), text.end()) != after.end());
}

TEST_F(PngJoining, chunks_between_image_data_do_not_matter_in_memory) {
    std::vector<Chunk> chunks = chunks_of(split(60));
    for (size_t i = 2; i + 1 < chunks.size(); i += 2)
        chunks.insert(chunks.begin() + static_cast<ptrdiff_t>(i), {"teXt", Bytes(i, 1)});
    Decode decode(file_of(chunks), PELM_SOURCE_MEMORY, request);
    Output output(12 * 10 * 4);
    for (int times = 0; times < 2; ++times) {
        EXPECT_EQ(decode.one_shot(output.data()), 1);
        EXPECT_EQ(output.bytes(), whole());
    }
}

TEST_F(PngJoining, one_chunk_stays_as_it_is) {
    for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
        Decode decode(build(png_of(picture)), PELM_SOURCE_MEMORY, request);
        EXPECT_EQ(decode.call(call, nullptr, 0), 1);
        EXPECT_TRUE(decode.source.unchanged());
    }
}

TEST_F(PngJoining, streams_stay_as_they_are) {
    for (const uint32_t kind : {PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT, PELM_SOURCE_SEQUENTIAL}) {
        Decode decode(build(split(9)), kind, request);
        EXPECT_EQ(decode.one_shot(nullptr), 1);
        EXPECT_TRUE(decode.source.unchanged());
    }
}

TEST_F(PngJoining, a_file_that_is_refused_stays_as_it_is) {
    std::vector<Chunk> chunks = chunks_of(split(50));
    chunks.back().crc = 1;
    Decode decode(file_of(chunks), PELM_SOURCE_MEMORY, request);
    EXPECT_EQ(decode.one_shot(nullptr), 0);
    EXPECT_TRUE(decode.source.unchanged());
}

TEST_F(PngJoining, asking_for_transparency_never_joins) {
    Decode decode(build(split(9)), PELM_SOURCE_MEMORY, request);
    EXPECT_EQ(PELMI_GetAlphaTrFlag(&decode.info), 0u);
    EXPECT_TRUE(decode.source.unchanged());
}

TEST_F(PngJoining, image_data_with_a_bad_header_is_joined_before_it_fails) {
    Png png = split(50);
    Bytes stream = stream_of(png);
    stream[0] = 0x77;
    png.stream = stream;
    Decode decode(build(png), PELM_SOURCE_MEMORY, request);
    EXPECT_EQ(decode.one_shot(nullptr), 0);
    EXPECT_EQ(memory_of(decode), joined(png));
}

TEST_F(PngJoining, several_calls_join_once) {
    Png png = png_of(picture);
    png.stream = stream_of_blocks(scanlines_of(png), Blocks::dynamic, 90, 37);
    png.idat_size = 31;
    for (const Call call : {Call::iterative, Call::line}) {
        Decode decode(build(png), PELM_SOURCE_MEMORY, request);
        Output output(12 * 10 * 4);
        EXPECT_EQ(decode.call(call, output.data(), 2), 4);
        const Bytes wanted = joined(png);
        int32_t result = 4;
        while (result == 4) {
            EXPECT_EQ(memory_of(decode), wanted);
            result = decode.call(call, output.data(), 2);
        }
        EXPECT_EQ(result, 1);
        EXPECT_EQ(output.bytes(), whole());
        EXPECT_EQ(memory_of(decode), wanted);
    }
}

TEST_F(PngJoining, an_empty_chunk_of_image_data_ends_the_file) {
    Png png = png_of(picture);
    png.after_idat = {{"IDAT", {}}, {"IDAT", {1, 2, 3}}};
    for (const uint32_t kind : all_source_kinds) {
        Decode decode(build(png), kind, request);
        Output output(12 * 10 * 4);
        EXPECT_EQ(decode.one_shot(output.data()), 1);
        EXPECT_EQ(output.bytes(), whole());
        EXPECT_TRUE(decode.source.unchanged()) << "one chunk was indexed";
    }
}

TEST_F(PngJoining, any_empty_chunk_ends_the_file) {
    for (const std::string type : {"IEND", "teXt", "IDAT", "abcd"}) {
        Png png = png_of(picture);
        png.has_iend = false;
        png.after_idat = {{type, {}}, {"xxxx", {1}, 99, 7}};
        for (const uint32_t kind : all_source_kinds) {
            const Outcome outcome = run(build(png), kind, request, 480);
            EXPECT_EQ(flaws(outcome), "") << type;
            EXPECT_EQ(outcome.output, whole()) << type;
        }
    }
}

TEST_F(PngJoining, image_data_behind_an_empty_chunk_is_not_found) {
    for (const std::string type : {"IDAT", "teXt"}) {
        Png png = png_of(picture);
        png.before_idat = {{type, {}}};
        for (const uint32_t kind : all_source_kinds) {
            const Outcome outcome = run(build(png), kind, request, 480);
            EXPECT_EQ(flaws(outcome, 0), "") << type;
            EXPECT_EQ(outcome.output, background(480)) << type;
        }
    }
}

TEST_F(PngJoining, a_file_without_image_data_fails) {
    for (const uint32_t kind : all_source_kinds)
        for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
            const Outcome outcome = run(file_of({ihdr_chunk(png_of(picture)), {"IEND", {}}}), kind, request, 480, call);
            EXPECT_EQ(flaws(outcome, 0), "");
            EXPECT_EQ(outcome.output, background(480));
        }
}

TEST_F(PngJoining, the_last_of_two_headers_counts) {
    Png small = png_of(picture);
    small.width = 3;
    small.depth = 16;
    std::vector<Chunk> chunks = chunks_of(png_of(picture));
    chunks.insert(chunks.begin(), ihdr_chunk(small));
    for (const uint32_t kind : all_source_kinds)
        EXPECT_EQ(one_shot_difference(picture, file_of(chunks), kind, request), "");
}

TEST_F(PngJoining, a_header_that_makes_the_image_indexed_keeps_the_flag_of_transparency_and_has_no_palette) {
    Picture black = noise_picture(indexed, 8, 60, 40); // enough pixels to repay a table of finished colours
    black.palette = Bytes(768, 0);
    Picture plain = noise_picture(grey, 8, 60, 40);
    plain.transparency = Bytes{0, 7};
    std::vector<Chunk> chunks = chunks_of(png_of(black)); // IHDR, PLTE, IDAT, IEND
    const std::vector<Chunk> before = chunks_of(png_of(plain));
    chunks[1] = chunks[0];
    chunks[0] = before[1]; // tRNS
    chunks.insert(chunks.begin(), before[0]);
    for (const uint32_t kind : all_source_kinds)
        for (const Request &box : {Request{1, 0, 60, 40}, Request{7, 0, 60, 40}, Request{7, 0, 31, 22}})
            EXPECT_EQ(one_shot_difference(black, file_of(chunks), kind, box), "");
}

TEST_F(PngJoining, a_header_that_makes_the_image_grey_keeps_a_key_that_no_grey_has) {
    const Picture plain = noise_picture(grey, 8, 9, 9);
    Picture coloured = noise_picture(rgb, 8, 9, 9);
    std::vector<Chunk> chunks = chunks_of(png_of(plain)); // IHDR, IDAT, IEND
    const uint8_t first = plain.rows[0];
    const uint8_t other = static_cast<uint8_t>(first + 1);
    for (const Bytes &key : {Bytes{0, first, 0, other, 0, first}, Bytes{0, first, 0, first, 0, other}}) {
        coloured.transparency = key;
        const std::vector<Chunk> before = chunks_of(png_of(coloured));
        std::vector<Chunk> both = chunks;
        both.insert(both.begin(), {before[0], before[1]});
        for (const uint32_t kind : all_source_kinds)
            EXPECT_EQ(one_shot_difference(plain, file_of(both), kind, {7, 0, 9, 9}), "");
    }
}

TEST_F(PngJoining, chunks_in_an_unusual_order_are_taken) {
    const Picture coloured = with_transparency(noise_picture(indexed, 8, 9, 9));
    std::vector<Chunk> chunks = chunks_of(png_of(coloured)); // IHDR, PLTE, tRNS, IDAT, IEND
    ASSERT_EQ(chunks.size(), 5u);
    for (const std::vector<size_t> &order : {std::vector<size_t>{0, 1, 3, 2, 4},
                                             {0, 3, 1, 2, 4},
                                             {3, 0, 1, 2, 4},
                                             {0, 1, 1, 2, 3, 4},
                                             {0, 1, 2, 2, 3, 4}}) {
        std::vector<Chunk> turned;
        for (const size_t i : order)
            turned.push_back(chunks[i]);
        for (const uint32_t kind : all_source_kinds)
            for (const uint32_t format : {1u, 7u})
                EXPECT_EQ(one_shot_difference(coloured, file_of(turned), kind, {format, 0, 9, 9}), "");
    }
}

TEST_F(PngJoining, a_palette_is_skipped_in_other_colour_types) {
    std::vector<Chunk> chunks = chunks_of(png_of(picture));
    chunks.insert(chunks.begin() + 1, {"PLTE", Bytes(770, 3)});
    EXPECT_EQ(one_shot_difference(picture, file_of(chunks), PELM_SOURCE_MEMORY, request), "");
}

} // namespace
} // namespace pelm::test

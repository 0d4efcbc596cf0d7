// The ways of calling: one call, block by block, line by line, over every kind of source, give the same image.
#include <algorithm>

#include "tests/png/decode/calls_model.h"
#include "tests/png/decode/decoding.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

class PngCalls : public PngDecoding {
protected:
    // Line calls with a fresh buffer each, against the model. The buffers have the size that the model's request has.
    static void expect_lines(const Picture &picture, const Bytes &file, uint32_t kind, const Request &request,
                             const std::vector<int32_t> &rows) {
        const size_t size = buffer_size(picture, request);
        CallsModel model(picture, request);
        Decode decode(file, kind, request);
        int32_t result = 4;
        for (size_t call = 0; result == 4 && call < 400; ++call) {
            const int32_t asked = rows[std::min(call, rows.size() - 1)];
            Output output(size);
            Bytes expected = background(size);
            const int32_t wanted = model.line(asked, expected);
            result = decode.line(output.data(), asked);
            ASSERT_EQ(result, wanted) << "call " << call << " of " << asked << " rows, " << picture.described() << ", "
                                      << request.described();
            ASSERT_EQ(difference(expected, output.bytes(), picture, request), "") << "call " << call;
            ASSERT_EQ(decode.started(), result == 4);
        }
        EXPECT_EQ(result, 1);
    }

    // One way of calling, one buffer for all calls, against the whole image.
    static void expect_whole(const Picture &picture, const Bytes &file, uint32_t kind, const Request &request,
                             Call call, int32_t rows) {
        const size_t size = buffer_size(picture, request);
        Bytes expected = background(size);
        draw(picture, request, expected);
        const Outcome outcome = run(file, kind, request, size, call, rows);
        const std::string what = name_of(call) + " calls of " + std::to_string(rows) + " rows, kind " +
                                 std::to_string(kind) + ", " + picture.described();
        ASSERT_EQ(flaws(outcome), "") << what;
        ASSERT_EQ(difference(expected, outcome.output, picture, request), "") << what;
    }

    static Picture picture_of(Layout layout, uint32_t width, uint32_t height) {
        return with_transparency(noise_picture(layout.colour_type, layout.depth, width, height));
    }
};

// Runs of equal and of repeating bytes, so that matches reach over several rows.
Picture repetitive_picture(uint32_t width, uint32_t height) {
    Picture picture{width, height, rgb, 8, {}, {}, {}};
    picture.rows.resize(picture.row_bytes() * height);
    for (size_t i = 0; i < picture.rows.size(); ++i)
        picture.rows[i] = static_cast<uint8_t>(i / 1000 * 40);
    return picture;
}

TEST_F(PngCalls, every_way_of_calling_gives_the_same_image_from_every_source) {
    const Layout quick_layouts[] = {{rgb, 8}, {indexed, 2}};
    const std::vector<Layout> layouts = quick()
                                            ? std::vector<Layout>(std::begin(quick_layouts), std::end(quick_layouts))
                                            : std::vector<Layout>(std::begin(all_layouts), std::end(all_layouts));
    for (const Layout layout : layouts) {
        const Picture picture = picture_of(layout, 23, 17);
        for (const Blocks blocks : {Blocks::stored, Blocks::fixed, Blocks::dynamic, Blocks::mixed}) {
            const Bytes file = file_of_blocks(picture, blocks, (picture.row_bytes() + 1) * 3 / 2);
            for (const uint32_t kind : all_source_kinds)
                for (const uint32_t format : {0u, 1u, 7u}) {
                    const Request request{format, 0, 25, 18};
                    expect_whole(picture, file, kind, request, Call::one_shot, 0);
                    expect_whole(picture, file, kind, request, Call::iterative, 0);
                    for (const int32_t rows : {1, 2, 5, 16, 17, 18})
                        expect_whole(picture, file, kind, request, Call::line, rows);
                }
        }
    }
}

TEST_F(PngCalls, every_row_count_of_line_calls_gives_the_same_image) {
    const Picture picture = repetitive_picture(31, 29);
    for (const Blocks blocks : {Blocks::stored, Blocks::fixed, Blocks::dynamic}) {
        const Bytes file = file_of_blocks(picture, blocks, 100000);
        for (int32_t rows = -2; rows <= 31; ++rows)
            for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM}) {
                expect_whole(picture, file, kind, {7, 0, 31, 29}, Call::line, rows);
                expect_lines(picture, file, kind, {7, 0, 31, 29}, {rows});
            }
    }
}

TEST_F(PngCalls, every_split_of_the_image_data_gives_the_same_image) {
    const Picture picture = picture_of({rgb, 8}, 23, 17);
    for (const Blocks blocks : {Blocks::stored, Blocks::dynamic}) {
        Png png = png_of(picture);
        png.stream = stream_of_blocks(scanlines_of(png), blocks, 200, 70);
        for (const size_t size : {1u, 2u, 3u, 7u, 100u, 500u}) {
            // Larger files may have a chunk header split by the end of the read buffer.
            if (png.stream->size() / size * 12 + png.stream->size() > 16000) continue;
            png.idat_size = size;
            const Bytes file = build(png);
            for (const uint32_t kind : all_source_kinds) {
                expect_whole(picture, file, kind, {1, 0, 23, 17}, Call::one_shot, 0);
                expect_whole(picture, file, kind, {1, 0, 23, 17}, Call::iterative, 0);
                expect_whole(picture, file, kind, {1, 0, 23, 17}, Call::line, 3);
            }
        }
    }
}

TEST_F(PngCalls, a_file_larger_than_the_read_buffer_gives_the_same_image) {
    const Picture picture = picture_of({rgb_alpha, 8}, 150, 120); // 72 KB that do not compress
    Png png = png_of(picture);
    for (const size_t size : {0u, 5000u, 16383u, 16384u, 16385u, 32768u, 40000u}) {
        png.idat_size = size;
        const Bytes file = build(png);
        for (const uint32_t kind : all_source_kinds) {
            expect_whole(picture, file, kind, {7, 0, 150, 120}, Call::one_shot, 0);
            expect_whole(picture, file, kind, {0, 0, 150, 120}, Call::iterative, 0);
            expect_whole(picture, file, kind, {7, 0, 150, 120}, Call::line, 50);
        }
    }
}

TEST_F(PngCalls, rows_longer_than_the_window_give_the_same_image) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{grey_alpha, 16}}) {
        const Picture picture = picture_of(layout, 30000, 5); // 90 and 120 KB a row
        for (const Blocks blocks : {Blocks::stored, Blocks::dynamic}) {
            const Bytes file = file_of_blocks(picture, blocks, 65535);
            for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_SEQUENTIAL}) {
                expect_whole(picture, file, kind, {7, 0, 30000, 5}, Call::one_shot, 0);
                expect_whole(picture, file, kind, {0, 0, 30000, 5}, Call::line, 1);
                expect_whole(picture, file, kind, {1, 0x700, 101, 4}, Call::one_shot, 0);
            }
        }
    }
}

// The place of a chunk is noted wrongly when its length or its type is split by the end of the buffer.
TEST_F(PngCalls, a_chunk_header_split_by_the_end_of_the_read_buffer_fails_from_streams_only) {
    const Picture picture = picture_of({rgb, 8}, 23, 17);
    for (uint32_t left = 0; left <= 9; ++left) {
        Png png = png_of(picture);
        // Signature, IHDR, tRNS and the frame of this chunk: what remains puts the next one `left` bytes before the
        // end.
        png.before_idat = {{"teXt", Bytes(16384 - left - 8 - 25 - 18 - 12)}};
        const Bytes file = build(png);
        const bool split = left % 4 != 0 && left < 8;
        for (const uint32_t kind : all_source_kinds) {
            const Outcome outcome = run(file, kind, {7, 0, 23, 17}, 23 * 17 * 4);
            EXPECT_EQ(flaws(outcome, split && kind != PELM_SOURCE_MEMORY ? 0 : 1), "")
                << "kind " << kind << ", " << left;
        }
    }
}

TEST_F(PngCalls, more_chunks_than_the_index_first_holds_keep_their_order) {
    const Picture picture = noise_picture(rgb, 8, 40, 30);
    Png png = png_of(picture);
    png.level = 0;
    png.idat_size = 1;
    const Bytes file = build(png); // 3600 chunks
    for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM}) {
        reset();
        expect_whole(picture, file, kind, {7, 0, 40, 30}, Call::one_shot, 0);
        expect_whole(picture, file, kind, {7, 0, 40, 30}, Call::line, 7);
    }
}

TEST_F(PngCalls, an_iterative_call_decodes_to_the_end_of_one_block) {
    const Picture picture = picture_of({rgb, 8}, 20, 24);
    const uint32_t row_length = 61;
    for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM})
        for (const size_t block : {61u, 62u, 100u, 200u, 700u}) {
            const Request request{7, 0, 20, 24};
            const size_t data = row_length * 24;
            Output output(20 * 24 * 4);
            Decode decode(file_of_blocks(picture, Blocks::stored, block), kind, request);
            for (size_t end = block;; end += block) {
                const int32_t wanted = end >= data ? 1 : 4;
                ASSERT_EQ(decode.iterative(output.data()), wanted) << "block " << block << ", bytes " << end;
                ASSERT_EQ(decode.started(), wanted == 4);
                Bytes expected = background(output.size());
                draw_rows(picture, request, static_cast<uint32_t>(std::min(end, data) / row_length), expected);
                ASSERT_EQ(difference(expected, output.bytes(), picture, request), "") << "bytes " << end;
                if (wanted == 1) break;
            }
            EXPECT_EQ(decode.info.iterative, 1u);
            EXPECT_EQ(decode.info.decodeStarted, 1u);
        }
}

TEST_F(PngCalls, an_iterative_decode_with_an_empty_last_block_takes_one_more_call) {
    const Picture picture = picture_of({grey, 8}, 12, 6);
    Png png = png_of(picture);
    const Bytes data = scanlines_of(png);
    Deflate deflate;
    deflate.stored(data, Last::no);
    deflate.stored({}, Last::yes);
    png.stream = zlib_stream(deflate.bytes(), data);
    for (const uint32_t kind : all_source_kinds) {
        const Outcome outcome = run(build(png), kind, {7, 0, 12, 6}, 12 * 6 * 4, Call::iterative);
        EXPECT_EQ(outcome.results, (std::vector<int32_t>{4, 1}));
        EXPECT_EQ(flaws(outcome), "");
    }
}

TEST_F(PngCalls, a_first_block_without_a_complete_row_starts_over_for_ever) {
    const Picture picture = picture_of({rgb, 8}, 20, 6);
    const uint32_t row_length = 61;
    Png png = png_of(picture);
    png.idat_size = 50;
    const Bytes data = scanlines_of(png);
    for (const bool empty : {false, true}) {
        Deflate deflate;
        if (empty)
            deflate.stored({}, Last::no);
        else
            deflate.fixed(tokens_of({data.begin(), data.begin() + row_length - 1}, {3}), Last::no);
        deflate.stored({data.begin() + (empty ? 0 : row_length - 1), data.end()}, Last::yes);
        png.stream = zlib_stream(deflate.bytes(), data);
        const Bytes file = build(png);
        for (const uint32_t kind : all_source_kinds) {
            reset();
            Output output(20 * 6 * 4);
            Decode decode(file, kind, {7, 0, 20, 6});
            for (int call = 0; call < 20; ++call) {
                ASSERT_EQ(decode.iterative(output.data()), 4);
                ASSERT_TRUE(decode.started());
            }
            EXPECT_EQ(output.bytes(), background(output.size()));
            EXPECT_EQ(polling.polls, 0);
            const size_t allocated = host.allocations.size();
            const size_t live = host.live_blocks().size();
            EXPECT_EQ(decode.iterative(output.data()), 4);
            EXPECT_EQ(host.allocations.size(), allocated) << "a restart allocates nothing again";
            EXPECT_EQ(host.live_blocks().size(), live);
            EXPECT_EQ(ZOTARPELMI_AbortPNGIter(&decode.info), 1);
            EXPECT_TRUE(host.live_blocks().empty());
            EXPECT_EQ(decode.info.decoderState, nullptr);
            // The other calls decode it, joined or not.
            decode.source.source.hostPosition = 0;
            EXPECT_EQ(decode.one_shot(output.data()), 1);
            Bytes expected = background(output.size());
            draw(picture, decode.request, expected);
            EXPECT_EQ(difference(expected, output.bytes(), picture, decode.request), "");
        }
    }
}

TEST_F(PngCalls, a_restarted_decode_begins_with_nothing_of_the_first_attempt) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{grey, 8}, Layout{rgb_alpha, 16}})
        for (const int32_t side : {40, 11}) {
            const Picture picture = picture_of(layout, 40, 30);
            Png png = png_of(picture);
            png.filters = {2, 4, 3, 1};
            const Bytes data = scanlines_of(png);
            // The first block ends inside the first row. A second one reaches back into it.
            const size_t first = picture.row_bytes() - 1;
            const ptrdiff_t cut = static_cast<ptrdiff_t>(first);
            Deflate deflate;
            deflate.dynamic(tokens_of({data.begin(), data.begin() + cut}, {1, 3}), Last::no);
            deflate.stored({data.begin() + cut, data.end()}, Last::yes);
            png.stream = zlib_stream(deflate.bytes(), data);
            png.idat_size = 333;
            const Bytes file = build(png);
            for (const uint32_t kind : all_source_kinds)
                for (const Call finish : {Call::one_shot, Call::line}) {
                    const Request request{7, 0, side, side};
                    const size_t size = buffer_size(picture, request);
                    Output output(size);
                    Decode decode(file, kind, request);
                    ASSERT_EQ(decode.iterative(output.data()), 4);
                    ASSERT_EQ(decode.iterative(output.data()), 4);
                    ASSERT_EQ(decode.call(finish, output.data(), 0), 1);
                    Bytes expected = background(size);
                    draw(picture, request, expected);
                    EXPECT_EQ(difference(expected, output.bytes(), picture, request), "")
                        << "kind " << kind << ", " << name_of(finish);
                    EXPECT_FALSE(decode.started());
                }
        }
}

TEST_F(PngCalls, an_iterative_decode_can_be_finished_by_another_call) {
    const Picture picture = picture_of({rgb, 8}, 20, 24);
    const Bytes file = file_of_blocks(picture, Blocks::mixed, 150);
    for (const uint32_t kind : all_source_kinds)
        for (const Call finish : {Call::one_shot, Call::line}) {
            const Request request{7, 0, 21, 24};
            Output output(21 * 24 * 4);
            Decode decode(file, kind, request);
            ASSERT_EQ(decode.iterative(output.data()), 4);
            ASSERT_EQ(decode.line(output.data(), 5), 4);
            ASSERT_EQ(decode.call(finish, output.data(), 0), 1);
            Bytes expected = background(output.size());
            draw(picture, request, expected);
            EXPECT_EQ(difference(expected, output.bytes(), picture, request), "");
        }
}

TEST_F(PngCalls, an_iterative_call_after_a_line_call_ends_with_the_block_that_the_line_call_left) {
    const Picture picture = picture_of({rgb, 8}, 20, 24); // rows of 61 bytes
    const Request request{7, 0, 20, 24};
    for (const uint32_t kind : all_source_kinds) {
        Output output(20 * 24 * 4);
        Decode decode(file_of_blocks(picture, Blocks::stored, 183), kind, request);
        ASSERT_EQ(decode.line(output.data(), 4), 4);
        ASSERT_EQ(decode.iterative(output.data()), 4) << "kind " << kind;
        Bytes expected = background(output.size());
        draw_rows(picture, request, 6, expected);
        EXPECT_EQ(difference(expected, output.bytes(), picture, request), "");
    }
}

TEST_F(PngCalls, line_calls_stop_inside_long_matches) {
    // One literal and matches of 258 bytes at distance 1: rows of 11 bytes, each with filter byte 5, whose first byte
    // becomes 0.
    Picture picture{10, 60, grey, 8, Bytes(600, 5), {}, {}};
    for (size_t y = 0; y < 60; ++y)
        picture.rows[y * 10] = 0;
    Png png = png_of(picture);
    const Bytes data(11 * 60, 5);
    Deflate deflate;
    deflate.fixed({literal(5), match(258, 1), match(258, 1), match(143, 1)}, Last::yes);
    png.stream = zlib_stream(deflate.bytes(), data);
    const Bytes file = build(png);
    for (const uint32_t kind : all_source_kinds)
        for (int32_t rows = 1; rows < 61; ++rows)
            expect_lines(picture, file, kind, {7, 0, 12, 61}, {rows});
}

TEST_F(PngCalls, line_calls_stop_inside_stored_blocks_and_at_their_ends) {
    const Picture picture = picture_of({rgb, 8}, 9, 20); // rows of 28 bytes
    for (const size_t block : {28u, 56u, 27u, 29u, 65535u}) {
        const Bytes file = file_of_blocks(picture, Blocks::stored, block);
        for (const uint32_t kind : all_source_kinds)
            for (const int32_t rows : {1, 2, 3, 19, 20})
                expect_lines(picture, file, kind, {1, 0, 9, 20}, {rows});
    }
}

TEST_F(PngCalls, line_calls_of_changing_row_counts_continue_each_other) {
    const Picture picture = picture_of({rgb_alpha, 8}, 13, 30);
    const Bytes file = file_of_blocks(picture, Blocks::mixed, 200);
    for (const uint32_t kind : all_source_kinds)
        for (const std::vector<int32_t> &rows : {std::vector<int32_t>{1, 2, 3, 4},
                                                 {29, 1},
                                                 {29, 5},
                                                 {5, 25},
                                                 {5, 24, 1},
                                                 {3, 0},
                                                 {3, -1},
                                                 {3, -3},
                                                 {3, 100},
                                                 {7, 2, -100},
                                                 {1, 1, 1, 0}})
            expect_lines(picture, file, kind, {0, 0, 14, 31}, rows);
}

TEST_F(PngCalls, rows_of_zero_and_less_decode_the_whole_image) {
    const Picture picture = picture_of({indexed, 4}, 13, 9);
    for (const int32_t rows : {0, -1, -9, -1000, INT32_MIN, 9, 10, INT32_MAX}) {
        const Outcome outcome = run(file_of(picture), PELM_SOURCE_MEMORY, {1, 0, 13, 9}, 13 * 9 * 3, Call::line, rows);
        EXPECT_EQ(outcome.results, std::vector<int32_t>{1}) << rows;
        EXPECT_EQ(flaws(outcome), "") << rows;
    }
}

TEST_F(PngCalls, without_rows_a_line_call_keeps_the_stop_of_the_one_before) {
    // Scaled grey drops rows without counting them: after each the old stop is met again.
    const Picture picture = picture_of({grey, 8}, 40, 40);
    for (const int32_t rows : {1, 2, 5})
        expect_lines(picture, file_of(picture), PELM_SOURCE_MEMORY, {7, 0, 20, 20}, {rows, 0});
    // Reduced images look only at rows that reach or pass it.
    const Picture reduced = picture_of({rgb, 8}, 40, 40);
    for (const int32_t rows : {1, 2, 5})
        expect_lines(reduced, file_of(reduced), PELM_SOURCE_MEMORY, {7, 0, 20, 20}, {rows, 0});
}

} // namespace
} // namespace pelm::test

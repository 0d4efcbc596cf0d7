// Files that are cut or wrong: what is written of them and what is answered.
#include "tests/png/decode/decoding.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

class PngCorrupt : public PngDecoding {
protected:
    // A stream instead of the picture's own, decoded at its own size.
    Outcome decoded(const Picture &picture, const Bytes &stream, uint32_t kind, Call call = Call::one_shot) {
        Png png = png_of(picture);
        png.stream = stream;
        const Request request = own_size(picture);
        return run(build(png), kind, request, buffer_size(picture, request), call, 3);
    }
};

TEST_F(PngCorrupt, files_cut_anywhere_fail_from_every_source) {
    for (const Layout layout : {Layout{rgb, 8}, Layout{indexed, 4}, Layout{grey_alpha, 16}})
        for (const size_t split : {0u, 40u}) {
            const Picture picture = with_transparency(noise_picture(layout.colour_type, layout.depth, 12, 8));
            Png png = png_of(picture);
            png.idat_size = split;
            png.before_idat = {{"tEXt", {'a', 0, 'b'}}};
            const Bytes file = build(png);
            const Request request = own_size(picture);
            const size_t size = buffer_size(picture, request);
            const size_t step = quick() ? 3 : 1;
            for (size_t length = 0; length < file.size(); length += step)
                for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_SEQUENTIAL})
                    for (const Call call : {Call::one_shot, Call::iterative}) {
                        reset();
                        const Bytes cut(file.begin(), file.begin() + static_cast<ptrdiff_t>(length));
                        const Outcome outcome = run(cut, kind, request, size, call);
                        ASSERT_EQ(flaws(outcome, 0), "") << length << " of " << file.size() << " bytes, kind " << kind;
                        ASSERT_EQ(outcome.output, background(size)) << length;
                    }
        }
}

TEST_F(PngCorrupt, a_stream_shorter_than_its_size_promises_fails) {
    const Picture picture = noise_picture(rgb, 8, 12, 8);
    const Bytes file = file_of(picture);
    for (int32_t missing : {1, 4, 12, 13, 50, 200}) {
        reset();
        Decode decode(file, PELM_SOURCE_STREAM, own_size(picture));
        host.faults.failing_reads_from = 2; // everything lies in the first read; then nothing comes any more
        decode.source.source.size -= missing;
        EXPECT_EQ(decode.one_shot(nullptr), 0);
        EXPECT_TRUE(host.live_blocks().empty());
    }
}

// The image data of a complete file ends early: memory goes on into what follows in the file.
TEST_F(PngCorrupt, image_data_cut_anywhere_is_read_to_the_end_of_the_file_and_no_further) {
    for (const Blocks compressed : {Blocks::stored, Blocks::fixed, Blocks::dynamic}) {
        const Picture picture = noise_picture(rgb, 8, 12, 8);
        Png png = png_of(picture);
        const Bytes stream = stream_of_blocks(scanlines_of(png), compressed, 120, 37);
        const Request request = own_size(picture);
        const size_t size = buffer_size(picture, request);
        const size_t step = quick() ? 3 : 1;
        for (size_t length = 1; length <= stream.size(); length += step)
            for (const size_t split : {0u, 50u}) {
                png.stream = Bytes(stream.begin(), stream.begin() + static_cast<ptrdiff_t>(length));
                png.idat_size = split;
                const Bytes file = build(png);
                Outcome outcomes[2];
                for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM}) {
                    Outcome &outcome = outcomes[kind == PELM_SOURCE_MEMORY ? 0 : 1];
                    outcome = run(file, kind, request, size);
                    ASSERT_TRUE(outcome.result == 0 || outcome.result == 1);
                    ASSERT_EQ(flaws(outcome, outcome.result), "") << length;
                    const Outcome by_lines = run(file, kind, request, size, Call::line, 1);
                    ASSERT_EQ(flaws(by_lines, outcome.result), "") << length;
                    ASSERT_EQ(by_lines.output, outcome.output) << length;
                }
                if (split == 0) {
                    EXPECT_EQ(outcomes[0].result, outcomes[1].result) << length;
                    EXPECT_EQ(outcomes[0].output, outcomes[1].output) << length;
                }
                EXPECT_TRUE(length < stream.size() || outcomes[0].result == 1);
            }
    }
}

TEST_F(PngCorrupt, a_stored_block_longer_than_the_file_writes_its_rows_and_fails) {
    const Picture picture = noise_picture(rgb, 8, 20, 10); // rows longer than what follows the image data
    Png png = png_of(picture);
    const Bytes data = scanlines_of(png);
    for (const size_t rows : {0u, 1u, 4u, 9u}) {
        Deflate deflate;
        deflate.stored({data.begin(), data.begin() + static_cast<ptrdiff_t>(rows * 61 + 20)}, Last::yes, 610,
                       0xFFFF - 610);
        Bytes stream = {0x78, 0x9C};
        stream.insert(stream.end(), deflate.bytes().begin(), deflate.bytes().end());
        for (const uint32_t kind : all_source_kinds)
            for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
                const Outcome outcome = decoded(picture, stream, kind, call);
                EXPECT_EQ(flaws(outcome, 0), "");
                EXPECT_EQ(outcome.output, after_rows(picture, static_cast<uint32_t>(rows))) << rows;
            }
    }
}

TEST_F(PngCorrupt, the_trailer_of_the_image_data_may_be_missing_or_wrong) {
    const Picture picture = noise_picture(rgb, 8, 12, 8);
    const Bytes data = scanlines_of(png_of(picture));
    const Bytes good = stream_of_blocks(data, Blocks::dynamic, 100, 37);
    for (size_t missing = 0; missing <= 4; ++missing) {
        Bytes stream(good.begin(), good.end() - static_cast<ptrdiff_t>(missing));
        stream.back() = static_cast<uint8_t>(missing == 0 ? stream.back() + 1 : stream.back());
        for (const uint32_t kind : all_source_kinds) {
            const Outcome outcome = decoded(picture, stream, kind);
            EXPECT_EQ(flaws(outcome), "") << missing;
            EXPECT_EQ(outcome.output, after_rows(picture, 8)) << missing;
        }
    }
}

TEST_F(PngCorrupt, the_header_of_the_image_data_is_checked_as_documented) {
    const Picture picture = noise_picture(rgb, 8, 12, 8);
    const Bytes data = scanlines_of(png_of(picture));
    Deflate deflate;
    deflate.stored(data, Last::yes);
    for (unsigned cmf = 0; cmf < 256; ++cmf)
        for (const uint8_t flg : {uint8_t{0x00}, uint8_t{0x9C}, uint8_t{0x20}, uint8_t{0xBC}, uint8_t{0xDF}}) {
            const bool good = (cmf & 15) == 8 && cmf >> 4 <= 7 && (flg & 0x20) == 0;
            const Bytes stream = zlib_stream(deflate.bytes(), data, static_cast<uint8_t>(cmf), flg);
            const Outcome outcome = decoded(picture, stream, PELM_SOURCE_MEMORY);
            EXPECT_EQ(flaws(outcome, good ? 1 : 0), "") << cmf << " " << int{flg};
            EXPECT_EQ(outcome.output, after_rows(picture, good ? 8 : 0));
        }
}

// A row per case: a stream with four rows in front, and something wrong behind them.
struct Wrong {
    const char *name;
    int32_t result;
    void (*append)(Deflate &);
};

const Wrong wrongs[] = {
    {"block type 3", 0, [](Deflate &d) { d.block_header(3, Last::yes); }},
    {"stored length that does not match", 0,
     [](Deflate &d) {
         d.stored({1, 2, 3}, Last::yes, 3, 3);
     }},
    {"length symbol 286", 1,
     [](Deflate &d) { d.fixed({match_of_symbols(286, 0, 0, 0)}, Last::yes, EndOfBlock::left_out); }},
    {"length symbol 287", 1,
     [](Deflate &d) { d.fixed({match_of_symbols(287, 0, 0, 0)}, Last::yes, EndOfBlock::left_out); }},
    {"literal code of one symbol, the other branch taken", 1,
     [](Deflate &d) {
         DynamicCodes codes;
         codes.literal_lengths = Bytes(257);
         codes.literal_lengths[256] = 1;
         codes.distance_lengths = {1};
         d.block_header(2, Last::yes);
         d.dynamic_header(codes);
         d.bits.put(1, 1);
     }},
    {"empty literal code", 1,
     [](Deflate &d) {
         DynamicCodes codes;
         codes.literal_lengths = Bytes(257);
         codes.distance_lengths = {1};
         d.block_header(2, Last::yes);
         d.dynamic_header(codes);
     }},
    {"distance code without the distance", 1,
     [](Deflate &d) {
         DynamicCodes codes;
         codes.literal_lengths = Bytes(258);
         codes.literal_lengths[256] = codes.literal_lengths[257] = 1;
         codes.distance_lengths = {1};
         d.block_header(2, Last::yes);
         d.dynamic_header(codes);
         d.bits.put(1, 1); // length symbol 257
         d.bits.put(1, 1); // no such distance
     }},
    {"code lengths that begin with a repetition", 0,
     [](Deflate &d) {
         DynamicCodes codes;
         codes.literal_lengths = Bytes(257);
         codes.distance_lengths = {1};
         codes.code_length_lengths = Bytes(19, 5);
         codes.sequence = std::vector<LengthSymbol>{{16, 0}};
         d.block_header(2, Last::yes);
         d.dynamic_header(codes);
     }},
    {"code lengths that run past their number", 0,
     [](Deflate &d) {
         DynamicCodes codes;
         codes.literal_lengths = Bytes(257);
         codes.distance_lengths = {1};
         codes.code_length_lengths = Bytes(19, 5);
         codes.sequence = std::vector<LengthSymbol>{{18, 127}, {18, 127}};
         d.block_header(2, Last::yes);
         d.dynamic_header(codes);
     }},
};

TEST_F(PngCorrupt, corrupt_data_keeps_the_rows_before_it_and_succeeds_or_fails_as_documented) {
    const Picture picture = noise_picture(rgb, 8, 12, 8); // rows of 37 bytes
    const Bytes data = scanlines_of(png_of(picture));
    for (const Wrong &wrong : wrongs)
        for (const Blocks before : {Blocks::stored, Blocks::dynamic})
            for (const uint32_t kind : all_source_kinds)
                for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
                    reset();
                    const Bytes good(data.begin(), data.begin() + 37 * 4 + 5);
                    Deflate deflate;
                    if (before == Blocks::stored)
                        deflate.stored(good, Last::no);
                    else
                        deflate.dynamic(tokens_of(good, {3}), Last::no);
                    wrong.append(deflate);
                    Deflate padded = deflate; // so that what is wrong is met before the data ends
                    padded.bits.align();
                    padded.bits.put_bytes(Bytes(40));
                    const Outcome outcome = decoded(picture, zlib_stream(padded.bytes(), data), kind, call);
                    EXPECT_EQ(flaws(outcome, wrong.result), "") << wrong.name << ", " << name_of(call);
                    EXPECT_EQ(difference(after_rows(picture, 4), outcome.output, picture, own_size(picture)), "")
                        << wrong.name << ", " << name_of(call);
                }
}

TEST_F(PngCorrupt, empty_stored_blocks_change_nothing) {
    const Picture picture = noise_picture(rgb, 8, 12, 8);
    const Bytes data = scanlines_of(png_of(picture));
    Deflate deflate;
    deflate.stored({}, Last::no);
    deflate.stored({data.begin(), data.begin() + 50}, Last::no);
    deflate.stored({}, Last::no);
    deflate.fixed(tokens_of({data.begin() + 50, data.end()}, {3}), Last::no);
    deflate.stored({}, Last::yes);
    for (const uint32_t kind : all_source_kinds)
        for (const Call call : {Call::one_shot, Call::line}) {
            const Outcome outcome = decoded(picture, zlib_stream(deflate.bytes(), data), kind, call);
            EXPECT_EQ(flaws(outcome), "");
            EXPECT_EQ(outcome.output, after_rows(picture, 8));
        }
}

TEST_F(PngCorrupt, a_distance_before_the_beginning_repeats_the_first_byte) {
    // Filter byte 0 and 0x42, then 4 bytes at distance 5: the first byte three times, then the byte at 0 again.
    const Picture picture{7, 1, grey, 8, {0x42, 0, 0, 0, 0, 0x42, 9}, {}, {}};
    Deflate deflate;
    deflate.fixed({literal(0), literal(0x42), match(4, 5), literal(0x42), literal(9)}, Last::yes);
    for (const uint32_t kind : all_source_kinds) {
        const Outcome outcome = decoded(picture, zlib_stream(deflate.bytes(), {}), kind);
        EXPECT_EQ(flaws(outcome), "");
        EXPECT_EQ(outcome.output, after_rows(picture, 1));
    }
}

TEST_F(PngCorrupt, a_single_flipped_bit_in_any_chunk_fails) {
    const Picture picture = with_transparency(noise_picture(indexed, 4, 9, 7));
    Png png = png_of(picture);
    png.before_idat = {{"tEXt", {'a', 0, 'b'}}};
    png.idat_size = 30;
    const Bytes file = build(png);
    const Request request = own_size(picture);
    const size_t size = buffer_size(picture, request);
    for (size_t at = 0; at < file.size(); at += quick() ? 5 : 1)
        for (int bit = 0; bit < 8; ++bit) {
            Bytes bad = file;
            bad[at] = static_cast<uint8_t>(bad[at] ^ 1 << bit);
            for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM}) {
                const Outcome outcome = run(bad, kind, request, size);
                ASSERT_EQ(flaws(outcome, 0), "") << "byte " << at << ", bit " << bit << ", kind " << kind;
                ASSERT_EQ(outcome.output, background(size));
            }
        }
}

TEST_F(PngCorrupt, a_stream_that_ends_within_its_header_fails) {
    const Picture picture = noise_picture(rgb, 8, 12, 8);
    for (const uint32_t kind : all_source_kinds)
        for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
            reset();
            const Outcome outcome = decoded(picture, {0x78}, kind, call);
            EXPECT_EQ(flaws(outcome, 0), "") << "kind " << kind;
            EXPECT_EQ(outcome.output, background(outcome.output.size()));
        }
}

} // namespace
} // namespace pelm::test

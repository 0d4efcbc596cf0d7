// Every reason why a PNG is not decoded, or not whole, each told in one line that names the file.
#include "tests/tool/run_tool.h"

#include <csignal>

#include "tests/tool/image_files.h"
#include "tests/tool/png_file.h"

namespace pelm::test {
namespace {

using Parts = std::vector<PngPart>;

const PngPart plain_data = data_part(noise_rows(12, 4));

class ToolPngRefusals : public ToolTest {
protected:
    void expect_refused(const Bytes &bytes, const std::string &reason) const {
        const std::string name = write("refused.png", bytes);
        for (const char *const source : {"memory", "file", "pipe"}) {
            SCOPED_TRACE(std::string(source) + ": " + reason);
            expect_failure({name, "--source", source, "-o", path("x.png")}, name, reason);
        }
        const ToolRun info = run({"--info", name});
        EXPECT_EQ(info.status, 1);
        EXPECT_TRUE(info.out.ends_with("; refused: " + reason + "\n")) << info.out;
    }
    void expect_refused(const Parts &parts, const std::string &reason) const {
        expect_refused(png_bytes(parts), reason);
    }

    // Refused although everything outside of the image data is right, or decoded in part.
    void expect_found_while_decoding(const Bytes &zlib_stream, int status, const std::string &message) const {
        const std::string name = write("x.png", png_bytes({header_part({16, 5}), {"IDAT", zlib_stream}, end_part()}));
        for (const char *const source : {"memory", "file", "pipe"}) {
            for (const char *const mode : {"oneshot", "iter", "line=2"}) {
                const ToolRun got =
                    run({name, "--source", source, "--mode", mode, "--background", "102030", "-o", path("y.png")});
                EXPECT_EQ(got.status, status) << source << ", " << mode;
                EXPECT_EQ(got.err, "pelm-decode: " + name + ": " + message + "\n") << source << ", " << mode;
            }
        }
    }
};

Bytes joined(Bytes bytes, const Bytes &more) {
    bytes.insert(bytes.end(), more.begin(), more.end());
    return bytes;
}

Bytes cut(Bytes bytes, size_t size) {
    bytes.resize(size);
    return bytes;
}

const Bytes zlib_start = {0x78, 0x01};
const Bytes three_rows = joined(zlib_start, stored_block(noise_rows(48, 3)));

TEST_F(ToolPngRefusals, signatures) {
    const Bytes sound = png_bytes({header_part({}), plain_data, end_part()});
    for (const size_t at : {0u, 1u, 4u, 7u}) {
        Bytes damaged = sound;
        damaged[at] ^= 0x20;
        expect_refused(damaged, "the PNG signature is damaged");
    }
    expect_refused(cut(sound, 6), "the file ends inside the PNG signature");
}

TEST_F(ToolPngRefusals, headers) {
    const struct {
        PngHeader header;
        const char *reason;
    } cases[] = {{{0, 4}, "a width of 0 pixels"},
                 {{4, 0}, "a height of 0 pixels"},
                 {{4, 4, 8, 2, 1}, "compression method 1 does not exist"},
                 {{4, 4, 8, 2, 0, 1}, "filter method 1 does not exist"},
                 {{4, 4, 8, 2, 0, 0, 2}, "interlace method 2 does not exist"},
                 {{4, 4, 8, 5}, "colour type 5 does not exist"},
                 {{4, 4, 8, 7}, "colour type 7 does not exist"},
                 {{4, 4, 4, 2}, "RGB of 4 bits per sample does not exist"},
                 {{4, 4, 3, 0}, "grey of 3 bits per sample does not exist"},
                 {{4, 4, 16, 3}, "palette of 16 bits per pixel does not exist"},
                 {{1u << 30, 4, 1, 0}, "1073741824x4 pixels are too many"},
                 {{1u << 28, 4, 16, 6}, "268435456x4 pixels are too many"}};
    for (const auto &one : cases)
        expect_refused({header_part(one.header), plain_data, end_part()}, one.reason);
    PngPart longer = header_part({});
    longer.data.push_back(0);
    expect_refused({longer, plain_data, end_part()}, "an IHDR chunk of 14 bytes instead of 13");
    expect_refused({plain_data, end_part()}, "there is no IHDR chunk");
}

TEST_F(ToolPngRefusals, palettes_and_transparency) {
    const PngPart palette_header = header_part({4, 4, 8, 3}), palette = {"PLTE", Bytes(12)};
    const PngPart data = data_part(noise_rows(4, 4));
    const struct {
        Parts parts;
        const char *reason;
    } cases[] = {
        {{palette, palette_header, data, end_part()}, "the PLTE chunk at byte 8 stands before the IHDR chunk"},
        {{palette_header, {"PLTE", Bytes(13)}, data, end_part()}, "a PLTE chunk of 13 bytes"},
        {{palette_header, {"PLTE", Bytes(771)}, data, end_part()}, "a PLTE chunk of 771 bytes"},
        {{palette_header, {"tRNS", Bytes(2)}, palette, data, end_part()},
         "the tRNS chunk at byte 33 stands before the PLTE chunk"},
        {{{"tRNS", Bytes(2)}, palette_header, palette, data, end_part()},
         "the tRNS chunk at byte 8 stands before the IHDR chunk"},
        {{header_part({}), {"tRNS", Bytes(2)}, plain_data, end_part()}, "a tRNS chunk of 2 bytes instead of 6"},
        {{header_part({4, 4, 8, 0}), {"tRNS", Bytes(6)}, data, end_part()}, "a tRNS chunk of 6 bytes instead of 2"},
        {{header_part({4, 4, 8, 6}), {"tRNS", Bytes(6)}, plain_data, end_part()},
         "a tRNS chunk in an image with an alpha channel"},
    };
    for (const auto &one : cases)
        expect_refused(one.parts, one.reason);
}

TEST_F(ToolPngRefusals, checksums) {
    const Parts parts = {header_part({}), {"tEXt", Bytes(100)}, plain_data, end_part()};
    for (size_t i = 0; i < parts.size(); ++i) {
        Bytes damaged = png_bytes(parts);
        const size_t position = position_of(parts, i);
        damaged[position + 8 + parts[i].data.size()] ^= 1;
        expect_refused(damaged,
                       "wrong checksum of the " + parts[i].type + " chunk at byte " + std::to_string(position));
    }
}

TEST_F(ToolPngRefusals, files_that_end_early) {
    const Parts parts = {header_part({}), plain_data, end_part()};
    const Bytes sound = png_bytes(parts);
    const size_t data_at = position_of(parts, 1), end_at = position_of(parts, 2);
    for (const size_t size : {end_at, end_at + 3, end_at + 7})
        expect_refused(cut(sound, size), "the file ends before its end chunk");
    expect_refused(cut(sound, end_at + 9), "the file ends inside the IEND chunk at byte " + std::to_string(end_at));
    expect_refused(cut(sound, end_at - 2), "the file ends inside the IDAT chunk at byte " + std::to_string(data_at));
    Bytes too_long = sound;
    too_long[data_at] = 1;
    expect_refused(too_long, "the chunk at byte " + std::to_string(data_at) + " claims " +
                                 std::to_string((1u << 24) + plain_data.data.size()) +
                                 " bytes, more than the file has");
}

TEST_F(ToolPngRefusals, image_data_that_is_missing_or_of_another_kind) {
    expect_refused({header_part({}), end_part()}, "there is no image data");
    expect_refused({header_part({}), plain_data, {"IEND", {1}}}, "an IEND chunk with data");
    const struct {
        Bytes start;
        const char *reason;
    } cases[] = {{{0x79, 0x01}, "image data compressed by method 9 is not supported"},
                 {{0x88, 0x01}, "image data with a window above 32 KB is not supported"},
                 {{0x78, 0x21}, "image data with a preset dictionary is not supported"}};
    for (const auto &one : cases) {
        PngPart data = plain_data;
        std::copy(one.start.begin(), one.start.end(), data.data.begin());
        expect_refused({header_part({}), data, end_part()}, one.reason);
    }
}

TEST_F(ToolPngRefusals, image_data_that_is_damaged_or_cut_short) {
    const std::string message = "the image data is damaged or cut short after 3 of 5 rows";
    const Bytes block_of_type_3 = {7};
    expect_found_while_decoding(joined(three_rows, block_of_type_3), 1, message);
    // Says that more bytes are stored than there are.
    Bytes cut_short = joined(three_rows, stored_block(noise_rows(48, 2)));
    expect_found_while_decoding(cut(cut_short, cut_short.size() - 80), 1, message);
}

// The decoder takes both for a success.
TEST_F(ToolPngRefusals, missing_rows_give_a_warning_and_status_2) {
    const std::string message = "warning: the image data breaks off after 3 of 5 rows";
    const Bytes symbol_286 = {0x1B, 0x03}; // last block, fixed codes: 1, 01, 11000110
    expect_found_while_decoding(joined(three_rows, symbol_286), 2, message);
    const Image got = read_png(path("y.png"));
    ASSERT_EQ(got.pixels.size(), 80u);
    EXPECT_NE(got.at(0, 2), 0x102030FFu);
    EXPECT_EQ(got.at(0, 3), 0x102030FFu);
    expect_found_while_decoding(zlib_bytes(noise_rows(48, 3)), 2, message);
}

TEST_F(ToolPngRefusals, rows_too_many_are_no_mistake) {
    const std::string name = write("x.png", png_bytes({header_part({}), data_part(noise_rows(12, 9)), end_part()}));
    EXPECT_EQ(run({name, "-o", path("y.png")}).err, "");
}

TEST_F(ToolPngRefusals, chunks_across_the_read_buffer_of_streams) {
    constexpr size_t buffer = 16384;
    const PngPart filling = {"tEXt", Bytes(buffer - 2 - 33 - 12, 'x')};
    const std::string name = write("x.png", png_bytes({header_part({}), filling, plain_data, end_part()}));
    EXPECT_EQ(run({name, "-o", path("y.png")}).err, "");
    for (const char *const source : {"file", "pipe"}) {
        expect_failure({name, "--source", source, "-o", path("y.png")}, name,
                       "the decoder cannot read it from a file or pipe (a chunk begins across its buffer); use "
                       "--source memory");
    }
}

TEST_F(ToolPngRefusals, what_a_user_may_not_expect_is_told) {
    const Bytes stream = plain_data.data;
    const ptrdiff_t half = static_cast<ptrdiff_t>(stream.size() / 2);
    const Bytes first(stream.begin(), stream.begin() + half), second(stream.begin() + half, stream.end());
    const Parts parts = {header_part({}), {"IDAT", first}, {"tEXt", Bytes(9)}, {"IDAT", second}, end_part()};
    const std::string split = write("split.png", png_bytes(parts));
    EXPECT_EQ(run({"--info", split, "--source", "file"}).out,
              split + ": 4x4, RGB, 8 bits per sample, PNG, not interlaced, 2 IDAT chunks; decoded; note: chunks "
                      "between the IDAT chunks are taken for image data; use --source memory\n");
    EXPECT_EQ(run({split, "-o", path("y.png")}).err, "");
    const std::string ended = write("ended.png", png_bytes({header_part({}), plain_data, {"tEXt", {}}}));
    EXPECT_EQ(run({ended, "-o", path("y.png")}).err,
              "pelm-decode: " + ended + ": warning: the file is taken to end at an empty tEXt chunk\n");
    const std::string black =
        write("black.png", png_bytes({header_part({4, 4, 8, 3}), data_part(noise_rows(4, 4)), end_part()}));
    EXPECT_EQ(run({black, "-o", path("y.png")}).err,
              "pelm-decode: " + black + ": warning: there is no palette: every pixel is black\n");
}

TEST_F(ToolPngRefusals, info_tells_what_there_is) {
    const std::string name = sample("sunset-palette.png").string();
    EXPECT_EQ(run({"--info", name}).out,
              name + ": 320x240, palette, 8 bits per pixel, PNG, not interlaced, 256 colours, alpha for 256 colours, "
                     "1 IDAT chunk; decoded\n");
}

TEST_F(ToolPngRefusals, memory_that_does_not_suffice) {
    const std::string name = sample("sunset.png").string();
    for (const char *const limit : {"100", "40k", "100k"}) {
        expect_failure({name, "--max-memory", limit, "-o", path("x.png")}, name,
                       "the decoder needs more memory than --max-memory allows");
    }
    EXPECT_EQ(run({name, "--max-memory", "300k", "-o", path("x.png")}).status, 0);
}

// Takes a good part of a second to decode.
Bytes large_png() {
    constexpr uint32_t side = 32000;
    return png_bytes({header_part({side, side, 1, 0}), data_part(Bytes(side / 8 * side + side)), end_part()});
}

TEST_F(ToolPngRefusals, a_deadline_ends_the_decode) {
    const std::string name = write("large.png", large_png());
    for (const char *const mode : {"oneshot", "iter", "line=100"}) {
        expect_failure({name, "--box", "9x9", "--mode", mode, "--deadline", "1", "-o", path("x.png")}, name,
                       "not done before the deadline");
    }
}

TEST_F(ToolPngRefusals, an_interrupt_ends_the_decode_and_leaves_nothing_behind) {
    const std::string name = write("large.png", large_png());
    std::string inputs;
    for (int i = 0; i < 300; ++i)
        inputs += "'" + name + "' ";
    const ToolRun got =
        shell("set -m; $TOOL " + inputs + "--box 9x9 -o '" + path("%n.png") + "' & sleep 0.3; kill -INT $!; wait $!");
    EXPECT_EQ(got.status, 128 + SIGINT);
    EXPECT_NE(got.err.find("pelm-decode: " + name + ": interrupted\n"), std::string::npos) << got.err;
    for (const std::string &file : files())
        EXPECT_TRUE(file.ends_with(".png")) << file;
}

} // namespace
} // namespace pelm::test

// BMPs by bands, by lines and in two steps: the same picture as in one call, from every source and at every place.
#include "tests/support/quick.h"
#include "tests/support/run_length_codes.h"
#include "tests/tool/run_tool.h"
#include "tests/tool/stored_pixels.h"

namespace pelm::test {
namespace {

using Words = std::vector<std::string>;

const Words all_modes =
    quick() ? Words{"iter", "line=7", "skia"} : Words{"iter", "line=1", "line=7", "line=100000", "skia"};

bool is_by_lines(const std::string &mode) {
    return mode.starts_with("line");
}

class ToolBmpModes : public ToolTest {
protected:
    // A picture without any message.
    Image decoded(const Words &arguments, const std::string &standard_input = "/dev/null") const {
        return decoded_with(arguments, standard_input, 0, "");
    }

    Image decoded_with(Words arguments, const std::string &standard_input, int status, const std::string &err) const {
        arguments.insert(arguments.end(), {"-o", path("decoded.png")});
        const ToolRun got = run(arguments, standard_input);
        EXPECT_EQ(got.status, status) << testing::PrintToString(arguments);
        EXPECT_EQ(got.err, err) << testing::PrintToString(arguments);
        return read_png(path("decoded.png"));
    }

    void expect_as_at_once(const std::string &file, const Words &options, const std::string &mode) const {
        Words at_once = {file};
        at_once.insert(at_once.end(), options.begin(), options.end());
        Words in_mode = at_once;
        in_mode.insert(in_mode.end(), {"--mode", mode});
        EXPECT_EQ(difference(decoded(at_once), decoded(in_mode)), "")
            << file << ", " << mode << ", " << testing::PrintToString(options);
    }
};

TEST_F(ToolBmpModes, give_the_stored_pixels_from_every_source) {
    for (const auto &file : bmp_samples()) {
        const Image expected = stored_image(read_file(file));
        for (const std::string &mode : all_modes) {
            for (const char *const source : {"memory", "file", "pipe"}) {
                EXPECT_EQ(difference(expected, decoded({file.string(), "--source", source, "--mode", mode})), "")
                    << file << ", " << source << ", " << mode;
            }
            EXPECT_EQ(difference(expected, decoded({"-", "--mode", mode}, file.string())), "") << file << ", " << mode;
            EXPECT_EQ(difference(expected, decoded({"-", "--source", "pipe", "--mode", mode}, file.string())), "")
                << file << ", " << mode;
        }
    }
}

TEST_F(ToolBmpModes, come_through_real_pipes) {
    const std::string file = sample("sunset-topdown.bmp").string();
    const Image expected = stored_image(read_file(file));
    for (const std::string mode : {"oneshot", "iter", "line=9", "skia"}) {
        const ToolRun got = shell("cat '" + file + "' | $TOOL - --mode " + mode + " -o '" + path("x.png") + "'");
        EXPECT_EQ(got.err, "") << mode;
        EXPECT_EQ(difference(expected, read_png(path("x.png"))), "") << mode;
    }
}

TEST_F(ToolBmpModes, place_the_picture_as_one_call_does) {
    const Words placements[] = {
        {"--box", "323x251", "--background", "102030"},
        {"--box", "101x200", "--background", "102030"},
        {"--box", "500x60", "--format", "rgb"},
        {"--box", "91x333", "--place", "stretch"},
        {"--box", "401x301", "--place", "stretch", "--format", "argb"},
        {"--box", "101x200", "--place", "exact"},
        {"--box", "200x77", "--place", "exact", "--format", "rgb565"},
        {"--place", "exact"},
    };
    for (const char *const name : {"sunset.bmp", "sunset-topdown.bmp", "sunset-4.bmp", "sunset-1.bmp"}) {
        for (const Words &placement : placements) {
            for (const std::string &mode : all_modes)
                expect_as_at_once(sample(name).string(), placement, mode);
        }
    }
}

TEST_F(ToolBmpModes, turn_the_picture_as_one_call_does_but_for_lines) {
    for (const char *const name : {"sunset.bmp", "sunset-topdown.bmp", "sunset-8.bmp"}) {
        const std::string file = sample(name).string();
        for (const char *const turn : {"90", "180", "270"}) {
            for (const std::string &mode : all_modes) {
                if (is_by_lines(mode)) {
                    expect_failure({file, "--rotate", turn, "--mode", mode, "-o", path("x.png")}, file,
                                   "by lines the decoder does not turn a BMP; use --mode oneshot or iter");
                    continue;
                }
                expect_as_at_once(file, {"--rotate", turn}, mode);
                expect_as_at_once(file, {"--rotate", turn, "--box", "111x77"}, mode);
            }
        }
    }
}

TEST_F(ToolBmpModes, look_the_same_in_every_format) {
    for (const std::string &mode : all_modes) {
        for (const char *const format : {"rgb565", "rgb", "argb", "rgb565a", "rgba", "bgra"}) {
            expect_as_at_once(sample("sunset-565.bmp").string(), {"--format", format}, mode);
            expect_as_at_once(sample("sunset-565.bmp").string(), {"--format", format, "--box", "50x50"}, mode);
        }
    }
}

TEST_F(ToolBmpModes, leave_nothing_of_an_image_that_has_no_room) {
    const std::string file = write("flat.bmp", flat_bmp(variant_named("twenty_four_bits"), 100, 1, 0x204060));
    for (const std::string &mode : all_modes) {
        for (const char *const place : {"fit", "exact"}) {
            expect_failure({file, "--box", "10x10", "--place", place, "--mode", mode, "-o", path("x.png")}, file,
                           "nothing is left of the image in a box of 10x10 pixels");
        }
    }
}

TEST_F(ToolBmpModes, divide_the_size_in_two_steps) {
    const struct {
        const char *divisor;
        const char *box;
    } cases[] = {{"1", "320x240"}, {"3", "106x80"}, {"7", "45x34"}, {"64", "5x3"}};
    for (const char *const name : {"sunset.bmp", "sunset-topdown.bmp"}) {
        const std::string file = sample(name).string();
        for (const auto &one : cases) {
            const std::string mode = std::string("skia=") + one.divisor;
            EXPECT_EQ(difference(decoded({file, "--box", one.box}), decoded({file, "--mode", mode})), "") << mode;
            EXPECT_EQ(difference(decoded({file, "--box", one.box, "--place", "exact"}),
                                 decoded({file, "--mode", mode, "--place", "exact"})),
                      "")
                << mode;
            expect_as_at_once(file, {"--box", "99x99"}, mode);
        }
        EXPECT_EQ(difference(decoded({file, "--box", "80x106", "--rotate", "90"}),
                             decoded({file, "--mode", "skia=3", "--rotate", "90"})),
                  "");
        EXPECT_EQ(decoded({file, "--mode", "skia=320", "--place", "stretch"}).pixels.size(), 1u);
    }
    const ToolRun info = run({"--info", "--mode", "skia=7", sample("sunset.bmp").string()});
    EXPECT_EQ(info.status, 0);
    EXPECT_TRUE(info.out.ends_with("uncompressed; decoded\n  divided by 7: 45x34\n")) << info.out;
}

TEST_F(ToolBmpModes, in_two_steps_decode_run_length_codes) {
    Noise noise(1);
    for (const int bits : {4, 8}) {
        const Picture rows = noise_picture(37, 23, static_cast<uint16_t>(bits), 5);
        const Bytes codes = run_length_codes(rows, bits, noise, {});
        for (const int32_t height : {23, -23}) {
            const BmpFile file = run_length_bmp(bits, 37, height, codes, noise_palette(1u << bits, 2));
            const std::string name = write("codes.bmp", file);
            const Image expected = stored_image(file_bytes(plain_twin(file, codes).file));
            for (const char *const source : {"memory", "file", "pipe"}) {
                EXPECT_EQ(difference(expected, decoded({name, "--source", source, "--mode", "skia"})), "")
                    << bits << ", " << source;
            }
            EXPECT_EQ(difference(expected, decoded({"-", "--mode", "skia"}, name)), "") << bits;
            const std::string reason =
                std::string(bits == 8 ? "RLE8" : "RLE4") + " compression is not supported; use --mode skia";
            for (const char *const mode : {"oneshot", "iter", "line=2"})
                expect_failure({name, "--mode", mode, "-o", path("x.png")}, name, reason);
        }
    }
}

TEST_F(ToolBmpModes, tell_of_run_length_codes_that_end_early_or_move) {
    Noise noise(1);
    const Picture rows = noise_picture(37, 20, 8, 5);
    const Bytes whole = run_length_codes(rows, 8, noise, {});
    const Bytes cut(whole.begin(), whole.begin() + static_cast<ptrdiff_t>(whole.size() / 2));
    const BmpFile file = run_length_bmp(8, 37, 20, cut, noise_palette(256, 2));
    const std::string name = write("codes.bmp", file);
    const size_t rows_there = expanded_rows(cut, 8, 37, 20).size();
    ASSERT_GT(rows_there, 0u);
    ASSERT_LT(rows_there, 20u);
    const std::string shortage = "the run-length codes end after " + std::to_string(rows_there) + " of 20 rows";
    Image expected = stored_image(file_bytes(plain_twin(file, cut).file));
    std::fill_n(expected.pixels.begin(), (20 - rows_there) * 37, 0x102030FFu);
    for (const char *const source : {"memory", "file", "pipe"}) {
        const Image got = decoded_with({name, "--source", source, "--mode", "skia", "--background", "102030"},
                                       "/dev/null", 2, "pelm-decode: " + name + ": warning: " + shortage + "\n");
        EXPECT_EQ(difference(expected, got), "") << source;
    }
    const ToolRun info = run({"--info", "--mode", "skia", name});
    EXPECT_EQ(info.status, 2);
    EXPECT_TRUE(info.out.ends_with("RLE8 compression; decoded; truncated: " + shortage + "\n")) << info.out;

    const Bytes moving = {0, 2, 5, 5, 4, 1, 0, 0, 4, 2, 0, 1};
    const std::string moves = write("moves.bmp", run_length_bmp(8, 4, 2, moving, noise_palette(256, 2)));
    decoded_with({moves, "--mode", "skia"}, "/dev/null", 0,
                 "pelm-decode: " + moves +
                     ": warning: the decoder does not make the moves in the run-length codes: pixels are misplaced\n");
}

TEST_F(ToolBmpModes, take_truncated_files_but_for_two_steps) {
    Bytes bytes = read_file(sample("sunset.bmp"));
    bytes.resize(54 + 100 * 960 + 7);
    const std::string file = write("truncated.bmp", bytes);
    const std::string warning = "pelm-decode: " + file + ": warning: the file ends after 100 of 240 rows\n";
    Image expected = stored_image(read_file(sample("sunset.bmp")));
    std::fill_n(expected.pixels.begin(), 140 * 320, 0x102030FFu);
    for (const char *const source : {"memory", "file", "pipe"}) {
        for (const std::string &mode : all_modes) {
            const Words words = {file, "--source", source, "--mode", mode, "--background", "102030"};
            if (mode != "skia") {
                EXPECT_EQ(difference(expected, decoded_with(words, "/dev/null", 2, warning)), "") << mode << source;
                std::filesystem::remove(path("decoded.png"));
                continue;
            }
            expect_failure({file, "--source", source, "--mode", mode, "-o", path("x.png")}, file,
                           "the file ends after 100 of 240 rows, and --mode skia takes only whole files");
        }
    }
}

TEST_F(ToolBmpModes, fail_in_one_line_when_memory_does_not_suffice) {
    const std::string file = sample("sunset.bmp").string();
    for (const std::string &mode : all_modes) {
        for (const char *const limit : {"1", "200", "1k", "3000"}) {
            expect_failure({file, "--mode", mode, "--max-memory", limit, "-o", path("x.png")}, file,
                           "the decoder needs more memory than --max-memory allows");
        }
        EXPECT_EQ(
            run({file, "--mode", mode, "--max-memory", "100k", "--quiet", "-o", "/dev/null", "--output-type", "raw"})
                .status,
            0);
    }
}

TEST_F(ToolBmpModes, in_two_steps_are_for_bmps_only) {
    for (const auto &[name, format] :
         {std::pair("sunset.png", "PNG"), std::pair("sunset.gif", "GIF"), std::pair("sunset.wbmp", "WBMP")}) {
        const std::string file = sample(name).string();
        const std::string reason = std::string("the ") + format + " decoder has no --mode skia";
        for (const char *const mode : {"skia", "skia=2"})
            expect_failure({file, "--mode", mode, "-o", path("x.png")}, file, reason);
        const ToolRun info = run({"--info", "--mode", "skia", file});
        EXPECT_EQ(info.status, 1);
        EXPECT_NE(info.out.find("; refused: " + reason + "\n"), std::string::npos) << info.out;
    }
    const std::string gif = sample("sunset.gif").string();
    expect_failure({gif, "--mode", "skia", "--frame", "1", "-o", path("x.png")}, gif,
                   "the GIF decoder has no --mode skia");
}

} // namespace
} // namespace pelm::test

// What --info tells of GIFs, every reason why one is not decoded, and what a user is warned of.
#include "tests/support/small_gif.h"
#include "tests/tool/image_files.h"
#include "tests/tool/run_tool.h"

namespace pelm::test {
namespace {

Bytes operator+(Bytes bytes, const Bytes &more) {
    bytes.insert(bytes.end(), more.begin(), more.end());
    return bytes;
}

Bytes cut(Bytes bytes, size_t size) {
    bytes.resize(size);
    return bytes;
}

SmallGif with_frame(const SmallFrame &frame) {
    SmallGif gif;
    gif.frames = {frame};
    return gif;
}

class ToolGifRefusals : public ToolTest {
protected:
    void expect_refused(const Bytes &bytes, const std::string &reason) const {
        const std::string name = write("refused.gif", bytes);
        for (const char *const source : {"memory", "file", "pipe"}) {
            SCOPED_TRACE(source + (": " + reason));
            expect_failure({name, "--source", source, "-o", path("x.png")}, name, reason);
            expect_failure({name, "--source", source, "--frame", "1", "-o", path("x.png")}, name, reason);
            expect_failure({name, "--source", source, "--all-frames", "-o", path("%n.png")}, name, reason);
            expect_failure({name, "--source", source, "--animate", path("x.html")}, name, reason);
        }
        const ToolRun info = run({"--info", name});
        EXPECT_EQ(info.status, 1);
        EXPECT_NE(info.out.find("; refused: " + reason + "\n"), std::string::npos) << info.out;
    }
    void expect_warning(const SmallGif &gif, const std::vector<std::string> &options,
                        const std::string &warning) const {
        const std::string name = write("x.gif", gif_bytes(gif));
        std::vector<std::string> arguments = {name, "-o", path("x.png")};
        arguments.insert(arguments.end(), options.begin(), options.end());
        const ToolRun got = run(arguments);
        EXPECT_EQ(got.status, 0);
        EXPECT_EQ(got.err, warning.empty() ? "" : "pelm-decode: " + name + ": warning: " + warning + "\n");
    }
};

TEST_F(ToolGifRefusals, headers) {
    const Bytes sound = gif_bytes(SmallGif{});
    for (const size_t at : {3u, 4u, 5u}) {
        Bytes damaged = sound;
        damaged[at] = '#';
        expect_refused(damaged, "the GIF signature is damaged");
    }
    for (const size_t size : {6u, 12u, 24u})
        expect_refused(cut(sound, size), "the file ends inside its header");
    SmallGif empty;
    empty.height = 0;
    expect_refused(gif_bytes(empty), "a screen of 4x0 pixels");
}

TEST_F(ToolGifRefusals, files_without_an_image) {
    const Bytes start = gif_header(SmallGif{});
    expect_refused(start + Bytes{';'}, "there is no image");
    expect_refused(start, "the file ends before its first image");
    expect_refused(cut(gif_bytes(SmallGif{}), 30), "the file ends before its first image");
    expect_refused(start + Bytes{'!', 0xF9, 5, 0, 0, 0, 0, 0, 0}, "a block before the first image is damaged");
}

TEST_F(ToolGifRefusals, what_cannot_be_done_by_lines) {
    SmallFrame frame;
    frame.interlaced = true;
    const std::string name = write("x.gif", gif_bytes(with_frame(frame)));
    const std::vector<std::string> by_lines = {name, "--mode", "line=2", "-o", path("x.png")};
    expect_failure(by_lines, name, "an interlaced image cannot be decoded by lines");
    write("x.gif", gif_bytes(SmallGif{}));
    expect_failure({name, "--mode", "line=2", "--rotate", "90", "-o", path("x.png")}, name,
                   "by lines the decoder does not turn a GIF; use --mode oneshot or iter");
    expect_failure({name, "--mode", "line=2", "--frame", "1", "-o", path("x.png")}, name,
                   "frames cannot be decoded by lines");
    frame.interlaced = false;
    frame.top = 1;
    write("x.gif", gif_bytes(with_frame(frame)));
    expect_failure({name, "--mode", "line=2", "--box", "2x2", "-o", path("x.png")}, name,
                   "by lines an image that begins below the top of its screen cannot be reduced");
}

TEST_F(ToolGifRefusals, formats_that_gif_does_not_have) {
    const std::string name = sample("lighthouse.gif").string();
    const std::string reason = "the GIF decoder does not write the format rgb565a";
    expect_failure({name, "--format", "rgb565a", "-o", path("x.png")}, name, reason);
    expect_failure({name, "--format", "rgb565a", "--frame", "2", "-o", path("x.png")}, name, reason);
}

TEST_F(ToolGifRefusals, frames_that_there_are_not) {
    const std::string animation = sample("lighthouse.gif").string(), png = sample("sunset.png").string();
    expect_failure({animation, "--frame", "9", "-o", path("x.png")}, animation,
                   "there is no frame 9: the file has 8 frames");
    expect_failure({png, "--frame", "1", "-o", path("x.png")}, png, "a PNG file has no frames");
    expect_failure({png, "--animate", path("x.html")}, png, "a PNG file has no frames");
}

TEST_F(ToolGifRefusals, memory_that_does_not_suffice) {
    const std::string name = sample("lighthouse.gif").string();
    const std::string reason = "the decoder needs more memory than --max-memory allows";
    expect_failure({name, "--max-memory", "40k", "-o", path("x.png")}, name, reason);
    expect_failure({name, "--max-memory", "100k", "--frame", "3", "-o", path("x.png")}, name, reason);
    expect_failure({name, "--max-memory", "100k", "--all-frames", "-o", path("%n.png")}, name, reason);
    EXPECT_EQ(run({name, "--quiet", "--max-memory", "200k", "--frame", "3", "-o", path("x.png")}).status, 0);
}

TEST_F(ToolGifRefusals, a_file_that_is_cut_short_gives_its_rows_a_warning_and_status_2) {
    SmallFrame frame;
    frame.indices = Bytes(9, 1);
    const std::string name = write("x.gif", gif_bytes(with_frame(frame)));
    for (const char *const mode : {"oneshot", "iter", "line=1", "line=9"}) {
        const ToolRun got = run({name, "--mode", mode, "-o", path("x.png")});
        EXPECT_EQ(got.status, 2) << mode;
        EXPECT_EQ(got.err, "pelm-decode: " + name + ": warning: the image data breaks off after 2 of 3 rows\n") << mode;
        EXPECT_EQ(read_png(path("x.png")).at(3, 1), 0xF0A030FFu) << mode;
    }
    const ToolRun info = run({"--info", name});
    EXPECT_EQ(info.status, 2);
    EXPECT_EQ(info.out, name +
                            ": 4x3, GIF89a, 4 colours, 1 frame; decoded; truncated: the image data breaks off after "
                            "2 of 3 rows\n  frame 1: 4x3 at 0,0, disposal 0 (unspecified), opaque, only 2 of 3 rows\n");
}

TEST_F(ToolGifRefusals, what_a_user_may_not_expect_is_told) {
    SmallFrame clear, small;
    clear.delay = 3, clear.transparent = 1;
    small.width = 2;
    SmallGif two;
    two.frames.push_back(SmallFrame{});
    expect_warning(SmallGif{}, {}, "");
    expect_warning(two, {}, "only the first of 2 frames is decoded; use --frame, --all-frames or --animate");
    expect_warning(two, {"--frame", "2"}, "");
    expect_warning(with_frame(clear), {},
                   "transparent pixels are written in their colour; use --frame 1 to leave them clear");
    expect_warning(with_frame(small), {},
                   "the image does not cover its screen, and is not put in its place there; use --frame 1");
    const std::string unturned = "the decoder does not turn a GIF at its own size in rgba; use --format rgb or bgrx";
    expect_warning(SmallGif{}, {"--rotate", "90"}, unturned);
    expect_warning(SmallGif{}, {"--rotate", "90", "--frame", "1"}, unturned);
    expect_warning(SmallGif{}, {"--rotate", "90", "--place", "stretch", "--box", "3x4"}, unturned);
    expect_warning(SmallGif{}, {"--rotate", "90", "--format", "bgrx"}, "");
    expect_warning(SmallGif{}, {"--rotate", "90", "--box", "2x2"}, "");
}

TEST_F(ToolGifRefusals, info_tells_what_there_is) {
    SmallGif gif;
    gif.width = 20;
    gif.loops = 2;
    SmallFrame second;
    second.left = 5, second.top = 1, second.width = 7, second.height = 2;
    second.delay = 1, second.disposal = 2, second.transparent = 3, second.interlaced = true;
    second.colours = {1, 2, 3, 4};
    gif.frames = {SmallFrame{}, second};
    gif.has_trailer = false;
    const std::string name = write("x.gif", gif_bytes(gif));
    const ToolRun got = run({"--info", name});
    EXPECT_EQ(got.status, 0);
    EXPECT_EQ(got.out,
              name +
                  ": 20x3, GIF89a, 4 colours, 2 frames, 0.20 s, played 3 times (loop count 2); decoded; note: only the "
                  "first of 2 frames is decoded; use --frame, --all-frames or --animate; note: the image does not "
                  "cover its screen, and is not put in its place there; use --frame 1\n"
                  "  frame 1: 4x3 at 0,0, 0 ms (shown for 100), disposal 0 (unspecified), opaque\n"
                  "  frame 2: 7x2 at 5,1, 10 ms (shown for 100), disposal 2 (clear), transparent index 3, "
                  "interlaced, 4 colours of its own\n"
                  "  the file ends without its trailer after frame 2\n");
}

} // namespace
} // namespace pelm::test

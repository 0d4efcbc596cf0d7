// Animations through the tool: composed frames, one or all of them, and what becomes of damaged files. Some test images
// lie outside of the repository: where they are missing, the tests say so and use the samples alone.
#include <cstdlib>
#include <iostream>

#include <csignal>

#include "tests/support/small_gif.h"
#include "tests/tool/gif_oracle.h"
#include "tests/tool/run_tool.h"

namespace pelm::test {
namespace {

namespace fs = std::filesystem;
using Words = std::vector<std::string>;
using Names = std::set<std::string>;

std::vector<fs::path> animations() {
    std::vector<fs::path> paths = {sample("lighthouse.gif"), sample("sunset-interlaced.gif")};
    const char *const chosen = std::getenv("PELM_TEST_IMAGES");
    const fs::path folder = chosen != nullptr ? chosen : PELM_SHARED_IMAGES;
    for (const char *const name : {"animated-red-blue.gif", "muybridge.gif", "gifplayer-muybridge.gif",
                                   "hippopotamus.masked-with-muybridge.gif"}) {
        const fs::path path = folder / name;
        if (!fs::exists(path)) std::cout << "not tested: there is no " << path << "; set PELM_TEST_IMAGES\n";
        if (fs::exists(path)) paths.push_back(path);
    }
    return paths;
}

// Three frames of one colour each, 2x2 on a screen of 6x2, one beside the other.
SmallGif three_in_a_row() {
    SmallGif gif;
    gif.width = 6, gif.height = 2;
    gif.frames.clear();
    for (uint8_t i = 0; i < 3; ++i) {
        SmallFrame frame;
        frame.width = frame.height = 2;
        frame.left = 2u * i;
        frame.indices = Bytes(4, static_cast<uint8_t>(i + 1));
        frame.delay = 5;
        gif.frames.push_back(frame);
    }
    return gif;
}

class ToolAnimation : public ToolTest {
protected:
    void expect_frames(const fs::path &file, const Words &options) const {
        const std::vector<Image> expected = read_gif(file).frames;
        ASSERT_FALSE(expected.empty()) << file;
        Words arguments = {file.string(), "--all-frames", "-o", path("frame-%n.png")};
        arguments.insert(arguments.end(), options.begin(), options.end());
        const ToolRun got = run(arguments);
        EXPECT_EQ(got.status, 0);
        EXPECT_EQ(got.err, "") << file;
        EXPECT_EQ(files().size(), expected.size()) << file;
        for (size_t i = 0; i < expected.size(); ++i) {
            const fs::path frame = path("frame-" + std::to_string(i + 1) + ".png");
            EXPECT_EQ(difference(expected[i], read_png(frame)), "") << file << ", frame " << i + 1;
            fs::remove(frame);
        }
    }
};

TEST_F(ToolAnimation, all_frames_are_composed_by_the_published_rules) {
    for (const fs::path &file : animations()) {
        if (file.stem() == "gifplayer-muybridge") { // of 380 frames
            expect_frames(file, {});
            continue;
        }
        for (const char *const source : {"memory", "file", "pipe"}) {
            for (const char *const mode : {"oneshot", "iter"})
                expect_frames(file, {"--source", source, "--mode", mode});
        }
    }
}

TEST_F(ToolAnimation, one_frame_is_the_same_as_among_all) {
    const std::string file = sample("lighthouse.gif").string();
    const std::vector<Image> expected = read_gif(file).frames;
    for (const size_t number : {1u, 2u, 5u, 8u}) {
        const ToolRun got = run({file, "--frame", std::to_string(number), "-o", path("x.png")});
        EXPECT_EQ(got.status, 0);
        EXPECT_EQ(got.err, "");
        EXPECT_EQ(difference(expected[number - 1], read_png(path("x.png"))), "") << number;
    }
    EXPECT_EQ(files(), Names{"x.png"});
}

TEST_F(ToolAnimation, frames_come_in_every_size_type_and_direction) {
    const std::string file = write("x.gif", gif_bytes(three_in_a_row()));
    ASSERT_EQ(run({file, "--all-frames", "--box", "3x1", "--place", "exact", "-o", path("%n.ppm")}).status, 0);
    EXPECT_EQ(read_ppm(read_file(path("2.ppm"))).width, 3u);
    EXPECT_EQ(read_ppm(read_file(path("2.ppm"))).at(1, 0), 0x10C080FFu);
    ASSERT_EQ(run({file, "--frame", "3", "--rotate", "90", "--format", "rgb", "-o", path("x.png")}).status, 0);
    const Image turned_frame = read_png(path("x.png"));
    ASSERT_EQ(turned_frame.height, 6u);
    EXPECT_EQ(turned_frame.at(1, 1), 0xF0A030FFu);
    EXPECT_EQ(turned_frame.at(0, 5), 0xFFFFFFFFu);
}

TEST_F(ToolAnimation, what_nothing_has_painted_is_clear_or_white) {
    const std::string file = write("x.gif", gif_bytes(three_in_a_row()));
    ASSERT_EQ(run({file, "--frame", "1", "-o", path("x.png")}).status, 0);
    EXPECT_EQ(read_png(path("x.png")).at(2, 0), 0u);
    ASSERT_EQ(run({file, "--frame", "1", "--format", "bgr", "-o", path("x.png")}).status, 0);
    EXPECT_EQ(read_png(path("x.png")).at(2, 0), 0xFFFFFFFFu);
}

TEST_F(ToolAnimation, files_in_a_folder_are_numbered) {
    write("three.gif", gif_bytes(three_in_a_row()));
    ASSERT_EQ(run({path("three.gif"), "--all-frames", "-o", path("")}).status, 0);
    EXPECT_EQ(files(), (Names{"three.gif", "three-1.png", "three-2.png", "three-3.png"}));
    ASSERT_EQ(run({path("three.gif"), "--all-frames", "-o", path("%f_%n_100%%.pam")}).status, 0);
    EXPECT_TRUE(files().contains("three_3_100%.pam"));
}

// The call that delivers the last frame reports such an end as a failure.
TEST_F(ToolAnimation, without_a_trailer_gives_its_frames_a_warning_and_status_2) {
    SmallGif gif = three_in_a_row();
    gif.has_trailer = false;
    const std::string file = write("x.gif", gif_bytes(gif));
    for (const char *const mode : {"oneshot", "iter"}) {
        const ToolRun got = run({file, "--mode", mode, "--all-frames", "-o", path("%n.png")});
        EXPECT_EQ(got.status, 2);
        EXPECT_EQ(got.err, "pelm-decode: " + file + ": warning: the file ends without its trailer after frame 3\n");
        EXPECT_EQ(read_png(path("3.png")).at(5, 1), 0xFFFFFFFFu);
    }
    EXPECT_EQ(run({file, "--frame", "2", "-o", path("x.png")}).status, 0);
}

TEST_F(ToolAnimation, with_a_broken_frame_goes_on_with_a_warning) {
    SmallGif gif = three_in_a_row();
    gif.frames[1].indices.resize(3);
    const std::string file = write("x.gif", gif_bytes(gif));
    const ToolRun got = run({file, "--all-frames", "-o", path("%n.png")});
    EXPECT_EQ(got.status, 2);
    EXPECT_EQ(got.err, "pelm-decode: " + file + ": warning: frame 2 breaks off after 1 of 2 rows\n");
    EXPECT_EQ(read_png(path("3.png")).at(5, 1), 0xFFFFFFFFu);
    EXPECT_EQ(run({file, "--frame", "1", "-o", path("x.png")}).status, 0);
    EXPECT_EQ(run({file, "--frame", "3", "-o", path("x.png")}).status, 2);
}

TEST_F(ToolAnimation, is_written_whole_or_not_at_all) {
    const std::string file = sample("lighthouse.gif").string();
    fs::create_directory(path("7.png"));
    write("2.png", Bytes{1, 2, 3});
    const Names before = files();
    const ToolRun got = run({file, "--all-frames", "-o", path("%n.png")});
    EXPECT_EQ(got.status, 1);
    EXPECT_EQ(got.err, "pelm-decode: " + file + ": cannot write " + path("7.png") + ": Is a directory\n");
    EXPECT_EQ(files(), before);
    EXPECT_EQ(read_file(path("2.png")), (Bytes{1, 2, 3}));
    expect_failure({file, "--animate", "/dev/full"}, file, "cannot write /dev/full: No space left on device");
}

TEST_F(ToolAnimation, an_interrupt_leaves_nothing_behind) {
    SmallGif gif;
    gif.width = gif.height = 2000;
    gif.frames.resize(3000, SmallFrame{});
    const std::string file = write("x.gif", gif_bytes(gif));
    const ToolRun got = shell("set -m; $TOOL '" + file + "' --all-frames -o '" + path("%n.png") +
                              "' & sleep 0.5; kill -INT $!; wait $!");
    EXPECT_EQ(got.status, 128 + SIGINT);
    EXPECT_NE(got.err.find("pelm-decode: " + file + ": interrupted\n"), std::string::npos) << got.err;
    EXPECT_EQ(files(), Names{"x.gif"});
}

TEST_F(ToolAnimation, a_deadline_ends_it) {
    SmallGif gif;
    gif.width = gif.height = 3000;
    gif.frames.resize(3000, SmallFrame{});
    const std::string file = write("x.gif", gif_bytes(gif));
    expect_failure({file, "--frame", "3000", "--deadline", "50", "-o", path("x.png")}, file,
                   "not done before the deadline");
}

} // namespace
} // namespace pelm::test

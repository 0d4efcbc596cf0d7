// The page that --animate writes: what is in it, and what a browser shows of it.
#include <cstdlib>

#include "tests/support/small_gif.h"
#include "tests/tool/image_files.h"
#include "tests/tool/run_tool.h"

namespace pelm::test {
namespace {

constexpr size_t margin = 24; // of the picture, from the left and the top of the page

// Frames of one colour each, by index, with these delays in hundredths of a second.
SmallGif colours_with_delays(const std::vector<int> &delays) {
    SmallGif gif;
    gif.width = gif.height = 40;
    gif.frames.clear();
    for (const int delay : delays) {
        SmallFrame frame;
        frame.width = frame.height = 40;
        frame.indices = Bytes(1600, static_cast<uint8_t>(gif.frames.size()));
        frame.delay = delay;
        gif.frames.push_back(frame);
    }
    return gif;
}

class ToolPage : public ToolTest {
protected:
    std::string page_of(const SmallGif &gif, const std::vector<std::string> &options = {}) const {
        std::vector<std::string> arguments = {write("x.gif", gif_bytes(gif)), "--animate", path("page.html")};
        arguments.insert(arguments.end(), options.begin(), options.end());
        const ToolRun got = run(arguments);
        EXPECT_EQ(got.status, 0) << got.err;
        EXPECT_EQ(got.err, "");
        const Bytes bytes = read_file(path("page.html"));
        return {bytes.begin(), bytes.end()};
    }

    bool has_browser() const { return shell("command -v chromium").status == 0; }

    // What the browser shows of the page after that many milliseconds; `fragment` such as "#2".
    Image screenshot(const std::string &fragment, int milliseconds) const {
        const ToolRun got = shell("timeout 90 chromium --headless --no-sandbox --disable-gpu --hide-scrollbars "
                                  "--user-data-dir='" +
                                  path("profile") +
                                  "' --force-device-scale-factor=1 --force-color-profile=srgb --window-size=400,300 "
                                  "--virtual-time-budget=" +
                                  std::to_string(milliseconds) + " --screenshot='" + path("shot.png") + "' 'file://" +
                                  path("page.html") + fragment + "'");
        EXPECT_EQ(got.status, 0) << got.err;
        return read_png(path("shot.png"));
    }

    void expect_shown(const std::string &fragment, int milliseconds, uint32_t colour) const {
        const Image shot = screenshot(fragment, milliseconds);
        ASSERT_GE(shot.width, 400u);
        EXPECT_EQ(shot.at(margin, margin), colour) << fragment << ", after " << milliseconds << " ms";
        EXPECT_EQ(shot.at(margin + 39, margin + 39), colour);
        EXPECT_NE(shot.at(margin + 40, margin), colour) << "the picture is wider than it should be";
        EXPECT_NE(shot.at(margin - 1, margin), colour);
    }
};

constexpr uint32_t first_colour = 0x204060FF, second_colour = 0xF0A030FF, third_colour = 0x10C080FF;

size_t count(const std::string &text, const std::string &word) {
    size_t found = 0;
    for (size_t at = text.find(word); at != std::string::npos; at = text.find(word, at + 1))
        ++found;
    return found;
}

TEST_F(ToolPage, holds_all_frames_their_delays_and_how_often_they_are_played) {
    SmallGif gif = colours_with_delays({7, 0, 300});
    const std::string once = page_of(gif);
    EXPECT_EQ(count(once, "data:image/png;base64,"), 3u);
    EXPECT_EQ(count(once, "[70, \"data:"), 1u);
    EXPECT_EQ(count(once, "[100, \"data:"), 1u) << "a delay of 0 is shown for 100 ms";
    EXPECT_EQ(count(once, "[3000, \"data:"), 1u);
    EXPECT_EQ(count(once, "const plays = 1;"), 1u);
    gif.loops = 0;
    EXPECT_EQ(count(page_of(gif), "const plays = 0;"), 1u);
    gif.loops = 4;
    EXPECT_EQ(count(page_of(gif), "const plays = 5;"), 1u);
    EXPECT_EQ(files(), (std::set<std::string>{"x.gif", "page.html"}));
}

Bytes from_base64(const std::string &text) {
    const std::string digits = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
    Bytes bytes;
    uint32_t bits = 0;
    for (size_t i = 0; i < text.size() && text[i] != '='; ++i) {
        bits = bits << 6 | static_cast<uint32_t>(digits.find(text[i]));
        if (i % 4 != 0) bytes.push_back(static_cast<uint8_t>(bits >> (6 - 2 * (i % 4))));
    }
    return bytes;
}

TEST_F(ToolPage, holds_the_pictures_that_the_frames_are) {
    const std::string file = sample("lighthouse.gif").string();
    ASSERT_EQ(run({file, "--animate", path("page.html")}).status, 0);
    const Bytes bytes = read_file(path("page.html"));
    const std::string page(bytes.begin(), bytes.end()), mark = "base64,";
    size_t at = 0;
    for (int number = 1; number <= 8; ++number) {
        at = page.find(mark, at) + mark.size();
        const std::string text = page.substr(at, page.find('"', at) - at);
        EXPECT_EQ(text.size() % 4, 0u);
        write("held.png", from_base64(text));
        ASSERT_EQ(run({file, "--frame", std::to_string(number), "-o", path("frame.png")}).status, 0);
        EXPECT_TRUE(read_file(path("held.png")) == read_file(path("frame.png"))) << "frame " << number;
    }
}

TEST_F(ToolPage, needs_nothing_else) {
    const std::string page = page_of(colours_with_delays({7}));
    for (const char *const word : {"http:", "https:", "src=", "href=", "@import"})
        EXPECT_EQ(count(page, word), 0u) << word;
}

TEST_F(ToolPage, shows_names_as_they_are) {
    const std::string file = write("a<b>&c.gif", gif_bytes(SmallGif{}));
    ASSERT_EQ(run({file, "--animate", path("page.html")}).status, 0);
    const Bytes bytes = read_file(path("page.html"));
    EXPECT_EQ(count({bytes.begin(), bytes.end()}, "a&lt;b&gt;&amp;c.gif</title>"), 1u);
}

TEST_F(ToolPage, goes_to_standard_output) {
    const ToolRun got = run({sample("lighthouse.gif").string(), "--animate", "-"});
    EXPECT_EQ(got.status, 0);
    EXPECT_TRUE(got.out.starts_with("<!DOCTYPE html>"));
    EXPECT_EQ(count(got.out, "data:image/png;base64,"), 8u);
}

TEST_F(ToolPage, is_played_by_a_browser_with_its_delays) {
    if (!has_browser()) GTEST_SKIP() << "chromium is not installed: the page is not tried in a browser";
    page_of(colours_with_delays({5, 10, 6000}));
    expect_shown("", 5000, third_colour);
    page_of(colours_with_delays({6000, 10, 10}));
    expect_shown("", 5000, first_colour);
}

TEST_F(ToolPage, stops_at_its_last_frame_after_the_last_play) {
    if (!has_browser()) GTEST_SKIP() << "chromium is not installed: the page is not tried in a browser";
    SmallGif gif = colours_with_delays({5, 10});
    gif.loops = 3;
    page_of(gif);
    expect_shown("", 5000, second_colour);
}

TEST_F(ToolPage, shows_the_frame_that_its_address_names) {
    if (!has_browser()) GTEST_SKIP() << "chromium is not installed: the page is not tried in a browser";
    SmallGif gif = colours_with_delays({5, 5, 5});
    gif.loops = 0;
    page_of(gif);
    expect_shown("#1", 3000, first_colour);
    expect_shown("#2", 3000, second_colour);
    expect_shown("#3", 3000, third_colour);
}

} // namespace
} // namespace pelm::test

// Where outputs go: names, folders, types, and files that are already there.
#include "tests/tool/image_files.h"
#include "tests/tool/run_tool.h"

#include <sys/stat.h>

namespace pelm::test {
namespace {

namespace fs = std::filesystem;
using Names = std::set<std::string>;

class ToolFiles : public ToolTest {
protected:
    const std::string first = sample("sunset-8.bmp").string();
    const std::string second = sample("sunset-1.bmp").string();
};

TEST_F(ToolFiles, are_numbered_by_percent_n) {
    EXPECT_EQ(run({first, second, "-o", path("picture-%n.ppm")}).status, 0);
    EXPECT_EQ(files(), (Names{"picture-1.ppm", "picture-2.ppm"}));
}

TEST_F(ToolFiles, are_named_after_their_inputs_by_percent_f) {
    EXPECT_EQ(run({first, second, "-o", path("%n-%f-100%%.pam")}).status, 0);
    EXPECT_EQ(files(), (Names{"1-sunset-8-100%.pam", "2-sunset-1-100%.pam"}));
}

TEST_F(ToolFiles, go_into_a_folder_as_png) {
    EXPECT_EQ(run({first, second, "-o", path("")}).status, 0);
    EXPECT_EQ(files(), (Names{"sunset-8.png", "sunset-1.png"}));
}

TEST_F(ToolFiles, go_into_a_folder_as_what_the_type_says) {
    EXPECT_EQ(run({"-", "-o", path("."), "--output-type", "raw"}, first).status, 0);
    EXPECT_EQ(files(), (Names{"stdin.raw"}));
}

TEST_F(ToolFiles, have_the_type_of_the_option_rather_than_of_the_suffix) {
    EXPECT_EQ(run({first, "-o", path("x.png"), "--output-type", "ppm"}).status, 0);
    EXPECT_EQ(read_ppm(read_file(path("x.png"))).width, 320u);
}

TEST_F(ToolFiles, go_to_standard_output) {
    const ToolRun got = run({first, "-o", "-", "--output-type", "ppm"});
    EXPECT_EQ(got.status, 0);
    EXPECT_EQ(read_ppm(Bytes(got.out.begin(), got.out.end())).height, 240u);
    EXPECT_EQ(run({first, "-o", "-"}).out.substr(1, 3), "PNG");
}

TEST_F(ToolFiles, that_are_new_have_the_usual_permissions) {
    const mode_t mask = umask(0);
    umask(mask);
    ASSERT_EQ(run({first, "-o", path("x.png")}).status, 0);
    struct stat status = {};
    ASSERT_EQ(stat(path("x.png").c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777, 0666 & ~mask);
}

TEST_F(ToolFiles, that_exist_are_replaced_and_keep_their_permissions) {
    write("x.png", Bytes{1, 2, 3});
    fs::permissions(path("x.png"), fs::perms::owner_read | fs::perms::owner_write);
    ASSERT_EQ(run({first, "-o", path("x.png")}).status, 0);
    EXPECT_EQ(read_png(path("x.png")).width, 320u);
    EXPECT_EQ(fs::status(path("x.png")).permissions(), fs::perms::owner_read | fs::perms::owner_write);
    EXPECT_EQ(files(), (Names{"x.png"}));
}

TEST_F(ToolFiles, behind_links_are_replaced_and_the_links_stay) {
    write("real.png", Bytes{1, 2, 3});
    fs::create_symlink("real.png", path("link.png"));
    ASSERT_EQ(run({first, "-o", path("link.png")}).status, 0);
    EXPECT_TRUE(fs::is_symlink(path("link.png")));
    EXPECT_EQ(read_png(path("real.png")).width, 320u);
}

TEST_F(ToolFiles, that_are_devices_stay_devices) {
    EXPECT_EQ(run({first, "-o", "/dev/null", "--output-type", "png"}).status, 0);
    EXPECT_TRUE(fs::is_character_file("/dev/null"));
}

} // namespace
} // namespace pelm::test

// A megabyte of what says nothing: empty sub-blocks, stray bytes, extensions.
#include "tests/bounds/ways.h"
#include "tests/bounds/work.h"
#include "tests/gif/support/gif_builder.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

constexpr size_t megabyte = 1000000;
constexpr uint16_t width = 9, height = 7;

struct Repeated {
    const char *what;
    Bytes file;
};

Bytes indices() {
    return noise_pixels(width * height, 4, 1);
}

GifFile opened() {
    GifFile file;
    return file.screen(width, height, distinct_table(4));
}

// The picture behind a megabyte of the same bytes between blocks.
Bytes behind(const Bytes &bytes) {
    GifFile file = opened();
    Bytes many;
    while (many.size() < megabyte)
        many.insert(many.end(), bytes.begin(), bytes.end());
    return file.raw(many).image({0, 0, width, height}, indices(), 2).trailer().bytes;
}

Bytes comment_of_crumbs() {
    Bytes bytes{0x21, 0xFE};
    while (bytes.size() < megabyte)
        bytes.insert(bytes.end(), {1, 'x'});
    bytes.push_back(0);
    GifFile file = opened();
    return file.raw(bytes).image({0, 0, width, height}, indices(), 2).trailer().bytes;
}

Bytes image_data_in(const SubBlockSizes &sizes) {
    GifFile file = opened();
    return file.descriptor({0, 0, width, height}).data_in(2, lzw_data(indices(), 2), sizes).trailer().bytes;
}

SubBlockSizes empty_ones_before(SubBlockSizes rest) {
    rest.insert(rest.begin(), megabyte, 0);
    return rest;
}

SubBlockSizes empty_ones_among(size_t blocks) {
    SubBlockSizes sizes;
    for (size_t i = 0; i < blocks; ++i) {
        sizes.insert(sizes.end(), megabyte / blocks + 1, 0);
        sizes.push_back(1);
    }
    sizes.push_back(255);
    return sizes;
}

const std::vector<Repeated> &repetitions() {
    static const std::vector<Repeated> all = {
        {"empty sub-blocks before the image's data", image_data_in(empty_ones_before({255}))},
        {"empty sub-blocks among the image's data", image_data_in(empty_ones_among(5))},
        {"stray bytes", behind({0})},
        {"other stray bytes", behind({0xFF, 0x20, 0x01})},
        {"graphic controls", behind({0x21, 0xF9, 4, 0, 0, 0, 0, 0})},
        {"empty comments", behind({0x21, 0xFE, 0})},
        {"unknown extensions", behind({0x21, 0x77})},
        {"a comment of one-byte sub-blocks", comment_of_crumbs()},
    };
    return all;
}

using GifRepetition = BoundsTest;

Work work_of(const Bytes &file, Way way, const Asking &asking, const std::string &what) {
    reset_work();
    const Decoded decoded = decode(file, way, asking);
    const int32_t done = way == Way::frames || way == Way::frames_iterative ? 3 : 1;
    EXPECT_EQ(decoded.result, done) << what;
    EXPECT_TRUE(left_nothing()) << what;
    return work();
}

TEST_F(GifRepetition, what_says_nothing_costs_no_more_than_ordinary_data) {
    constexpr uint16_t side = 1200;
    GifFile noise;
    noise.screen(side, side, distinct_table(256));
    noise.image({0, 0, side, side}, noise_pixels(size_t{side} * side, 256, 3), 8).trailer();
    const Bytes sound = opened().image({0, 0, width, height}, indices(), 2).trailer().bytes;
    ASSERT_GT(noise.bytes.size(), megabyte);
    for (const Way way : {Way::gif, Way::gif_iterative, Way::gif_lines, Way::frames, Way::frames_iterative})
        for (const uint32_t kind : every_kind) {
            if (quick() && way != Way::gif_lines && way != Way::frames_iterative) continue;
            const Work ordinary = work_of(noise.bytes, way, {kind, 7, 0, side, side}, "noise");
            const Asking asking{kind, 7, 0, width, height};
            const Bytes expected = decode(sound, way, asking).output;
            for (const Repeated &repeated : repetitions()) {
                const std::string what = std::string(repeated.what) + ", " + name_of(way);
                ASSERT_GT(repeated.file.size(), megabyte) << what;
                const Work got = work_of(repeated.file, way, asking, what);
                EXPECT_TRUE(within(1, got, ordinary)) << what;
                EXPECT_LE(got.reads, repeated.file.size() / 16000 + 4) << what;
                EXPECT_LE(got.bytes_read, repeated.file.size()) << what;
                EXPECT_EQ(decode(repeated.file, way, asking).output, expected) << what;
            }
        }
}

// As many rows as there are, each without pixels, in 13 bytes.
TEST_F(GifRepetition, frames_without_pixels_move_no_more_rows_of_the_canvas_than_the_box_shows) {
    constexpr uint16_t side = 3000;
    constexpr uint64_t top_up = 16384; // at most, before every image
    const Bytes frame{0x2C, 0, 0, 0, 0, 0, 0, side & 0xFF, side >> 8, 0, 0, 1, 0};
    const auto file_of = [&](int frames) {
        GifFile file;
        file.screen(side, side, distinct_table(4));
        for (int i = 0; i < frames; ++i)
            file.raw(frame);
        return file.trailer().bytes;
    };
    const Bytes one = file_of(1), many = file_of(101);
    for (const Way way : {Way::frames, Way::frames_iterative})
        for (const int32_t box : {0, 8, 30}) {
            Asking asking{PELM_SOURCE_MEMORY, 7, 0, box, box};
            asking.has_output = box != 0;
            if (box == 0) asking.width = asking.height = 30;
            const Work first = work_of(one, way, asking, "one frame");
            const Work all = work_of(many, way, asking, "many frames");
            const uint64_t shown = static_cast<uint64_t>(box) * side * 4;
            EXPECT_LE(all.bytes_moved - first.bytes_moved, 100 * (shown + top_up)) << name_of(way) << ", " << box;
        }
}

} // namespace
} // namespace pelm::test

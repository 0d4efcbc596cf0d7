// Frames of the shared animations, and of some of our own, against a composer in plain arrays over the indices that
// giflib reads. It follows the published rules, with the differences that docs/oddities.md lists.
#include <cstring>

#include "tests/gif/animated/frames.h"
#include "tests/gif/support/giflib_reader.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

using Rgba = std::array<uint8_t, 4>;
constexpr Rgba unpainted = {0, 0, 0, 0};

class Composer {
public:
    explicit Composer(const GiflibFile &file) : file_(file), canvas_(size_t{file.width} * file.height, unpainted) {}

    // The frame on the screen, and the canvas made ready for the next one.
    std::vector<Rgba> next(const GiflibImage &image) {
        std::vector<Rgba> shown = canvas_;
        for (uint32_t y = 0; y < image.place.height; ++y)
            for (uint32_t x = 0; x < image.place.width; ++x) {
                const uint32_t column = image.place.left + x, row = image.place.top + y;
                if (column >= file_.width || row >= file_.height) continue;
                const size_t at = size_t{row} * file_.width + column;
                paint(image, image.indices[size_t{y} * image.place.width + x], shown[at], canvas_[at]);
            }
        return shown;
    }

private:
    void paint(const GiflibImage &image, uint8_t index, Rgba &shown, Rgba &kept) const {
        const bool transparency = image.control.transparent >= 0;
        if (index != image.control.transparent) shown = colour(image.local.empty() ? file_.global : image.local, index);
        if (image.control.disposal == 2)
            kept = transparency ? unpainted : colour(file_.global, file_.background);
        else if (image.control.disposal != 3) // "restore to previous"
            kept = shown;
    }
    static Rgba colour(const ColourTable &table, size_t index) {
        const auto rgb = table_colour(table, index);
        return {rgb[0], rgb[1], rgb[2], 255};
    }

    const GiflibFile &file_;
    std::vector<Rgba> canvas_;
};

class GifFrameOracle : public GifTest {
protected:
    static int32_t call(GifCall which, ImageDecodeInfo &info, Bytes &output, const GiflibFile &read) {
        return which == GifCall::frame ? ZOTARPELMI_DecodeAGIF(&info, output.data(), read.width, read.height)
                                       : ZOTARPELMI_DecodeAGIFIter(&info, output.data(), read.width, read.height);
    }
    // The number of frames compared.
    size_t expect_same_frames(const Bytes &file, const std::string &name, GifCall which) {
        const std::optional<GiflibFile> read = read_with_giflib(file);
        if (!read.has_value()) return 0;
        host.reset();
        TestSource source(PELM_SOURCE_STREAM, file);
        ImageDecodeInfo info{};
        info.input = &source.source;
        info.outputFormat = PELM_FORMAT_RGBA8888;
        Composer composer(*read);
        Bytes output(size_t{read->width} * read->height * 4, 0x5A);
        for (size_t i = 0; i < read->images.size(); ++i) {
            const std::vector<Rgba> expected = composer.next(read->images[i]);
            int32_t result;
            do
                result = call(which, info, output, *read);
            while (result == PELM_RESULT_MORE);
            EXPECT_EQ(result, i + 1 == read->images.size() ? 3 : 1) << name << ", frame " << i;
            EXPECT_TRUE(memcmp(expected.data(), output.data(), output.size()) == 0) << name << ", frame " << i;
            if (which == GifCall::frame) {
                EXPECT_EQ(info.frameDelay, read->images[i].control.delay * 10u) << name << ", frame " << i;
                EXPECT_EQ(info.colorTableState, !read->images[i].local.empty()) << name << ", frame " << i;
            }
        }
        return read->images.size();
    }
};

TEST_F(GifFrameOracle, shared_animations_show_the_composed_frames) {
    const auto paths = shared_gifs();
    size_t compared = 0;
    for (const auto &path : paths)
        for (const GifCall which : frame_calls)
            compared += expect_same_frames(contents_of(path), path.filename(), which);
    EXPECT_TRUE(paths.empty() || compared > 20) << compared;
}

TEST_F(GifFrameOracle, own_animations_show_the_composed_frames) {
    const uint32_t seeds = quick() ? 40 : 500;
    for (uint32_t seed = 0; seed < seeds && !HasFailure(); ++seed) {
        Noise noise(seed + 31);
        const auto below = [&noise](uint32_t limit) { return static_cast<uint16_t>((noise.next() >> 6) % limit); };
        Animation animation{20, 16, 4, static_cast<uint8_t>(below(16)), {}, true, seed};
        for (uint32_t i = 1 + below(6); i > 0; --i) {
            Frame frame;
            frame.place = {below(12), below(10), static_cast<uint16_t>(1 + below(8)),
                           static_cast<uint16_t>(1 + below(6)), false};
            if (below(3) == 0) frame.place = {0, 0, 20, 16, below(2) == 0};
            frame.control = {static_cast<uint8_t>(below(4)), below(17) - 1, below(100), 0};
            if (below(3) == 0) frame.local = distinct_table(16, seed + i);
            animation.frames.push_back(frame);
        }
        EXPECT_EQ(expect_same_frames(animation.file(), "seed " + std::to_string(seed), frame_calls[seed % 2]),
                  animation.frames.size());
    }
}

} // namespace
} // namespace pelm::test

// Indices against giflib: the shared pictures, and files of our own that giflib reads too. First the model, so that
// what the other tests compare with has been checked by somebody else.
#include "tests/gif/support/gif_check.h"
#include "tests/gif/support/giflib_reader.h"

namespace pelm::test {
namespace {

// What giflib makes of the first image, in RGB888. Only for images that fill the screen.
std::optional<Bytes> rgb_by_giflib(const Bytes &file) {
    const std::optional<GiflibFile> read = read_with_giflib(file);
    if (!read.has_value() || read->images.empty()) return std::nullopt;
    const GiflibImage &image = read->images.front();
    if (image.place.left != 0 || image.place.top != 0 || image.place.width != read->width ||
        image.place.height != read->height)
        return std::nullopt;
    Bytes rgb;
    for (const uint8_t index : image.indices)
        for (const uint8_t channel : table_colour(image.local.empty() ? read->global : image.local, index))
            rgb.push_back(channel);
    return rgb;
}

uint16_t side(const Bytes &file, size_t at) {
    return static_cast<uint16_t>(file[at] | file[at + 1] << 8);
}

Bytes rgb_by_model(const Bytes &file) {
    const GifRequest request = own_size(side(file, 6), side(file, 8), PELM_FORMAT_RGB888);
    GifModel model(file, request);
    Bytes output(gif_buffer_shape(request.box_width, request.box_height, request).bytes());
    EXPECT_EQ(model.one_shot(output), 1);
    return output;
}

class GifOracle : public GifTest {
protected:
    void expect_same_indices(const Bytes &file, const std::string &name) {
        const std::optional<Bytes> rgb = rgb_by_giflib(file);
        if (!rgb.has_value()) return;
        ++compared_;
        EXPECT_TRUE(*rgb == rgb_by_model(file)) << "model, " << name;
        const GifRequest request = own_size(side(file, 6), side(file, 8), PELM_FORMAT_RGB888);
        TestSource source(PELM_SOURCE_STREAM, file);
        ImageDecodeInfo info{};
        info.input = &source.source;
        info.outputFormat = PELM_FORMAT_RGB888;
        Bytes output(rgb->size());
        EXPECT_EQ(ZOTARPELMI_DecodeGIF(&info, output.data(), request.box_width, request.box_height), 1) << name;
        EXPECT_TRUE(*rgb == output) << name;
    }
    int compared_ = 0;
};

TEST_F(GifOracle, shared_pictures_have_the_colours_that_giflib_sees) {
    const auto paths = shared_gifs();
    for (const auto &path : paths)
        expect_same_indices(contents_of(path), path.filename());
    EXPECT_TRUE(paths.empty() || compared_ > 5) << compared_;
}

constexpr uint16_t heights[] = {1, 2, 3, 4, 5, 17, 60};

TEST_F(GifOracle, own_files_of_every_code_size_and_way_of_clearing_are_valid) {
    for (int bits = 2; bits <= 8; ++bits)
        for (const bool interlaced : {false, true})
            for (const size_t clear_every : {size_t{0}, size_t{1}, size_t{7}, size_t{300}})
                for (const bool begins : {true, false})
                    for (const uint16_t height : heights) {
                        const Still still{41, height, bits, interlaced, static_cast<uint32_t>(bits * 100 + height)};
                        LzwOptions options;
                        options.clear_every = clear_every;
                        options.begins_with_clear = begins;
                        expect_same_indices(still_file(still, options).bytes, "code size " + std::to_string(bits));
                    }
    EXPECT_EQ(compared_, 7 * 2 * 4 * 2 * 7);
}

TEST_F(GifOracle, a_full_table_is_kept_when_no_clear_code_comes) {
    for (const int bits : {2, 4, 8})
        for (const bool clears : {true, false}) {
            LzwOptions options;
            options.clears_full_table = clears;
            expect_same_indices(still_file({200, 180, bits, false, 9}, options).bytes, std::to_string(bits));
        }
    EXPECT_EQ(compared_, 6);
}

} // namespace
} // namespace pelm::test

// Pixels at their own size against libpng, for the PNG suite, the shared pictures and generated files.
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iostream>

#include "tests/png/decode/oracle.h"

namespace pelm::test {
namespace {

namespace fs = std::filesystem;

class PngOracle : public PngDecoding {
protected:
    static fs::path images() {
        const char *const elsewhere = getenv("PELM_TEST_IMAGES");
        return elsewhere != nullptr ? elsewhere : PELM_SHARED_IMAGES;
    }
    static Bytes contents(const fs::path &path) {
        std::ifstream stream(path, std::ios::binary);
        return {std::istreambuf_iterator<char>(stream), {}};
    }
    static std::vector<fs::path> files(const fs::path &folder) {
        std::vector<fs::path> found;
        std::error_code absent;
        for (const auto &entry : fs::directory_iterator(folder, absent))
            if (entry.path().extension() == ".png") found.push_back(entry.path());
        if (found.empty()) std::cout << "not there, nothing compared: " << folder << "\n";
        std::sort(found.begin(), found.end());
        return found;
    }
    static bool interlaced(const Bytes &file) { return file.size() > 28 && file[28] == 1; }

    static std::string disagreement(const Bytes &file) {
        return disagreement_with_libpng(file, {{PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM}}, 7);
    }
};

TEST_F(PngOracle, every_valid_image_of_the_suite_is_what_libpng_reads) {
    for (const fs::path &path : files(images() / "pngsuite")) {
        const Bytes file = contents(path);
        const std::string name = path.filename().string();
        if (interlaced(file) || name[0] == 'x') continue;
        EXPECT_EQ(disagreement(file), "") << name;
    }
}

TEST_F(PngOracle, every_corrupt_image_of_the_suite_fails) {
    for (const fs::path &path : files(images() / "pngsuite")) {
        if (path.filename().string()[0] != 'x') continue;
        const Bytes file = contents(path);
        for (const uint32_t kind : all_source_kinds)
            for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
                const Outcome outcome = run(file, kind, {7, 0, 32, 32}, 4096, call, 5);
                EXPECT_EQ(flaws(outcome, 0), "") << path.filename();
                EXPECT_EQ(outcome.output, background(4096)) << path.filename();
            }
    }
}

TEST_F(PngOracle, every_shared_picture_is_what_libpng_reads) {
    for (const fs::path &path : files(images())) {
        const Bytes file = contents(path);
        if (interlaced(file)) continue;
        EXPECT_EQ(disagreement(file), "") << path.filename();
    }
}

TEST_F(PngOracle, generated_images_of_every_layout_and_filter_are_what_libpng_reads) {
    for (const Layout layout : all_layouts)
        for (const bool transparent : {false, true})
            for (const uint32_t width : {1u, 2u, 3u, 7u, 8u, 9u, 33u})
                for (const std::vector<uint8_t> &filters :
                     {std::vector<uint8_t>{0}, {1}, {2}, {3}, {4}, {4, 3, 2, 1, 0, 1}}) {
                    Picture picture = noise_picture(layout.colour_type, layout.depth, width, 13, width);
                    if (transparent) picture = with_transparency(picture);
                    Png png = png_of(picture);
                    png.filters = filters;
                    EXPECT_EQ(disagreement(build(png)), "") << picture.described() << ", filter " << int{filters[0]};
                }
}

TEST_F(PngOracle, generated_streams_of_every_kind_of_block_are_what_libpng_reads) {
    for (const Blocks blocks : {Blocks::stored, Blocks::fixed, Blocks::dynamic, Blocks::mixed})
        for (const size_t block_size : {200u, 1000u, 40000u}) {
            const Picture picture = noise_picture(rgb, 8, 60, 50);
            EXPECT_EQ(disagreement(file_of_blocks(picture, blocks, block_size)), "") << name_of(blocks);
            Png smooth = png_of(picture);
            smooth.rows = smooth_rows(smooth);
            smooth.level = 9;
            EXPECT_EQ(disagreement(build(smooth)), "");
        }
}

} // namespace
} // namespace pelm::test

// Interlaced images of the PNG suite, at their own size, against libpng.
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iostream>

#include "tests/png/decode/oracle.h"
#include "tests/png/interlaced/passes.h"

namespace pelm::test {
namespace {

namespace fs = std::filesystem;

std::string disagreement(const Bytes &file) {
    return disagreement_with_libpng(file, all_source_kinds, 0);
}

class PngInterlacedOracle : public PngDecoding {};

TEST_F(PngInterlacedOracle, every_interlaced_image_of_the_suite_is_what_libpng_reads) {
    const char *const elsewhere = getenv("PELM_TEST_IMAGES");
    const fs::path folder = fs::path(elsewhere != nullptr ? elsewhere : PELM_SHARED_IMAGES) / "pngsuite";
    std::error_code absent;
    int compared = 0;
    for (const auto &entry : fs::directory_iterator(folder, absent)) {
        const std::string name = entry.path().filename().string();
        if (entry.path().extension() != ".png" || name[0] == 'x') continue;
        std::ifstream stream(entry.path(), std::ios::binary);
        const Bytes file{std::istreambuf_iterator<char>(stream), {}};
        if (file.size() <= 28 || file[28] != 1) continue;
        ++compared;
        EXPECT_EQ(disagreement(file), "") << name;
    }
    if (compared == 0) std::cout << "not there, nothing compared: " << folder << "\n";
}

TEST_F(PngInterlacedOracle, generated_pictures_of_every_layout_are_what_libpng_reads) {
    for (const Layout layout : all_layouts)
        for (const bool transparent : {false, true})
            for (const uint32_t width : {1u, 2u, 3u, 5u, 8u, 17u, 33u})
                for (const uint32_t height : {1u, 4u, 5u, 13u}) {
                    reset();
                    const Picture picture = interlaced_noise(layout, transparent, width, height);
                    EXPECT_EQ(disagreement(interlaced_file_of(picture)), "") << picture.described();
                }
}

} // namespace
} // namespace pelm::test

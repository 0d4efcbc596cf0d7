// Interlaced images of the PNG suite, at their own size, against libpng.
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iostream>

#include "tests/png/interlaced/passes.h"
#include "tests/png/support/libpng_reader.h"

namespace pelm::test {
namespace {

namespace fs = std::filesystem;

std::string disagreement(const Bytes &file) {
    std::optional<LibpngPicture> picture = read_with_libpng(file);
    if (!picture) return "libpng refuses it";
    as_this_library_widens(*picture);
    const Bytes &wanted = picture->rgba;
    const Request request{7, 0, static_cast<int32_t>(picture->width), static_cast<int32_t>(picture->height)};
    for (const uint32_t kind : all_source_kinds)
        for (const Call call : {Call::one_shot, Call::iterative, Call::line}) {
            const Outcome outcome = run(file, kind, request, wanted.size(), call, 0, 1 << 16);
            const std::string way = name_of(call) + ", kind " + std::to_string(kind) + ": ";
            if (const std::string wrong = flaws(outcome); !wrong.empty()) return way + wrong;
            const auto [a, b] = std::mismatch(wanted.begin(), wanted.end(), outcome.output.begin());
            if (a != wanted.end())
                return way + "byte " + std::to_string(a - wanted.begin()) + " should be " + std::to_string(*a) +
                       " and is " + std::to_string(*b);
        }
    return {};
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

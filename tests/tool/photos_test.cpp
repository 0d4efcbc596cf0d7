// Photos and drawings by others, as WBMP, and stored as BMP in every accepted way. They lie outside of the repository:
// where they are missing, the tests say so and pass.
#include "tests/tool/run_tool.h"
#include "tests/tool/stored_pixels.h"

#include <cstdlib>
#include <iostream>

namespace pelm::test {
namespace {

namespace fs = std::filesystem;

fs::path image_folder() {
    const char *const chosen = std::getenv("PELM_TEST_IMAGES");
    return chosen != nullptr ? chosen : PELM_SHARED_IMAGES;
}

class ToolPhotos : public ToolTest {
protected:
    // False, with a message, when there is no such image.
    static bool is_there(const std::string &name) {
        if (fs::exists(image_folder() / name)) return true;
        std::cout << "not tested: there is no " << (image_folder() / name) << "; set PELM_TEST_IMAGES\n";
        return false;
    }
};

uint32_t red(uint32_t pixel) {
    return pixel >> 24;
}
uint32_t green(uint32_t pixel) {
    return pixel >> 16 & 255;
}
uint32_t blue(uint32_t pixel) {
    return pixel >> 8 & 255;
}

// The channel's bits that `mask` has room for, at its place.
uint32_t under_mask(uint32_t channel, uint32_t mask) {
    uint32_t value = channel << 24;
    for (uint32_t top = mask; (top & 0x80000000u) == 0; top <<= 1)
        value >>= 1;
    return value & mask;
}

// The pixel as the variant stores it; palette indices are red-green-blue in 3, 3 and 2 bits, or grey.
uint32_t stored_as(const BmpVariant &variant, uint32_t pixel) {
    switch (variant.bits) {
    case 1: return green(pixel) >> 7;
    case 4: return green(pixel) >> 4;
    case 8: return red(pixel) >> 5 << 5 | green(pixel) >> 5 << 2 | blue(pixel) >> 6;
    case 16: break;
    default: return pixel >> 8;
    }
    const std::array<uint32_t, 3> plain = {0x7C00, 0x03E0, 0x001F};
    const auto &masks = variant.compression == 3 ? variant.masks : plain;
    return under_mask(red(pixel), masks[0]) | under_mask(green(pixel), masks[1]) | under_mask(blue(pixel), masks[2]);
}

Bytes palette_for(uint16_t bits) {
    Bytes palette;
    for (uint32_t i = 0; bits <= 8 && i < 1u << bits; ++i) {
        const uint32_t grey = bits == 8 ? 0 : i * 255 / ((1u << bits) - 1);
        const uint32_t b = bits == 8 ? (i & 3) * 85 : grey;
        const uint32_t g = bits == 8 ? (i >> 2 & 7) * 255 / 7 : grey;
        const uint32_t r = bits == 8 ? (i >> 5) * 255 / 7 : grey;
        for (const uint32_t byte : {b, g, r, 0u})
            palette.push_back(static_cast<uint8_t>(byte));
    }
    return palette;
}

Bytes as_bmp(const Image &image, const BmpVariant &variant, bool top_down) {
    Picture picture(image.height);
    for (size_t y = 0; y < image.height; ++y) {
        for (size_t x = 0; x < image.width; ++x)
            picture[y].push_back(stored_as(variant, image.at(x, y)));
    }
    BmpFile file;
    file.width = static_cast<int32_t>(image.width);
    file.height = static_cast<int32_t>(image.height) * (top_down ? -1 : 1);
    file.bits = variant.bits;
    file.compression = variant.compression;
    if (variant.compression == 3) file.masks.assign(variant.masks.begin(), variant.masks.end());
    file.palette = palette_for(variant.bits);
    file.rows = pack_rows(picture, variant.bits, top_down);
    return file_bytes(file);
}

TEST_F(ToolPhotos, decode_from_every_depth_to_their_stored_pixels) {
    for (const std::string name : {"harvesters.png", "hibiscus.regular.png", "hippopotamus.regular.png"}) {
        if (!is_there(name)) continue;
        const Image photo = read_png(image_folder() / name);
        ASSERT_GT(photo.width, 0u) << name;
        bool top_down = false;
        for (const BmpVariant &variant : bmp_variants) {
            const Bytes bmp = as_bmp(photo, variant, top_down);
            const ToolRun got = run({write("photo.bmp", bmp), "--format", "rgba", "-o", path("photo.png")});
            EXPECT_EQ(got.status, 0) << name << ", " << variant.name << ": " << got.err;
            EXPECT_EQ(difference(stored_image(bmp), read_png(path("photo.png"))), "") << name << ", " << variant.name;
            top_down = !top_down;
        }
    }
}

TEST_F(ToolPhotos, keep_their_colours_at_24_bits) {
    if (!is_there("harvesters.png")) return;
    const Image photo = read_png(image_folder() / "harvesters.png");
    const std::string bmp = write("photo.bmp", as_bmp(photo, variant_named("twenty_four_bits"), false));
    ASSERT_EQ(run({bmp, "-o", path("photo.png")}).status, 0);
    EXPECT_EQ(difference(photo, read_png(path("photo.png"))), "");
}

TEST_F(ToolPhotos, that_are_wbmps_decode_to_their_stored_pixels) {
    for (const std::string name : {"bricks-nodither.wbmp", "hat.wbmp", "muybridge-frame-000.wbmp"}) {
        if (!is_there(name)) continue;
        const std::string file = (image_folder() / name).string();
        const ToolRun got = run({file, "--format", "rgb", "-o", path("photo.png")});
        EXPECT_EQ(got.status, 0) << got.err;
        EXPECT_EQ(difference(stored_wbmp_image(read_file(file)), read_png(path("photo.png"))), "") << name;
    }
}

TEST_F(ToolPhotos, with_long_headers_are_refused_in_one_line) {
    const struct {
        const char *name;
        int header_size;
    } cases[] = {{"harvesters.bmp", 124},
                 {"bricks-gray.bmp", 108},
                 {"bricks-dither.bmp", 124},
                 {"hippopotamus.bmp", 124},
                 {"pjw-thumbnail.bmp", 124}};
    for (const auto &one : cases) {
        if (!is_there(one.name)) continue;
        const std::string file = (image_folder() / one.name).string();
        expect_failure({file, "-o", path("x.png")}, file,
                       "BMP header of " + std::to_string(one.header_size) + " bytes is not supported; use --mode skia");
    }
}

TEST_F(ToolPhotos, with_bit_fields_at_32_bits_are_refused_by_every_mode) {
    if (!is_there("hibiscus.primitive.bmp")) return;
    const std::string file = (image_folder() / "hibiscus.primitive.bmp").string();
    expect_failure({file, "-o", path("x.png")}, file, "BMP header of 124 bytes is not supported");
    expect_failure({file, "--mode", "skia", "-o", path("x.png")}, file,
                   "bit fields at 32 bits per pixel are not supported");
}

TEST_F(ToolPhotos, with_long_headers_decode_in_two_steps) {
    for (const std::string name : {"bricks-color", "harvesters", "hat", "hibiscus.regular", "hippopotamus"}) {
        if (!is_there(name + ".bmp")) continue;
        const fs::path file = image_folder() / (name + ".bmp");
        const fs::path png =
            image_folder() / (fs::exists(image_folder() / (name + ".png")) ? name + ".png" : name + ".regular.png");
        for (const std::string source : {"memory", "file", "pipe"}) {
            const ToolRun got = run({file.string(), "--mode", "skia", "--source", source, "-o", path("x.png")});
            EXPECT_EQ(got.status, 0) << got.err;
            EXPECT_EQ(got.err, "") << name;
            EXPECT_EQ(difference(read_png_samples(png), read_png(path("x.png"))), "") << name << ", " << source;
        }
    }
}

// The same with a header of 40 bytes, and the palette where the decoder looks for it.
Bytes with_plain_header(const Bytes &bmp) {
    const size_t header_size = bmp[14];
    const size_t entries = bmp[28] == 1 ? 2 : 256;
    const uint32_t pixels = bmp[10] | uint32_t{bmp[11]} << 8;
    Bytes result(bmp.begin(), bmp.begin() + 54);
    result[14] = 40;
    const uint32_t new_pixels = static_cast<uint32_t>(54 + 4 * entries);
    result[10] = static_cast<uint8_t>(new_pixels);
    result[11] = static_cast<uint8_t>(new_pixels >> 8);
    const auto palette = bmp.begin() + static_cast<ptrdiff_t>(14 + header_size);
    result.insert(result.end(), palette, palette + static_cast<ptrdiff_t>(4 * entries));
    result.insert(result.end(), bmp.begin() + static_cast<ptrdiff_t>(pixels), bmp.end());
    return result;
}

TEST_F(ToolPhotos, with_long_headers_and_a_palette_come_with_a_warning_and_wrong_colours) {
    const struct {
        std::string name;
        const char *header_size;
    } cases[] = {
        {"bricks-gray", "108"}, {"bricks-dither", "124"}, {"bricks-nodither", "124"}, {"pjw-thumbnail", "124"}};
    for (const auto &one : cases) {
        if (!is_there(one.name + ".bmp")) continue;
        const std::string file = (image_folder() / (one.name + ".bmp")).string();
        const Image expected = read_png_samples(image_folder() / (one.name + ".png"));
        const ToolRun got = run({file, "--mode", "skia", "-o", path("x.png")});
        EXPECT_EQ(got.status, 0);
        EXPECT_EQ(got.err, "pelm-decode: " + file + ": warning: the palette behind a " + one.header_size +
                               "-byte header is read from the wrong place\n");
        EXPECT_EQ(read_png(path("x.png")).width, expected.width);
        EXPECT_NE(difference(expected, read_png(path("x.png"))), "") << one.name;

        const std::string plain = write("plain.bmp", with_plain_header(read_file(file)));
        for (const std::string source : {"memory", "file", "pipe"}) {
            EXPECT_EQ(run({plain, "--mode", "skia", "--source", source, "-o", path("x.png")}).err, "") << one.name;
            EXPECT_EQ(difference(expected, read_png(path("x.png"))), "") << one.name << ", " << source;
        }
    }
}

} // namespace
} // namespace pelm::test

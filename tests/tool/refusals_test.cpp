// Every reason why a file is not decoded, each told in one line that names the file.
#include "tests/tool/run_tool.h"

namespace pelm::test {
namespace {

class ToolRefusals : public ToolTest {
protected:
    void expect_refused(const BmpFile &file, const std::string &reason) const {
        expect_refused(file_bytes(file), reason, {"memory", "file", "pipe"});
    }

    void expect_refused(const Bytes &bytes, const std::string &reason, const std::vector<std::string> &sources) const {
        const std::string name = write("refused.bmp", bytes);
        for (const std::string &source : sources) {
            SCOPED_TRACE(source + ": " + reason);
            expect_failure({name, "--source", source, "-o", path("x.png")}, name, reason);
        }
        const ToolRun info = run({"--info", name, "--source", sources[0]});
        EXPECT_EQ(info.status, 1);
        EXPECT_NE(info.out.find("; refused: " + reason), std::string::npos) << info.out;
    }

    static BmpFile plain(uint16_t bits = 24) { return flat_bmp({"", bits, 0, {}}, 4, 4, 0, Bytes(1024)); }

    static Bytes cut(const BmpFile &file, size_t size) {
        Bytes bytes = file_bytes(file);
        bytes.resize(size);
        return bytes;
    }
};

TEST_F(ToolRefusals, header_sizes) {
    for (const uint32_t size : {0u, 16u, 52u, 108u, 124u, 380u}) {
        BmpFile file = plain();
        file.header_size = size;
        const std::string hint = size >= 40 ? "; use --mode skia" : "";
        expect_refused(file, "BMP header of " + std::to_string(size) + " bytes is not supported" + hint);
    }
}

TEST_F(ToolRefusals, compressions) {
    const struct {
        uint32_t compression;
        uint16_t bits;
        const char *reason;
    } cases[] = {
        {1, 8, "RLE8 compression is not supported; use --mode skia"},
        {2, 4, "RLE4 compression is not supported; use --mode skia"},
        {4, 24, "JPEG compression is not supported"},
        {5, 24, "PNG compression is not supported"},
        {3, 32, "bit fields at 32 bits per pixel are not supported"},
        {6, 16, "compression 6 at 16 bits per pixel is not supported"},
    };
    for (const auto &one : cases) {
        BmpFile file = plain(one.bits);
        file.compression = one.compression;
        expect_refused(file, one.reason);
    }
}

TEST_F(ToolRefusals, sizes) {
    BmpFile file = plain();
    file.width = 0;
    expect_refused(file, "a width of 0 pixels is not supported");
    file.width = -5;
    expect_refused(file, "a width of -5 pixels is not supported");
    file.width = 4;
    file.height = 0;
    expect_refused(file, "a height of 0 pixels leaves nothing to decode");
    file.width = 70000;
    file.height = 70000;
    expect_refused(file, "70000x70000 pixels are too many");
    file.width = 1;
    file.height = INT32_MIN;
    expect_refused(file, "1x2147483648 pixels are too many");
}

TEST_F(ToolRefusals, depths) {
    for (const int bits : {0, 2, 5, 48}) {
        BmpFile file = plain();
        file.bits = static_cast<uint16_t>(bits);
        expect_refused(file, std::to_string(bits) + " bits per pixel are not supported");
    }
}

TEST_F(ToolRefusals, masks) {
    BmpFile file = flat_bmp(variant_named("sixteen_bits_565"), 4, 4, 0);
    const Bytes cut_in_masks = cut(file, 60);
    file.masks = {0x001F, 0x07E0, 0xF800};
    expect_refused(file, "the colour masks 001F 07E0 F800 are not supported");
    expect_refused(cut_in_masks, "the file ends inside the colour masks", {"memory", "file", "pipe"});
}

TEST_F(ToolRefusals, palettes) {
    BmpFile file = plain(8);
    expect_refused(cut(file, 500), "the file ends inside the palette", {"file", "pipe"});
    file.pixel_data_offset = 54 + 4 * 40000;
    expect_refused(file, "the pixels lie too far behind the header for a palette between them");
}

TEST_F(ToolRefusals, files_that_are_no_images) {
    const std::string name = write("x.bmp", Bytes{});
    expect_failure({name, "-o", path("x.png")}, name, "the file is empty");
    write("x.bmp", Bytes{'h', 'e', 'l', 'l', 'o'});
    expect_failure({name, "-o", path("x.png")}, name, "not a BMP, PNG, GIF or WBMP file (it begins like none of them)");
    write("x.bmp", cut(plain(), 53));
    expect_failure({name, "-o", path("x.png")}, name, "the file ends inside the header (53 bytes of 54)");
}

TEST_F(ToolRefusals, formats_that_bmp_does_not_have) {
    const std::string name = write("x.bmp", plain());
    for (const std::string format : {"bgr565", "bgr", "bgrx"}) {
        expect_failure({name, "--format", format, "-o", path("x.png")}, name,
                       "the BMP decoder does not write the format " + format);
    }
}

} // namespace
} // namespace pelm::test

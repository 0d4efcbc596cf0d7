// draw-samples FOLDER: writes the sample images there.
#include <cstdio>

#include "samples/bmp_writer.h"
#include "samples/quantise.h"
#include "samples/scene.h"

namespace pelm_samples {
namespace {

uint32_t packed_24(Colour c) {
    return static_cast<uint32_t>(c.b | c.g << 8 | c.r << 16);
}

BmpContents with_values(const Drawing &drawing, int bits, std::vector<uint32_t> values) {
    BmpContents contents{drawing.width, drawing.height, bits};
    contents.values = std::move(values);
    return contents;
}

BmpContents direct(const Drawing &drawing, int bits) {
    std::vector<uint32_t> values;
    for (const Colour &c : drawing.pixels)
        values.push_back(packed_24(c));
    return with_values(drawing, bits, std::move(values));
}

BmpContents indexed(const Drawing &drawing, int bits, std::vector<Colour> palette) {
    const auto nearest = [&](Colour wanted) {
        const size_t index = nearest_in(palette, wanted);
        return Stored{static_cast<uint32_t>(index), palette[index]};
    };
    BmpContents contents = with_values(drawing, bits, dither(drawing, nearest));
    contents.palette = std::move(palette);
    return contents;
}

// How many bits each channel has, from the high end of the pixel.
struct Fields {
    int r, g, b;
};

int kept(int value, int bits) {
    return value >> (8 - bits);
}

uint32_t packed(Colour c, Fields f) {
    return static_cast<uint32_t>((kept(c.r, f.r) << f.g | kept(c.g, f.g)) << f.b | kept(c.b, f.b));
}

Colour meaning_of(Colour c, Fields f) {
    return {kept(c.r, f.r) << (8 - f.r), kept(c.g, f.g) << (8 - f.g), kept(c.b, f.b) << (8 - f.b)};
}

BmpContents sixteen_bits(const Drawing &drawing, Fields f, bool with_masks) {
    const auto store = [=](Colour c) { return Stored{packed(c, f), meaning_of(c, f)}; };
    BmpContents contents = with_values(drawing, 16, dither(drawing, store));
    if (with_masks) contents.masks = {packed({255, 0, 0}, f), packed({0, 255, 0}, f), packed({0, 0, 255}, f)};
    return contents;
}

bool write_all(const std::string &folder) {
    const Drawing scene = draw_scene();
    BmpContents topdown = direct(scene, 24);
    topdown.top_down = true;
    const auto write = [&](const char *name, const BmpContents &contents) {
        return write_bmp(folder + "/" + name, contents);
    };
    return write("sunset.bmp", direct(scene, 24)) && write("sunset-topdown.bmp", topdown) &&
           write("sunset-32.bmp", direct(scene, 32)) && write("sunset-565.bmp", sixteen_bits(scene, {5, 6, 5}, true)) &&
           write("sunset-555.bmp", sixteen_bits(scene, {5, 5, 5}, false)) &&
           write("sunset-444.bmp", sixteen_bits(scene, {4, 4, 4}, true)) &&
           write("sunset-8.bmp", indexed(scene, 8, suitable_palette(scene, 256))) &&
           write("sunset-4.bmp", indexed(scene, 4, suitable_palette(scene, 16))) &&
           write("sunset-1.bmp", indexed(scene, 1, {{28, 20, 60}, {255, 214, 150}}));
}

} // namespace
} // namespace pelm_samples

int main(int argc, char **argv) {
    if (argc != 2) {
        std::fputs("usage: draw-samples FOLDER\n", stderr);
        return 1;
    }
    if (pelm_samples::write_all(argv[1])) return 0;
    std::perror("draw-samples");
    return 1;
}

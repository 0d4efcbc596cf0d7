// draw-samples FOLDER: writes the sample images there.
#include <algorithm>
#include <cstdio>

#include "samples/bmp_writer.h"
#include "samples/gif_writer.h"
#include "samples/lighthouse.h"
#include "samples/png_writer.h"
#include "samples/quantise.h"
#include "samples/scene.h"
#include "samples/wbmp_writer.h"

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

// The scene fades out towards a frame of round corners.
int alpha_at(int x, int y, const Drawing &drawing) {
    constexpr int fade = 40;
    const int across = std::max(0, fade - std::min(x, drawing.width - 1 - x));
    const int down = std::max(0, fade - std::min(y, drawing.height - 1 - y));
    const int off = across * across + down * down;
    return std::clamp(255 - off * 255 / (fade * fade), 0, 255);
}

PngContents png(const Drawing &drawing, PngColour colour, std::vector<uint8_t> samples) {
    return {drawing.width, drawing.height, colour, std::move(samples)};
}

PngContents rgb_png(const Drawing &drawing) {
    std::vector<uint8_t> samples;
    for (const Colour &c : drawing.pixels) {
        for (const int channel : {c.r, c.g, c.b})
            samples.push_back(static_cast<uint8_t>(channel));
    }
    return png(drawing, PngColour::rgb, std::move(samples));
}

// In chunks of 4096 bytes.
PngContents alpha_png(const Drawing &drawing) {
    std::vector<uint8_t> samples;
    for (int y = 0; y < drawing.height; ++y) {
        for (int x = 0; x < drawing.width; ++x) {
            const Colour &c = drawing.at(x, y);
            for (const int channel : {c.r, c.g, c.b, alpha_at(x, y, drawing)})
                samples.push_back(static_cast<uint8_t>(channel));
        }
    }
    PngContents contents = png(drawing, PngColour::rgb_alpha, std::move(samples));
    contents.longest_chunk = 4096;
    return contents;
}

PngContents grey_png(const Drawing &drawing) {
    std::vector<uint8_t> samples;
    for (const Colour &c : drawing.pixels)
        samples.push_back(static_cast<uint8_t>((299 * c.r + 587 * c.g + 114 * c.b + 500) / 1000));
    return png(drawing, PngColour::grey, std::move(samples));
}

// The darkest colours of the palette are half transparent.
PngContents palette_png(const Drawing &drawing) {
    const BmpContents stored = indexed(drawing, 8, suitable_palette(drawing, 256));
    PngContents contents = png(drawing, PngColour::palette, {stored.values.begin(), stored.values.end()});
    contents.palette = stored.palette;
    for (const Colour &c : stored.palette)
        contents.alphas.push_back(c.r + c.g + c.b < 150 ? 128 : 255);
    return contents;
}

bool write_bmps(const std::string &folder, const Drawing &scene) {
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

bool write_pngs(const std::string &folder, const Drawing &scene) {
    return write_png(folder + "/sunset.png", rgb_png(scene)) &&
           write_png(folder + "/sunset-alpha.png", alpha_png(scene)) &&
           write_png(folder + "/sunset-palette.png", palette_png(scene)) &&
           write_png(folder + "/sunset-grey.png", grey_png(scene));
}

// Only black and white.
bool write_wbmp_of(const std::string &path, const Drawing &scene) {
    return write_wbmp(path, scene.width, scene.height, indexed(scene, 1, {{0, 0, 0}, {255, 255, 255}}).values);
}

GifContents gif(const Drawing &drawing, size_t colours, bool interlaced) {
    const BmpContents stored = indexed(drawing, 8, suitable_palette(drawing, colours));
    GifFrame frame{0, 0, drawing.width, drawing.height, {stored.values.begin(), stored.values.end()}};
    frame.interlaced = interlaced;
    return {drawing.width, drawing.height, stored.palette, {frame}};
}

bool write_gifs(const std::string &folder, const Drawing &scene) {
    return write_gif(folder + "/sunset.gif", gif(scene, 256, false)) &&
           write_gif(folder + "/sunset-interlaced.gif", gif(scene, 16, true)) &&
           write_gif(folder + "/lighthouse.gif", draw_lighthouse());
}

bool write_all(const std::string &folder) {
    const Drawing scene = draw_scene();
    return write_bmps(folder, scene) && write_pngs(folder, scene) && write_gifs(folder, scene) &&
           write_wbmp_of(folder + "/sunset.wbmp", scene);
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

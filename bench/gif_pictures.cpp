#include "bench/gif_pictures.h"

#include <algorithm>

#include <gif_lib.h>

namespace bench {
namespace {

using Bytes = std::vector<uint8_t>;

struct Area {
    uint32_t left, top, width, height;
};

int on_write(GifFileType *gif, const GifByteType *bytes, int count) {
    Bytes &file = *static_cast<Bytes *>(gif->UserData);
    file.insert(file.end(), bytes, bytes + count);
    return count;
}

// 3, 3 and 2 bits of red, green and blue; or black and white.
ColorMapObject *colour_map(Colours colours) {
    ColorMapObject *const map = GifMakeMapObject(colours == Colours::two ? 2 : 256, nullptr);
    if (map == nullptr) return nullptr;
    for (int i = 0; i < map->ColorCount; ++i) {
        const auto part = [i](int shift, int most) {
            return static_cast<GifByteType>((i >> shift & most) * 255 / most);
        };
        map->Colors[i] = {part(5, 7), part(2, 7), part(0, 3)};
        if (colours == Colours::two) map->Colors[i] = {part(0, 1), part(0, 1), part(0, 1)};
    }
    return map;
}

// A threshold from 0 to 15 that spreads over 4 x 4 pixels.
int threshold_at(uint32_t x, uint32_t y) {
    constexpr int pattern[4][4] = {{0, 8, 2, 10}, {12, 4, 14, 6}, {3, 11, 1, 9}, {15, 7, 13, 5}};
    return pattern[y % 4][x % 4];
}

uint8_t index_of(const uint8_t *rgb, Colours colours, int threshold) {
    if (colours == Colours::two) return rgb[1] >= 128 ? 1 : 0;
    const auto level = [&](int value, int most) { return (value * most + 255 * threshold / 16) / 255; };
    return static_cast<uint8_t>(level(rgb[0], 7) << 5 | level(rgb[1], 7) << 2 | level(rgb[2], 3));
}

Bytes index_row(Motif motif, Colours colours, uint32_t y, uint32_t first_x, uint32_t width) {
    const Bytes rgb = rgb_row(motif, y, first_x, width);
    Bytes row;
    for (uint32_t x = 0; x < width; ++x) {
        const int threshold = colours == Colours::dithered ? threshold_at(x, y) : 8;
        row.push_back(index_of(&rgb[3 * x], colours, threshold));
    }
    return row;
}

class Writer {
public:
    Writer(uint32_t width, uint32_t height, Colours colours) {
        int error = 0;
        map_ = colour_map(colours);
        gif_ = EGifOpen(&file_, on_write, &error);
        EGifSetGifVersion(gif_, true);
        check(EGifPutScreenDesc(gif_, static_cast<int>(width), static_cast<int>(height), 8, 0, map_));
    }
    ~Writer() { GifFreeMapObject(map_); }
    Writer(const Writer &) = delete;
    Writer &operator=(const Writer &) = delete;

    void add_control(int transparent) {
        GraphicsControlBlock control = {DISPOSE_DO_NOT, false, 4, transparent};
        GifByteType bytes[4];
        EGifGCBToExtension(&control, bytes);
        check(EGifPutExtension(gif_, GRAPHICS_EXT_FUNC_CODE, sizeof bytes, bytes));
    }
    void add_image(const Area &area) {
        check(EGifPutImageDesc(gif_, static_cast<int>(area.left), static_cast<int>(area.top),
                               static_cast<int>(area.width), static_cast<int>(area.height), false, nullptr));
    }
    void add_row(Bytes row) { check(EGifPutLine(gif_, row.data(), static_cast<int>(row.size()))); }
    Bytes finished() {
        int error = 0;
        check(EGifCloseFile(gif_, &error));
        return is_sound_ ? file_ : Bytes{};
    }

private:
    void check(int result) { is_sound_ = is_sound_ && result == GIF_OK; }

    Bytes file_;
    ColorMapObject *map_ = nullptr;
    GifFileType *gif_ = nullptr;
    bool is_sound_ = true;
};

// Every third stripe shows what was there before.
Bytes with_gaps(Bytes row, uint8_t transparent) {
    for (size_t x = 0; x < row.size(); ++x)
        if (x / 16 % 3 == 2) row[x] = transparent;
    return row;
}

} // namespace

std::vector<uint8_t> gif_picture(Motif motif, Colours colours, uint32_t width, uint32_t height) {
    Writer writer(width, height, colours);
    writer.add_image({0, 0, width, height});
    for (uint32_t y = 0; y < height; ++y)
        writer.add_row(index_row(motif, colours, y, 0, width));
    return writer.finished();
}

std::vector<uint8_t> gif_of_full_frames(Motif motif, uint32_t width, uint32_t height, uint32_t frames) {
    Writer writer(width, height, Colours::dithered);
    for (uint32_t i = 0; i < frames; ++i) {
        writer.add_control(NO_TRANSPARENT_COLOR);
        writer.add_image({0, 0, width, height});
        for (uint32_t y = 0; y < height; ++y)
            writer.add_row(index_row(motif, Colours::dithered, y + 3 * i, 17 * i, width));
    }
    return writer.finished();
}

std::vector<uint8_t> gif_of_small_changes(Motif motif, uint32_t width, uint32_t height, uint32_t frames) {
    constexpr uint8_t transparent = 0xE3; // no picture has this magenta
    Writer writer(width, height, Colours::nearest);
    for (uint32_t i = 0; i < frames; ++i) {
        const Area small = {i * 131 % (width - 160), i * 83 % (height - 90), 160, 90};
        const Area area = i == 0 ? Area{0, 0, width, height} : small;
        writer.add_control(transparent);
        writer.add_image(area);
        for (uint32_t y = 0; y < area.height; ++y) {
            Bytes row = index_row(motif, Colours::nearest, y + 5 * i, 7 * i, area.width);
            writer.add_row(i == 0 ? row : with_gaps(std::move(row), transparent));
        }
    }
    return writer.finished();
}

} // namespace bench

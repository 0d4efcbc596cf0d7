#include "bench/gif_pictures.h"

#include <gif_lib.h>

#include "bench/dither.h"

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

// The common one, or black and white.
ColorMapObject *colour_map(Colours colours) {
    ColorMapObject *const map = GifMakeMapObject(colours == Colours::two ? 2 : 256, nullptr);
    if (map == nullptr) return nullptr;
    for (int i = 0; i < map->ColorCount; ++i) {
        const Colour colour = colour_of(static_cast<uint8_t>(colours == Colours::two ? -i : i));
        map->Colors[i] = {colour.r, colour.g, colour.b};
    }
    return map;
}

uint8_t index_of(Pixel pixel, Colours colours, Dither &dither, uint32_t x) {
    if (colours == Colours::two) return pixel.g >= 128 ? 1 : 0;
    return colours == Colours::dithered ? dither.index_of(x, pixel) : nearest_index(pixel);
}

// Rows of one frame, from the top: the picture from (left, top) on.
class IndexRows {
public:
    IndexRows(Motif motif, Colours colours, uint32_t left, uint32_t top, uint32_t width)
        : motif_(motif), colours_(colours), left_(left), y_(top), width_(width), dither_(width) {}
    Bytes next() {
        Bytes row(width_);
        for (uint32_t x = 0; x < width_; ++x)
            row[x] = index_of(pixel_of(motif_, left_ + x, y_), colours_, dither_, x);
        ++y_;
        return row;
    }

private:
    Motif motif_;
    Colours colours_;
    uint32_t left_, y_, width_;
    Dither dither_;
};

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
    IndexRows rows(motif, colours, 0, 0, width);
    for (uint32_t y = 0; y < height; ++y)
        writer.add_row(rows.next());
    return writer.finished();
}

std::vector<uint8_t> gif_of_full_frames(Motif motif, uint32_t width, uint32_t height, uint32_t frames) {
    Writer writer(width, height, Colours::dithered);
    for (uint32_t i = 0; i < frames; ++i) {
        writer.add_control(NO_TRANSPARENT_COLOR);
        writer.add_image({0, 0, width, height});
        IndexRows rows(motif, Colours::dithered, 17 * i, 3 * i, width);
        for (uint32_t y = 0; y < height; ++y)
            writer.add_row(rows.next());
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
        IndexRows rows(motif, Colours::nearest, 7 * i, 5 * i, area.width);
        for (uint32_t y = 0; y < area.height; ++y) {
            Bytes row = rows.next();
            writer.add_row(i == 0 ? row : with_gaps(std::move(row), transparent));
        }
    }
    return writer.finished();
}

} // namespace bench

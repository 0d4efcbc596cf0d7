#include "bench/peers.h"

#include <algorithm>
#include <cstring>

#include <gif_lib.h>

#include "bench/row_reducer.h"

namespace bench {
namespace {

struct Unread {
    const uint8_t *next;
    size_t left;
};

int on_read(GifFileType *gif, GifByteType *to, int count) {
    Unread &unread = *static_cast<Unread *>(gif->UserData);
    const size_t got = std::min(static_cast<size_t>(count), unread.left);
    std::memcpy(to, unread.next, got);
    unread.next += got;
    unread.left -= got;
    return static_cast<int>(got);
}

uint32_t pack(const GifColorType &c) {
    return 0xFF000000u | uint32_t{c.Blue} << 16 | uint32_t{c.Green} << 8 | c.Red;
}

// What one frame is painted with.
struct Brush {
    uint32_t colours[256];
    int transparent;
    std::vector<uint8_t> line;
};

bool prepare(Brush &brush, const GifFileType &gif) {
    const ColorMapObject *const map = gif.Image.ColorMap != nullptr ? gif.Image.ColorMap : gif.SColorMap;
    if (map == nullptr) return false;
    for (int i = 0; i < map->ColorCount; ++i)
        brush.colours[i] = pack(map->Colors[i]);
    brush.line.resize(static_cast<size_t>(gif.Image.Width));
    return true;
}

void paint_line(const Brush &brush, uint32_t *to) {
    const size_t width = brush.line.size();
    if (brush.transparent == NO_TRANSPARENT_COLOR) {
        for (size_t x = 0; x < width; ++x)
            to[x] = brush.colours[brush.line[x]];
        return;
    }
    for (size_t x = 0; x < width; ++x)
        if (brush.line[x] != brush.transparent) to[x] = brush.colours[brush.line[x]];
}

// Frames that reach beyond the screen are refused: the pictures here have none.
bool paint_frame(GifFileType &gif, int transparent, uint32_t *screen) {
    if (DGifGetImageDesc(&gif) != GIF_OK) return false;
    const GifImageDesc &place = gif.Image;
    if (place.Left + place.Width > gif.SWidth || place.Top + place.Height > gif.SHeight) return false;
    static Brush brush;
    brush.transparent = transparent;
    if (!prepare(brush, gif)) return false;
    static constexpr struct { int first, step; } passes[] = {{0, 8}, {4, 8}, {2, 4}, {1, 2}, {0, 1}};
    const int pass = place.Interlace ? 0 : 4, end = place.Interlace ? 4 : 5;
    for (int i = pass; i < end; ++i) {
        for (int y = passes[i].first; y < place.Height; y += passes[i].step) {
            if (DGifGetLine(&gif, brush.line.data(), place.Width) != GIF_OK) return false;
            paint_line(brush, screen + ptrdiff_t{place.Top + y} * gif.SWidth + place.Left);
        }
    }
    return true;
}

bool read_extension(GifFileType &gif, int &transparent) {
    int code = 0;
    GifByteType *block = nullptr;
    if (DGifGetExtension(&gif, &code, &block) != GIF_OK) return false;
    GraphicsControlBlock control;
    if (code == GRAPHICS_EXT_FUNC_CODE && block != nullptr &&
        DGifExtensionToGCB(block[0], block + 1, &control) == GIF_OK)
        transparent = control.TransparentColor;
    while (block != nullptr)
        if (DGifGetExtensionNext(&gif, &block) != GIF_OK) return false;
    return true;
}

// Up to its image.
bool reach_first(GifFileType &gif) {
    int ignored = NO_TRANSPARENT_COLOR;
    for (GifRecordType record = UNDEFINED_RECORD_TYPE; record != TERMINATE_RECORD_TYPE;) {
        if (DGifGetRecordType(&gif, &record) != GIF_OK) return false;
        if (record == EXTENSION_RECORD_TYPE && !read_extension(gif, ignored)) return false;
        if (record == IMAGE_DESC_RECORD_TYPE) return true;
    }
    return false;
}

bool run_all(GifFileType &gif, uint32_t *output) {
    std::vector<uint32_t> screen(static_cast<size_t>(gif.SWidth) * static_cast<size_t>(gif.SHeight));
    int transparent = NO_TRANSPARENT_COLOR;
    for (GifRecordType record = UNDEFINED_RECORD_TYPE; record != TERMINATE_RECORD_TYPE;) {
        if (DGifGetRecordType(&gif, &record) != GIF_OK) return false;
        if (record == EXTENSION_RECORD_TYPE && !read_extension(gif, transparent)) return false;
        if (record != IMAGE_DESC_RECORD_TYPE) continue;
        if (!paint_frame(gif, transparent, screen.data())) return false;
        std::copy(screen.begin(), screen.end(), output);
    }
    return true;
}

// Into RGB565, row by row: colours are looked up only for rows with samples.
bool run_reduced(GifFileType &gif, Box box, uint8_t *output) {
    RowReducer reducer(static_cast<uint32_t>(gif.Image.Width), static_cast<uint32_t>(gif.Image.Height), box, output);
    const ColorMapObject *const map = gif.Image.ColorMap != nullptr ? gif.Image.ColorMap : gif.SColorMap;
    std::vector<uint8_t> line(static_cast<size_t>(gif.Image.Width)), rgb;
    for (int y = 0; map != nullptr && y < gif.Image.Height; ++y) {
        if (DGifGetLine(&gif, line.data(), gif.Image.Width) != GIF_OK) return false;
        if (!reducer.wants(static_cast<uint32_t>(y))) continue;
        rgb.clear();
        for (const uint8_t index : line) {
            const GifColorType &colour = map->Colors[index];
            rgb.insert(rgb.end(), {colour.Red, colour.Green, colour.Blue});
        }
        reducer.add_row(static_cast<uint32_t>(y), rgb.data());
    }
    return map != nullptr;
}

template <class Run>
bool decode(const std::vector<uint8_t> &file, Run run) {
    Unread unread{file.data(), file.size()};
    int error = 0;
    GifFileType *const gif = DGifOpen(&unread, on_read, &error);
    if (gif == nullptr) return false;
    const bool decoded = run(*gif);
    DGifCloseFile(gif, &error);
    return decoded;
}

uint32_t *pixels_at(uint8_t *output) {
    return reinterpret_cast<uint32_t *>(output);
}

} // namespace

bool giflib_decode(const std::vector<uint8_t> &file, uint8_t *output) {
    return decode(file, [&](GifFileType &gif) {
        return reach_first(gif) && paint_frame(gif, NO_TRANSPARENT_COLOR, pixels_at(output));
    });
}

bool giflib_decode_frames(const std::vector<uint8_t> &file, uint8_t *output) {
    return decode(file, [&](GifFileType &gif) { return run_all(gif, pixels_at(output)); });
}

bool giflib_reduce(const std::vector<uint8_t> &file, Box box, uint8_t *output) {
    return decode(file, [&](GifFileType &gif) {
        return reach_first(gif) && DGifGetImageDesc(&gif) == GIF_OK && run_reduced(gif, box, output);
    });
}

} // namespace bench
